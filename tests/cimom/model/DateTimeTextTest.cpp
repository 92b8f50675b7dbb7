#include "cimom/DateTimeText.h"

#include <gtest/gtest.h>

using cimom::DateTime;
using cimom::parseDateTime;
using cimom::toText;

TEST(DateTimeText, ReadsPointsInTime) {
    EXPECT_EQ(parseDateTime("19700101000000.000000+000"), (DateTime{false, 0}));
    EXPECT_EQ(parseDateTime("20240131093000.000000+060"), (DateTime{false, 1706689800000000}));
    EXPECT_EQ(parseDateTime("20240131093000.123456-060"), (DateTime{false, 1706697000123456}));
    EXPECT_EQ(parseDateTime("19691231235959.999999+000"), (DateTime{false, -1}));
    EXPECT_EQ(parseDateTime("20240229000000.000000+000"), (DateTime{false, 1709164800000000}));
}

TEST(DateTimeText, ReadsIntervals) {
    EXPECT_EQ(parseDateTime("00000001000000.000000:000"), (DateTime{true, 86400000000}));
    EXPECT_EQ(parseDateTime("00000000010203.000004:000"), (DateTime{true, 3723000004}));
    EXPECT_EQ(parseDateTime("99999999235959.999999:000"), (DateTime{true, 8639999999999999999}));
}

TEST(DateTimeText, AsterisksCountAsTheSmallestValue) {
    EXPECT_EQ(parseDateTime("2024**********.******+000"), (DateTime{false, 1704067200000000}));
    EXPECT_EQ(parseDateTime("20240131093000.12****+060"), (DateTime{false, 1706689800120000}));
    EXPECT_EQ(parseDateTime("00000001******.******:000"), (DateTime{true, 86400000000}));
}

TEST(DateTimeText, RefusesWhatIsNoDateTime) {
    for (const char* const text : {"",
                                   "yesterday",
                                   "20240131093000.000000+06",
                                   "20240131093000.000000+0600",
                                   "20241331093000.000000+060",
                                   "20240231093000.000000+060",
                                   "20240131243000.000000+060",
                                   "20240131096000.000000+060",
                                   "20240131093060.000000+060",
                                   "20240131093000,000000+060",
                                   "20240131093000.000000 060",
                                   "20240131093000.000000+0*0",
                                   "2024*131093000.000000+060",
                                   "2024**31093000.000000+060",
                                   "20240131093000.0*0000+060",
                                   "2024013109****.000000+060",
                                   "00000001000000.000000:001",
                                   "00000001240000.000000:000",
                                   "0000000a000000.000000:000",
                                   "20230229000000.000000+000",
                                   "-0240131093000.000000+060"}) {
        EXPECT_FALSE(parseDateTime(text)) << text;
    }
}

TEST(DateTimeText, WritesWhatItReads) {
    for (const char* const text :
         {"19700101000000.000000+000", "20240229235959.999999+000", "00000101000000.000000+000",
          "99991231235959.999999+000", "00000001020304.000005:000", "99999999235959.999999:000"}) {
        EXPECT_EQ(toText(*parseDateTime(text)), text);
    }
}

TEST(DateTimeText, HasNoTextForValuesOutsideOfTheForm) {
    EXPECT_FALSE(toText({true, -1}));
    EXPECT_FALSE(toText({true, 8640000000000000000}));
    EXPECT_FALSE(toText({false, 253402300800000000}));
    EXPECT_FALSE(toText({false, -62167219200000001}));
}
