#include "cimom/Query.h"

#include <gtest/gtest.h>

#include <memory>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "query/LikePattern.h"

namespace cimom {
namespace {

constexpr const char* classesText = R"(
Qualifier Key : boolean = FALSE, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
class Lease { [Key] string Name; uint16 State; string Address; datetime Expires; };
class LongLease : Lease { uint32 Years; };
class Other { [Key] string Name; };
class Change { string Id; string SourceInstance; string PreviousInstance; };
)";

const ClassRepository& classes() {
    static const ClassRepository repository = [] {
        ClassRepository made;
        made.loadText(classesText, "classes");
        return made;
    }();
    return repository;
}

bool isA(std::string_view className, std::string_view ancestor) {
    return classes().isA(className, ancestor);
}

Value number(Type type, std::uint64_t value) {
    return {type, false, Scalar(value)};
}

Value embedded(const Instance& instance) {
    return {Type::instance, false, Scalar(std::make_shared<const Instance>(instance))};
}

Instance lease(const std::string& className, std::uint64_t state) {
    Instance made;
    made.path.className = className;
    made.path.keys = {{"Name", Value::ofString("eth0")}};
    made.properties = {
        {"State", number(Type::uint16, state)},
        {"Address", Value::ofString("192.0.2.17")},
        {"Text", Value::ofString("it's a \"b\\c\"")},
        {"Negative", {Type::sint32, false, Scalar(std::int64_t{-5})}},
        {"Largest", number(Type::uint64, UINT64_MAX)},
        {"Load", {Type::real64, false, Scalar(1.5)}},
        {"Up", {Type::boolean, false, Scalar(true)}},
        {"Letter", {Type::char16, false, Scalar(u'x')}},
        {"Expires", {Type::datetime, false, Scalar(std::string("20260101120000.000000+060"))}},
        {"Options", {Type::uint16, true, Array{std::uint64_t{1}, std::uint64_t{3}}}},
        {"Missing", Value::null(Type::string, false)}};
    return made;
}

Instance change(std::uint64_t before, std::uint64_t after) {
    Instance made;
    made.path.className = "Change";
    made.properties = {{"SourceInstance", embedded(lease("LongLease", after))},
                       {"PreviousInstance", embedded(lease("LongLease", before))}};
    return made;
}

bool selects(const std::string& condition, const Instance& instance,
             const std::string& language = "WQL") {
    return Query::parse(language,
                        "SELECT * FROM " + instance.path.className + " WHERE " + condition)
        .matches(instance, isA);
}

struct Condition {
    const char* text;
    bool holds;
};
void PrintTo(const Condition& condition, std::ostream* out) {
    *out << condition.text;
}
class QueryConditions : public testing::TestWithParam<Condition> {};

TEST_P(QueryConditions, SelectTheLease) {
    EXPECT_EQ(selects(GetParam().text, lease("Lease", 2)), GetParam().holds);
}

INSTANTIATE_TEST_SUITE_P(
    Comparisons, QueryConditions,
    testing::Values(Condition{"State = 2", true}, Condition{"state = 0002", true},
                    Condition{"State <> 2", false}, Condition{"State != 3", true},
                    Condition{"2 = State", true}, Condition{"State < 3", true},
                    Condition{"State <= 2", true}, Condition{"State > 2", false},
                    Condition{"State >= 2", true}, Condition{"State = 2.0", true},
                    Condition{"State > -1", true}, Condition{"Negative < 0", true},
                    Condition{"Negative = -5", true},
                    Condition{"Largest = 18446744073709551615", true},
                    Condition{"Largest > -1", true}, Condition{"Load = 15e-1", true},
                    Condition{"Load < .5", false}, Condition{"Address = '192.0.2.17'", true},
                    Condition{"Address = \"192.0.2.17\"", true}, Condition{"Address < '193'", true},
                    Condition{"Address = State", false}, Condition{"Up = TRUE", true},
                    Condition{"Up <> false", true}, Condition{"Up > FALSE", false},
                    Condition{"Letter = 'x'", true}, Condition{"Options[0] = 1", true},
                    Condition{"Options[1] = 3", true}, Condition{"Options[2] = 3", false},
                    Condition{"Options = 1", false}, Condition{"Name = 'eth0'", true},
                    Condition{"Lease.State = 2", true}, Condition{"Lease::State = 2", true},
                    Condition{"LongLease::State = 2", false},
                    Condition{"Expires = '20260101110000.000000+000'", true},
                    Condition{"Expires < '20260101120000.000000+000'", true},
                    Condition{"Expires < '00000001000000.000000:000'", false},
                    Condition{"Expires > 'yesterday'", false}));

INSTANTIATE_TEST_SUITE_P(Precedence, QueryConditions,
                         testing::Values(Condition{"State = 2 OR State = 3 AND Up = FALSE", true},
                                         Condition{"(State = 2 OR State = 3) AND Up = FALSE",
                                                   false},
                                         Condition{"NOT State = 3 AND Up = TRUE", true},
                                         Condition{"NOT State = 2 OR Up = TRUE", true},
                                         Condition{"NOT (State = 2 OR Up = TRUE)", false},
                                         Condition{"not not State = 2", true},
                                         Condition{"State = 3 AND Up = TRUE OR Load > 1", true}));

INSTANTIATE_TEST_SUITE_P(
    Null, QueryConditions,
    testing::Values(Condition{"Missing IS NULL", true}, Condition{"Missing IS NOT NULL", false},
                    Condition{"Absent IS NULL", true}, Condition{"State IS NULL", false},
                    Condition{"Options IS NOT NULL", true}, Condition{"Options[7] IS NULL", true},
                    Condition{"Missing = 'a'", false}, Condition{"Missing <> 'a'", false},
                    Condition{"NOT Missing = 'a'", false}, Condition{"Missing = Absent", false},
                    Condition{"Missing = 'a' OR State = 2", true},
                    Condition{"State = 2 AND Missing = 'a'", false},
                    Condition{"NOT (State = 3 AND Missing = 'a')", true},
                    Condition{"(Missing = 'a') IS TRUE", false},
                    Condition{"(Missing = 'a') IS FALSE", false},
                    Condition{"(Missing = 'a') IS NOT TRUE", true}, Condition{"Up IS TRUE", true},
                    Condition{"Up IS NOT FALSE", true}, Condition{"State = 3 IS FALSE", true},
                    Condition{"Missing LIKE '%'", false},
                    Condition{"NOT Missing LIKE '%'", false}));

INSTANTIATE_TEST_SUITE_P(
    Texts, QueryConditions,
    testing::Values(Condition{R"(Text = 'it''s a "b\\c"')", true},
                    Condition{R"(Text = 'it\'s a "b\\c"')", true},
                    Condition{R"(Text = "it's a ""b\c""")", true},
                    Condition{R"(Text = "it's a \"b\c\"")", true},
                    Condition{R"(Text = 'it''s')", false}, Condition{"Address = ''", false},
                    Condition{"Address LIKE '192.%'", true}, Condition{"Address LIKE '%.17'", true},
                    Condition{"Address LIKE '%2%'", true},
                    Condition{"Address LIKE '192.0.2.__'", true},
                    Condition{"Address LIKE '192'", false},
                    Condition{"Address NOT LIKE '193%'", true}, Condition{"State LIKE '2'", false},
                    Condition{"Letter LIKE '_'", true}));

INSTANTIATE_TEST_SUITE_P(Classes, QueryConditions,
                         testing::Values(Condition{"Lease ISA Lease", true},
                                         Condition{"Lease ISA LongLease", false},
                                         Condition{"State ISA Lease", false},
                                         Condition{"NOT State ISA Lease", false}));

TEST(Query, SelectsInstancesOfTheClassAndItsSubclasses) {
    const Query query = Query::parse("wql", "select * from lease");
    EXPECT_EQ(query.className(), "lease");
    EXPECT_TRUE(query.matches(lease("Lease", 1), isA));
    EXPECT_TRUE(query.matches(lease("LongLease", 1), isA));
    EXPECT_FALSE(query.matches(lease("Other", 1), isA));
    EXPECT_TRUE(Query::parse("WQL", "SELECT * FROM Lease WHERE Lease ISA LongLease")
                    .matches(lease("LongLease", 1), isA));
}

TEST(Query, LooksIntoEmbeddedInstances) {
    const std::string typical =
        "SourceInstance ISA Lease AND SourceInstance.State <> PreviousInstance.State";
    EXPECT_TRUE(selects(typical, change(2, 3)));
    EXPECT_FALSE(selects(typical, change(3, 3)));
    EXPECT_FALSE(selects("SourceInstance ISA Other", change(2, 3)));
    EXPECT_TRUE(selects("SourceInstance ISA 'longlease'", change(2, 3)));
    EXPECT_TRUE(selects("SourceInstance.Lease::State = 3", change(2, 3), "DMTF:CQL"));
    EXPECT_FALSE(selects("SourceInstance.Other::State = 3", change(2, 3), "DMTF:CQL"));
    EXPECT_TRUE(selects("Change.SourceInstance.State = 3", change(2, 3)));
    EXPECT_TRUE(selects("SourceInstance.State.More IS NULL", change(2, 3)));
    EXPECT_TRUE(selects("SourceInstance IS NOT NULL", change(2, 3)));
    EXPECT_FALSE(selects("SourceInstance = PreviousInstance", change(2, 2)));
}

TEST(Query, KnowsAnotherNameOfTheClass) {
    const Query query =
        Query::parse("CIM:CQL", "SELECT l.Address, l.State FROM Lease AS l WHERE l.State = 2");
    EXPECT_TRUE(query.matches(lease("Lease", 2), isA));
    EXPECT_EQ(query.properties(), (std::vector<std::string>{"Address", "State"}));
    EXPECT_TRUE(Query::parse("CQL", "SELECT l.* FROM Lease l WHERE l ISA Lease")
                    .matches(lease("Lease", 2), isA));
}

TEST(Query, LeavesTheSelectedPropertiesAlone) {
    Instance instance = lease("Lease", 2);
    Query::parse("WQL", "SELECT address, Lease.State FROM Lease").project(instance);
    ASSERT_EQ(instance.properties.size(), 2U);
    EXPECT_EQ(instance.properties[0].name, "State");
    EXPECT_EQ(instance.properties[1].name, "Address");
    EXPECT_EQ(instance.path.keys.size(), 1U);

    Instance whole = lease("Lease", 2);
    Query::parse("WQL", "SELECT * FROM Lease").project(whole);
    EXPECT_EQ(whole, lease("Lease", 2));

    Instance event = change(1, 2);
    Query::parse("CQL", "SELECT SourceInstance.State FROM Change").project(event);
    ASSERT_EQ(event.properties.size(), 1U);
    EXPECT_EQ(event.properties[0].name, "SourceInstance");
}

TEST(Query, TellsThePropertyThatTheClassLacks) {
    const auto unknown = [](const std::string& text) {
        const Query query = Query::parse("WQL", text);
        return query.unknownProperty(*classes().find(query.className())).value_or("");
    };
    EXPECT_EQ(unknown("SELECT Name FROM Lease WHERE State = 1"), "");
    EXPECT_EQ(unknown("SELECT Years FROM Lease"), "Years");
    EXPECT_EQ(unknown("SELECT * FROM Lease WHERE Lease.Years = 1"), "Years");
    EXPECT_EQ(unknown("SELECT * FROM Lease WHERE LongLease::Years = 1"), "");
    EXPECT_EQ(unknown("SELECT * FROM Change WHERE SourceInstance.Anything = 1"), "");
}

TEST(Query, LanguagesDifferInLike) {
    const Instance instance = lease("Lease", 2);
    for (const std::string language : {"CQL", "DMTF:CQL", "dmtf:cql", "CIM:CQL"}) {
        EXPECT_TRUE(selects(R"(Address LIKE '192\.0\.2\.17')", instance, language));
        EXPECT_TRUE(selects("Address LIKE '192.*'", instance, language));
        EXPECT_TRUE(selects("Address LIKE 'none|1*92.*7'", instance, language));
        EXPECT_FALSE(selects("Address LIKE '192%'", instance, language));
    }
    EXPECT_FALSE(selects("Address LIKE '192.*'", instance, "WQL"));
}

CMPIrc refusal(const std::string& language, const std::string& text) {
    try {
        static_cast<void>(Query::parse(language, text));
    } catch (const QueryError& error) {
        EXPECT_STRNE(error.what(), "");
        return error.code;
    }
    return CMPI_RC_OK;
}

TEST(Query, RefusesOtherLanguages) {
    for (const std::string language : {"", "SQL", "WQL ", "DMTF:WQL"}) {
        EXPECT_EQ(refusal(language, "SELECT * FROM Lease"),
                  CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED)
            << language;
    }
}

class BadQueries : public testing::TestWithParam<const char*> {};

TEST_P(BadQueries, AreRefused) {
    EXPECT_EQ(refusal("DMTF:CQL", GetParam()), CMPI_RC_ERR_INVALID_QUERY);
}

INSTANTIATE_TEST_SUITE_P(
    Texts, BadQueries,
    testing::Values(
        "", "SELECT", "SELECT *", "SELECT * FROM", "SELECT FROM Lease", "SELECT *, a FROM Lease",
        "SELECT a, FROM Lease", "SELECT Lease FROM Lease", "SELECT DISTINCT a FROM Lease",
        "SELECT count(*) FROM Lease", "SELECT * FROM Lease, Other", "SELECT * FROM Lease WHERE",
        "SELECT * FROM Lease ORDER BY a", "SELECT * FROM Lease WHERE a",
        "SELECT * FROM Lease WHERE a =", "SELECT * FROM Lease WHERE a = NULL",
        "SELECT * FROM Lease WHERE a == 1", "SELECT * FROM Lease WHERE (a = 1",
        "SELECT * FROM Lease WHERE a = 1)", "SELECT * FROM Lease WHERE a = 'b",
        "SELECT * FROM Lease WHERE a = 1 AND", "SELECT * FROM Lease WHERE a IS 1",
        "SELECT * FROM Lease WHERE 1 ISA Lease", "SELECT * FROM Lease WHERE a ISA 1",
        "SELECT * FROM Lease WHERE a ISA ''", "SELECT * FROM Lease WHERE a LIKE b",
        "SELECT * FROM Lease WHERE a LIKE '[ab]'", "SELECT * FROM Lease WHERE a LIKE '*'",
        R"(SELECT * FROM Lease WHERE a LIKE 'a\')", "SELECT * FROM Lease WHERE a..b = 1",
        "SELECT * FROM Lease WHERE a[b] = 1", "SELECT * FROM Lease WHERE a[-1] = 1",
        "SELECT * FROM Lease WHERE a = 1x", "SELECT * FROM Lease WHERE a = 99999999999999999999",
        "SELECT * FROM Lease WHERE a = 1e999", "SELECT * FROM Lease WHERE a + 1 = 2",
        "SELECT * FROM Lease WHERE Lease = 2", "SELECT * FROM Lease WHERE a = Lease",
        "SELECT * FROM Lease WHERE Lease IS NULL AND", "SELECT * FROM Lease; SELECT * FROM Lease",
        "DELETE FROM Lease", "SELECT * FROM Lease WHERE a#'b' = 1"));

TEST(Query, TellsWhereItIsWrong) {
    try {
        static_cast<void>(Query::parse("WQL", "SELECT * FROM Lease WHERE a = ;"));
        FAIL();
    } catch (const QueryError& error) {
        EXPECT_STREQ(error.what(), "at character 31: this is not a part of a query");
    }
}

TEST(Query, LengthAndDepthAreLimited) {
    const std::string start = "SELECT * FROM Lease WHERE ";
    std::string wide = start + "State = 2";
    while (wide.size() + 13 < Query::longestText) {
        wide += " OR State = 2";
    }
    EXPECT_EQ(refusal("WQL", wide), CMPI_RC_OK);
    EXPECT_EQ(refusal("WQL", wide + std::string(Query::longestText, ' ')),
              CMPI_RC_ERR_INVALID_QUERY);
    const auto nested = [&start](const std::string& opening, std::size_t times,
                                 const std::string& closing) {
        std::string text = start;
        for (std::size_t i = 0; i < times; ++i) {
            text += opening;
        }
        text += "State = 2";
        for (std::size_t i = 0; i < times; ++i) {
            text += closing;
        }
        return text;
    };
    constexpr std::size_t deepest = Query::deepestNesting;
    EXPECT_EQ(refusal("WQL", nested("(", deepest - 1, ")")), CMPI_RC_OK);
    EXPECT_EQ(refusal("WQL", nested("(", deepest, ")")), CMPI_RC_ERR_INVALID_QUERY);
    EXPECT_EQ(refusal("WQL", nested("NOT ", deepest - 1, "")), CMPI_RC_OK);
    EXPECT_EQ(refusal("WQL", nested("NOT ", deepest, "")), CMPI_RC_ERR_INVALID_QUERY);
    EXPECT_EQ(refusal("WQL", start + "a LIKE '" + std::string(1024, 'a') + "'"), CMPI_RC_OK);
    EXPECT_EQ(refusal("WQL", start + "a LIKE '" + std::string(1025, 'a') + "'"),
              CMPI_RC_ERR_INVALID_QUERY);
}

TEST(LikePattern, MatchesWholeCharacters) {
    EXPECT_TRUE(LikePattern::ofWql("_").matches("ü"));
    EXPECT_TRUE(LikePattern::ofWql("_").matches("\xff"));
    EXPECT_FALSE(LikePattern::ofWql("_").matches(""));
    EXPECT_TRUE(LikePattern::ofWql("%%").matches(""));
    EXPECT_TRUE(LikePattern::ofWql("").matches(""));
    EXPECT_FALSE(LikePattern::ofWql("").matches("a"));
    EXPECT_TRUE(LikePattern::ofCql("ü*")->matches("üüü"));
    EXPECT_TRUE(LikePattern::ofCql("a|")->matches(""));
    EXPECT_TRUE(LikePattern::ofCql("a*b*c*")->matches("bb"));
    EXPECT_FALSE(LikePattern::ofCql("a*b")->matches("ba"));
}

/// To go back at each "%" would take longer than the test can wait for.
TEST(LikePattern, TakesNoLongerForAPatternOfManyRepeats) {
    std::string pattern;
    for (int i = 0; i < 200; ++i) {
        pattern += "%a";
    }
    EXPECT_FALSE(LikePattern::ofWql(pattern + "b").matches(std::string(2000, 'a')));
    EXPECT_TRUE(LikePattern::ofWql(pattern).matches(std::string(2000, 'a')));
}

}  // namespace
}  // namespace cimom
