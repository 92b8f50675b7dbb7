#include "cimxml/OperationResponse.h"

#include <gtest/gtest.h>

#include <memory>
#include <random>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimxml/Call.h"
#include "cimxml/Errors.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/ObjectWriter.h"
#include "kit/RandomObjects.h"

namespace cimom::wbem {

Call callOf(const std::string& method) {
    Call call;
    call.messageId = "1";
    call.method = method;
    return call;
}

std::string responseWith(const std::string& content, const std::string& method = "GetInstance") {
    return responseHead(callOf(method)) + content + responseTail(callOf(method));
}

std::string refusal(const std::string& body) {
    try {
        static_cast<void>(readResponse(body, "GetInstance", 16));
        return "accepted";
    } catch (const XmlError& error) {
        return std::string("XML: ") + error.what();
    } catch (const NotValid& error) {
        return error.what();
    }
}

TEST(OperationResponse, HoldsWhatIsReturned) {
    const auto response = readResponse(
        responseWith("<IRETURNVALUE><CLASSNAME NAME='A'/><CLASSNAME NAME='B'/></IRETURNVALUE>"
                     "<PARAMVALUE NAME='EndOfSequence'/>"),
        "getinstance", 16);
    EXPECT_EQ(response.code, 0U);
    ASSERT_EQ(response.returned.size(), 2U);
    EXPECT_EQ(*response.returned[1].attribute("NAME"), "B");
    EXPECT_TRUE(readResponse(responseWith(""), "GetInstance", 16).returned.empty());
}

TEST(OperationResponse, HoldsTheStatus) {
    const auto response =
        readResponse(errorResponse(callOf("GetInstance"), 6, "not <here>"), "GetInstance", 16);
    EXPECT_EQ(response.code, 6U);
    EXPECT_EQ(response.description, "not <here>");
    EXPECT_EQ(readResponse(responseWith("<ERROR CODE='21'/>"), "GetInstance", 16).description, "");
}

TEST(OperationResponse, AnythingElseIsRefused) {
    EXPECT_EQ(refusal("<CIM"), "XML: line 1: unclosed token");
    EXPECT_EQ(refusal(""), "XML: line 1: no element found");
    EXPECT_EQ(refusal("<html><body>Hello</body></html>"), "element html where CIM belongs");
    EXPECT_EQ(refusal("<CIM/>"), "the content of CIM");
    EXPECT_EQ(refusal("<CIM><MESSAGE/></CIM>"), "the content of MESSAGE");
    EXPECT_EQ(refusal("<CIM><MESSAGE><SIMPLEREQ/></MESSAGE></CIM>"),
              "element SIMPLEREQ where SIMPLERSP belongs");
    EXPECT_EQ(refusal("<CIM><MESSAGE><SIMPLERSP><IMETHODRESPONSE/></SIMPLERSP></MESSAGE></CIM>"),
              "IMETHODRESPONSE without NAME");
    EXPECT_EQ(refusal(responseWith("", "GetClass")), "a response to GetClass");
    EXPECT_EQ(refusal(responseWith("<ERROR/>")), "ERROR without CODE");
    EXPECT_EQ(refusal(responseWith("<ERROR CODE='0'/>")), "CODE \"0\" of ERROR");
    EXPECT_EQ(refusal(responseWith("<ERROR CODE='99999999999'/>")),
              "CODE \"99999999999\" of ERROR");
    EXPECT_EQ(refusal(responseWith("<INSTANCE CLASSNAME='A'/>")),
              "element INSTANCE where IRETURNVALUE belongs");
    EXPECT_EQ(refusal(responseWith("<IRETURNVALUE>text</IRETURNVALUE>")), "text in IRETURNVALUE");
    EXPECT_EQ(refusal("<!DOCTYPE CIM><CIM/>"),
              "XML: line 1: a document type declaration is not accepted");
}

XmlElement element(const std::string& xml) {
    return readXml(xml, 64);
}

TEST(ReturnedPath, IsOfTheNamespaceThatWasAskedUnlessItSaysOtherwise) {
    const ObjectPath plain{"", "root/a", "A", {{"Id", Value::ofString("1")}}};
    const ObjectPath full{"h", "root/b", "A", {{"Id", Value::ofString("1")}}};
    std::string name;
    writeInstanceName(name, plain);
    EXPECT_EQ(readReturnedPath(element(name), "root/a"), plain);
    std::string path = "<OBJECTPATH>";
    writeInstancePath(path, full, "other");
    EXPECT_EQ(readReturnedPath(element(path + "</OBJECTPATH>"), "root/a"), full);
}

TEST(ReturnedPath, ReferencesInKeysAreOfItsNamespace) {
    ObjectPath inner{"", "", "B", {{"Id", Value::ofString("2")}}};
    const auto link = [](const ObjectPath& target) {
        return ObjectPath{
            "",
            "",
            "Link",
            {{"Left",
              {Type::reference, false, Scalar(std::make_shared<const ObjectPath>(target))}}}};
    };
    std::string name;
    writeInstanceName(name, link(inner));
    const ObjectPath read = readReturnedPath(element(name), "root/a");
    inner.nameSpace = "root/a";
    EXPECT_EQ(read.nameSpace, "root/a");
    EXPECT_EQ(read.keys, link(inner).keys);
}

TEST(ReturnedInstance, ComesInThreeForms) {
    Instance instance{{"", "root/a", "A", {{"Id", Value::ofString("1")}}},
                      {{"Id", Value::ofString("1")}}};
    std::string xml;
    writeInstance(xml, instance, nullptr);
    Instance bare = instance;
    bare.path.keys.clear();
    EXPECT_EQ(readReturnedInstance(element(xml), "root/a"), bare);
    std::string name;
    writeInstanceName(name, instance.path);
    EXPECT_EQ(
        readReturnedInstance(
            element("<VALUE.NAMEDINSTANCE>" + name + xml + "</VALUE.NAMEDINSTANCE>"), "root/a"),
        instance);
    std::string path;
    writeInstancePath(path, instance.path, "host");
    EXPECT_EQ(readReturnedInstance(
                  element("<VALUE.OBJECTWITHPATH>" + path + xml + "</VALUE.OBJECTWITHPATH>"), "x"),
              instance);
}

TEST(ReturnedInstance, WrongNestingIsRefused) {
    for (const char* xml :
         {"<VALUE.NAMEDINSTANCE/>",
          "<VALUE.NAMEDINSTANCE><INSTANCE CLASSNAME='A'/></VALUE.NAMEDINSTANCE>",
          "<VALUE.NAMEDINSTANCE><INSTANCENAME CLASSNAME='A'/><INSTANCE CLASSNAME='B'/>"
          "</VALUE.NAMEDINSTANCE>",
          "<VALUE.OBJECTWITHPATH><CLASSPATH/><CLASS NAME='A'/></VALUE.OBJECTWITHPATH>",
          "<VALUE/>"}) {
        EXPECT_THROW(static_cast<void>(readReturnedInstance(element(xml), "root")), NotValid)
            << xml;
    }
    EXPECT_THROW(static_cast<void>(readReturnedPath(element("<OBJECTPATH/>"), "root")), NotValid);
    EXPECT_THROW(static_cast<void>(readReturnedInstance(
                     element("<INSTANCE CLASSNAME='A'><PROPERTY NAME='n' TYPE='uint8'>"
                             "<VALUE>300</VALUE></PROPERTY></INSTANCE>"),
                     "root")),
                 CimError);
}

TEST(ReturnedInstance, HasNoMorePropertiesThanCanBeCompared) {
    std::string xml = "<INSTANCE CLASSNAME='A'>";
    for (int number = 0; number < 5000; ++number) {
        xml += "<PROPERTY TYPE='string' NAME='p" + std::to_string(number) + "'/>";
    }
    EXPECT_THROW(static_cast<void>(readReturnedInstance(element(xml + "</INSTANCE>"), "root")),
                 NotValid);
}

/// Reads a response to the end, whatever it holds; whether it could be read.
bool isReadable(const std::string& body, const std::string& method) {
    try {
        for (const XmlElement& one : readResponse(body, method, 64).returned) {
            if (method == "GetClass") {
                static_cast<void>(readClass(one));
            } else if (method == "AssociatorNames") {
                static_cast<void>(readReturnedPath(one, "root"));
            } else {
                static_cast<void>(readReturnedInstance(one, "root"));
            }
        }
        return true;
    } catch (const XmlError&) {
    } catch (const NotValid&) {
    } catch (const CimError&) {
    }
    return false;
}

TEST(OperationResponse, OfElementsThatTakeFarMoreMemoryThanTheirTextIsRefused) {
    std::string elements;
    for (int number = 0; number < 50'000; ++number) {
        elements += "<A/>";
    }
    const std::string body =
        "<CIM><MESSAGE><SIMPLERSP><IMETHODRESPONSE NAME=\"GetInstance\"><IRETURNVALUE>" + elements +
        "</IRETURNVALUE></IMETHODRESPONSE></SIMPLERSP></MESSAGE></CIM>";
    EXPECT_THROW(static_cast<void>(readResponse(body, "GetInstance", 64)), XmlError);
}

TEST(OperationResponse, NoDamageDoesMoreThanMakeItUnreadable) {
    ClassRepository repository;
    repository.loadDirectory(ZR_SOURCE_DIR "/schema");
    std::mt19937_64 random(test::randomSeed());
    test::RandomObjects objects(random());
    const auto below = [&random](std::size_t limit) { return random() % limit; };
    int readable = 0;
    constexpr int rounds = 4000;
    for (int round = 0; round < rounds; ++round) {
        std::string content = "<IRETURNVALUE>";
        std::string method = "Associators";
        if (round % 3 == 0) {
            method = "GetClass";
            const auto classes = repository.classes();
            writeClass(content, *classes[below(classes.size())], {});
        } else if (round % 3 == 1) {
            method = "AssociatorNames";
            content += "<OBJECTPATH>";
            ObjectPath path = objects.path();
            path.nameSpace = "root";
            writeInstancePath(content, path, "host");
            content += "</OBJECTPATH>";
        } else {
            writeInstance(content, objects.instance(), nullptr);
        }
        std::string body = responseWith(content + "</IRETURNVALUE>", method);
        ASSERT_TRUE(isReadable(body, method)) << body;
        for (std::size_t damage = 1 + below(3); damage > 0 && !body.empty(); --damage) {
            const std::size_t place = below(body.size());
            const std::size_t length = below(40);
            switch (below(4)) {
                case 0:
                    body.erase(place, length);
                    break;
                case 1:
                    body.insert(place, body.substr(below(body.size()), length));
                    break;
                case 2:
                    body.resize(place + 1);
                    break;
                default:
                    body[place] = static_cast<char>(below(256));
            }
        }
        readable += isReadable(body, method) ? 1 : 0;
    }
    // Some damage hits a value's text alone, most does not.
    EXPECT_GT(readable, 0);
    EXPECT_LT(readable, rounds / 2);
}

}  // namespace cimom::wbem
