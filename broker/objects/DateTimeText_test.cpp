#include "broker/objects/DateTimeText.h"

#include <gtest/gtest.h>

namespace zorva::broker {
namespace {

TEST(DateTimeText, ReadsPointsInTime) {
  EXPECT_EQ(parseDateTime("19700101000000.000000+000")->microseconds, 0U);
  EXPECT_EQ(parseDateTime("20240229123456.000007+000")->microseconds, 1709210096000007U);
  // 13:00 in a zone one hour east of Greenwich is noon there.
  EXPECT_EQ(parseDateTime("20240101130000.000000+060")->microseconds,
            parseDateTime("20240101120000.000000+000")->microseconds);
  EXPECT_EQ(parseDateTime("20240101110000.000000-060")->microseconds,
            parseDateTime("20240101120000.000000+000")->microseconds);
  EXPECT_FALSE(parseDateTime("20240101110000.000000-060")->interval);
}

TEST(DateTimeText, ReadsIntervals) {
  const auto interval = parseDateTime("00000001020304.000005:000");
  ASSERT_TRUE(interval);
  EXPECT_TRUE(interval->interval);
  EXPECT_EQ(interval->microseconds, 93784000005U);
}

TEST(DateTimeText, TakesAsterisksForFieldsThatAreNotKnown) {
  EXPECT_EQ(parseDateTime("20240101120000.******+000")->microseconds,
            parseDateTime("20240101120000.000000+000")->microseconds);
  EXPECT_EQ(parseDateTime("20240101120000.12****+000")->microseconds,
            parseDateTime("20240101120000.120000+000")->microseconds);
  EXPECT_EQ(parseDateTime("2024**********.******+000")->microseconds,
            parseDateTime("20240101000000.000000+000")->microseconds);
}

TEST(DateTimeText, RefusesWhatIsNone) {
  for (const char* text :
       {"", "2024", "20240101120000.000000+0000", "20240101120000,000000+000", "20241301120000.000000+000",
        "20240230120000.000000+000", "20240101240000.000000+000", "20240101126000.000000+000",
        "2024010112000x.000000+000", "20240101120000.0000x0+000", "20240101120000.00**00+000",
        "20240101120000.000000?000", "20240101120000.000000+0x0", "00000001240000.000000:000",
        "00000001020304.000005:001", "19691231235959.000000+000", "2024**01120000.000000+000"}) {
    EXPECT_FALSE(parseDateTime(text)) << text;
  }
}

TEST(DateTimeText, WritesWhatItReads) {
  for (const char* text : {"19700101000000.000000+000", "20240229123456.000007+000", "99991231235959.999999+000",
                           "00000001020304.000005:000", "99999999235959.999999:000"}) {
    EXPECT_EQ(dateTimeText(*parseDateTime(text)), text);
  }
}

TEST(DateTimeText, RefusesWhatTwentyFiveCharactersCannotSay) {
  EXPECT_FALSE(dateTimeText({UINT64_MAX, false}));
  EXPECT_FALSE(dateTimeText({UINT64_MAX, true}));
  EXPECT_FALSE(dateTimeText({parseDateTime("99991231235959.999999+000")->microseconds + 1, false}));
}

}  // namespace
}  // namespace zorva::broker
