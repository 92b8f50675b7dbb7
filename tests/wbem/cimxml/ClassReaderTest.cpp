#include "cimxml/ClassReader.h"

#include <gtest/gtest.h>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimxml/Errors.h"
#include "cimxml/ObjectWriter.h"

namespace cimom::wbem {

void expectSame(const PropertyDeclaration& read, const PropertyDeclaration& written) {
    EXPECT_EQ(read.name, written.name);
    EXPECT_EQ(read.type, written.type);
    EXPECT_EQ(read.isArray, written.isArray);
    EXPECT_EQ(read.arraySize, written.arraySize);
    EXPECT_EQ(read.referenceClass, written.referenceClass);
    EXPECT_EQ(read.defaultValue, written.defaultValue);
    EXPECT_EQ(read.qualifiers, written.qualifiers);
    EXPECT_EQ(read.classOrigin, written.classOrigin);
    EXPECT_EQ(read.propagated, written.propagated);
}

TEST(ClassReader, ReadsEveryClassOfTheSchemaAsItIsWritten) {
    ClassRepository repository;
    repository.loadDirectory(ZR_SOURCE_DIR "/schema");
    ASSERT_GT(repository.classes().size(), 20U);
    for (const ClassDeclaration* const written : repository.classes()) {
        std::string xml;
        writeClass(xml, *written, {false, true, true, std::nullopt});
        const ClassDeclaration read = readClass(readXml(xml, 64));
        EXPECT_EQ(read.name, written->name);
        EXPECT_EQ(read.superclass, written->superclass);
        EXPECT_EQ(read.qualifiers, written->qualifiers) << xml;
        EXPECT_EQ(read.isAssociation(), written->isAssociation());
        ASSERT_EQ(read.properties.size(), written->properties.size());
        for (std::size_t index = 0; index < read.properties.size(); ++index) {
            SCOPED_TRACE(written->name + '.' + written->properties[index].name);
            expectSame(read.properties[index], written->properties[index]);
        }
    }
}

TEST(ClassReader, PassesOverMethodsAndKeepsSizesAndEmbeddedObjects) {
    const ClassDeclaration read =
        readClass(readXml("<CLASS NAME='A'><PROPERTY.ARRAY NAME='l' TYPE='uint8' ARRAYSIZE='3'>"
                          "<VALUE.ARRAY><VALUE>1</VALUE></VALUE.ARRAY></PROPERTY.ARRAY>"
                          "<PROPERTY NAME='e' TYPE='string' EmbeddedObject='instance'/>"
                          "<METHOD NAME='m' TYPE='uint32'/></CLASS>",
                          64));
    ASSERT_EQ(read.properties.size(), 2U);
    EXPECT_EQ(read.properties[0].arraySize, 3U);
    EXPECT_EQ(read.properties[0].defaultValue,
              (Value{Type::uint8, true, Array{Scalar(std::uint64_t{1})}}));
    EXPECT_EQ(read.properties[1].type, Type::string);
    EXPECT_TRUE(read.properties[1].defaultValue.isNull());
}

TEST(ClassReader, RefusesWhatIsNoClass) {
    for (const char* xml :
         {"<INSTANCE CLASSNAME='A'/>", "<CLASS/>", "<CLASS NAME='A'>text</CLASS>",
          "<CLASS NAME='A'><VALUE/></CLASS>", "<CLASS NAME='A'><PROPERTY TYPE='string'/></CLASS>",
          "<CLASS NAME='A'><PROPERTY NAME='p'/></CLASS>",
          "<CLASS NAME='A'><PROPERTY NAME='p' TYPE='string'/><PROPERTY NAME='P' TYPE='string'/>"
          "</CLASS>",
          "<CLASS NAME='A'><QUALIFIER NAME='q'/></CLASS>",
          "<CLASS NAME='A'><PROPERTY.ARRAY NAME='p' TYPE='string' ARRAYSIZE='x'/></CLASS>"}) {
        EXPECT_THROW(static_cast<void>(readClass(readXml(xml, 64))), NotValid) << xml;
    }
    EXPECT_THROW(static_cast<void>(readClass(readXml(
                     "<CLASS NAME='A'><PROPERTY NAME='p' TYPE='boolean'><VALUE>maybe</VALUE>"
                     "</PROPERTY></CLASS>",
                     64))),
                 CimError);
}

}  // namespace cimom::wbem
