#include "manager/RequestPath.h"

#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "kit/TestManager.h"

namespace cimom {
namespace {

class RequestPath : public testing::Test {
  protected:
    RequestPath() { repository.load(BROKER_TEST_DIR "/schema/Test.mof"); }

    [[nodiscard]] Status check(ObjectPath& path) const {
        return canonicalize(path, repository, {"root/test", "root/other"});
    }
    [[nodiscard]] CMPIrc check(const std::string& text) const {
        ObjectPath path = parseObjectPath(text);
        return check(path).code;
    }
    ClassRepository repository;
};

TEST_F(RequestPath, SpellingBecomesThatOfRegistrationAndSchema) {
    ObjectPath path = parseObjectPath("ROOT/Test:TEST_left.id=\"1\"");
    path.nameSpace = "/ROOT/Test";
    ASSERT_TRUE(check(path).ok());
    EXPECT_EQ(path.nameSpace, "root/test");
    EXPECT_EQ(path.className, "Test_Left");
    EXPECT_EQ(path.keys.front().name, "id");
}

TEST_F(RequestPath, InteropStandsForRootInteropUnlessItIsANamespaceItself) {
    const std::vector<std::string> known{"root/test", "root/interop"};
    EXPECT_EQ(knownNameSpace("Interop", known), &known[1]);
    EXPECT_EQ(knownNameSpace("/INTEROP/", known), &known[1]);
    EXPECT_EQ(knownNameSpace("root/Interop", known), &known[1]);
    EXPECT_EQ(knownNameSpace("interop/root", known), nullptr);
    EXPECT_EQ(knownNameSpace("interop", {"root/test"}), nullptr);
    const std::vector<std::string> both{"root/interop", "interop"};
    EXPECT_EQ(knownNameSpace("interop", both), &both[1]);
}

TEST_F(RequestPath, ReferencesGetTheCanonicalSpellingOfTheirNamespaces) {
    ObjectPath path = parseObjectPath(
        R"(root/test:Test_LinkA.Near="ROOT/test:Test_Left.Id=\"l1\"",Far="root/no:Test_Right.Id=\"r\"")");
    ASSERT_TRUE(check(path).ok());
    EXPECT_EQ(test::referenceOf(path.key("Near")).nameSpace, "root/test");
    EXPECT_EQ(test::referenceOf(path.key("Far")).nameSpace, "root/no");
}

TEST_F(RequestPath, KeysGetTheirDeclaredTypes) {
    ObjectPath path = parseObjectPath("root/test:Test_Numbered.Number=300");
    ASSERT_TRUE(check(path).ok());
    EXPECT_EQ(path.keys.front().value, (Value{Type::uint16, false, Scalar(std::uint64_t{300})}));
}

TEST_F(RequestPath, TextsOfReferenceKeysBecomeReferences) {
    ObjectPath path = parseObjectPath(R"(root/test:Test_LinkA.Near="Test_Left.Id=\"l1\"")");
    ASSERT_TRUE(check(path).ok());
    const Value& near = path.keys.front().value;
    ASSERT_EQ(near.type, Type::reference);
    EXPECT_EQ(toText(test::referenceOf(&near)), R"(root/test:Test_Left.Id="l1")");
}

TEST_F(RequestPath, ErrorsHaveTheStatusOfDsp0200) {
    EXPECT_EQ(check("root/nowhere:Test_Left"), CMPI_RC_ERR_INVALID_NAMESPACE);
    EXPECT_EQ(check("Test_Left"), CMPI_RC_ERR_INVALID_NAMESPACE);
    EXPECT_EQ(check("root/test:Nobody_Knows"), CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(check("root/test:Test_Numbered.Number=70000"), CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(check("root/test:Test_Numbered.Number=\"x\""), CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(check("root/test:Test_LinkA.Near=\"=\""), CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(check("root/test:Test_Left.Id=5"), CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(RequestPath, UndeclaredKeysPassAsTheyAre) {
    EXPECT_EQ(check("root/test:Test_Left.Strange=5"), CMPI_RC_OK);
}

TEST_F(RequestPath, ControlCharactersInTextsAreRefused) {
    const auto check = [](Value value) {
        return checkTexts({{}, {{"Good", Value::ofString("gut")}, {"Name", std::move(value)}}});
    };
    EXPECT_TRUE(check(Value::ofString("Grüße \xc2\x80")).ok());
    EXPECT_TRUE(check(Value::null(Type::string, false)).ok());
    for (const char bad : {'\n', '\r', '\0', '\t', '\x1f', '\x7f'}) {
        const std::string text = std::string("a") + bad;
        EXPECT_EQ(check(Value::ofString(text)).code, CMPI_RC_ERR_INVALID_PARAMETER);
        EXPECT_EQ(check({Type::string, true, Array{std::string("x"), text}}).code,
                  CMPI_RC_ERR_INVALID_PARAMETER);
    }
    EXPECT_EQ(check(Value::ofString("\n")).message, "property Name holds a control character");
}

}  // namespace
}  // namespace cimom
