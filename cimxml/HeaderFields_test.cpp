#include "cimxml/HeaderFields.h"

#include <gtest/gtest.h>

namespace zorva::cimxml {
namespace {

TEST(FieldValue, EscapesWhatAHeaderFieldCannotHave) {
  EXPECT_EQ(fieldValue("root/cimv2:C.K=\"a b\r\n\""), "root/cimv2:C.K%3D%22a%20b%0D%0A%22");
  EXPECT_EQ(fieldValue("\xC3\xA4%"), "%C3%A4%25");
}

TEST(FieldText, IsWhatFieldValueCameFrom) {
  EXPECT_EQ(fieldText(fieldValue("a\xC3\xA4 %41\n")), "a\xC3\xA4 %41\n");
  EXPECT_EQ(fieldText("100% %4 %zz %"), "100% %4 %zz %");
}

TEST(StrictFieldText, TakesNoHalfEscapeAndNothingButUtf8) {
  EXPECT_EQ(strictFieldText(fieldValue("a\xC3\xA4 %41\n")), "a\xC3\xA4 %41\n");
  for (const char* value : {"%", "a%4", "%zz", "%+1", "%C3", "\xFF"}) {
    EXPECT_EQ(strictFieldText(value), std::nullopt) << value;
  }
}

}  // namespace
}  // namespace zorva::cimxml
