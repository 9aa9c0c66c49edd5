#include "broker/objects/PathText.h"

#include <gtest/gtest.h>

#include <string>

namespace zorva::broker {
namespace {

ObjectPath read(std::string_view text) {
  const auto path = parsePathText(text);
  EXPECT_TRUE(path) << text << ": " << path.error().message;
  return path.value_or(ObjectPath());
}

PathTextError failure(std::string_view text) {
  const auto path = parsePathText(text);
  EXPECT_FALSE(path) << text;
  return path ? PathTextError() : path.error();
}

TEST(PathText, ReadsClassAndKeys) {
  const ObjectPath path = read(R"(ZORVA_X.Name="eth0",SystemName="host1")");
  EXPECT_EQ(path.className, "ZORVA_X");
  ASSERT_EQ(path.keys.size(), 2U);
  EXPECT_EQ(path.key("name")->asText(), "eth0");
  EXPECT_EQ(path.key("SYSTEMNAME")->asText(), "host1");
  EXPECT_EQ(path.key("Other"), nullptr);
}

TEST(PathText, ReadsHostAndNamespace) {
  EXPECT_EQ(read("ZORVA_X").className, "ZORVA_X");
  EXPECT_EQ(read("root/cimv2:ZORVA_X").nameSpace, "root/cimv2");
  const ObjectPath path = read("//host1.example.org:5988/root/cimv2:ZORVA_X.Name=\"a:b.c=d\"");
  EXPECT_EQ(path.host, "host1.example.org:5988");
  EXPECT_EQ(path.nameSpace, "root/cimv2");
  EXPECT_EQ(path.key("Name")->asText(), "a:b.c=d");
}

TEST(PathText, ReadsNumbersAndBooleans) {
  const ObjectPath path = read("C.A=1,B=-2,D=TRUE,E=false,F=1.5,G=+3,H=18446744073709551615");
  EXPECT_EQ(*path.key("A"), Value::unsignedNumber(1));
  EXPECT_EQ(*path.key("B"), Value::signedNumber(-2));
  EXPECT_EQ(*path.key("D"), Value::boolean(true));
  EXPECT_EQ(*path.key("E"), Value::boolean(false));
  EXPECT_EQ(path.key("F")->scalar, Scalar(1.5));
  EXPECT_EQ(*path.key("G"), Value::unsignedNumber(3));
  EXPECT_EQ(*path.key("H"), Value::unsignedNumber(UINT64_MAX));
}

TEST(PathText, ReadsEscapes) {
  EXPECT_EQ(read(R"(C.K="a\"b\\c\nd\te\x41;\x20ac.")").key("K")->asText(), "a\"b\\c\nd\teA;\xe2\x82\xac.");
}

TEST(PathText, WritesWhatItReads) {
  for (const char* text : {R"(C.K="a\"b\\c\nd")", "root/cimv2:C.A=1,B=-2,D=TRUE", "//h/root:C.K=\"x\"", "C", "C.F=1.5",
                           R"(C.R="root:D.K=\"a\\\"b\"")", "C.F=1.0e+300"}) {
    EXPECT_EQ(pathText(read(text)), text);
  }
}

TEST(PathText, WritesReferencesAsTheTextOfTheirPath) {
  ObjectPath inner = read("root/cimv2:D.K=\"a\\\"b\"");
  ObjectPath outer;
  outer.className = "C";
  outer.keys.push_back({"R", Value::reference(inner)});
  const std::string text = pathText(outer);
  EXPECT_EQ(text, R"(C.R="root/cimv2:D.K=\"a\\\"b\"")");
  EXPECT_EQ(pathText(read(read(text).key("R")->asText())), pathText(inner));
}

TEST(PathText, LeavesOutAHostWithoutNamespace) {
  ObjectPath path;
  path.host = "h";
  path.className = "C";
  EXPECT_EQ(pathText(path), "C");
}

struct Bad {
  const char* text;
  std::size_t position;
  const char* message;
};

TEST(PathText, ReportsTheErrorsPlaceAndWhatWasExpected) {
  const Bad all[] = {
      {"", 0, "expected a class name, found the end of the text"},
      {"9C", 0, "expected a class name, found '9'"},
      {"C.", 2, "expected a key's name, found the end of the text"},
      {"C.K", 3, "expected '=' after the key's name, found the end of the text"},
      {"C.K=", 4, "expected a value (a text in quotes, a number, TRUE or FALSE), found the end of the text"},
      {"C.K=eth0", 4,
       "expected a value (a text in quotes, a number, TRUE or FALSE), found 'eth0'; a text needs quotes"},
      {"C.K=\"a", 4, "the quotes that open here are not closed"},
      {"C.K=\"a\\", 7, "expected one of \" \\ ' n t r b f x after the backslash, found the end of the text"},
      {"C.K=\"\\q\"", 6, "expected one of \" \\ ' n t r b f x after the backslash, found 'q'"},
      {"C.K=\"\\x\"", 7, "expected one to four hexadecimal digits after \\x, found '\"'"},
      {"C.K=\"\\x0\"", 5, "this \\x names no character"},
      {"C.K=\"\\xD800\"", 5, "this \\x names no character"},
      {"C.K=\"a\"b", 7, "expected ',' and a further key, or the end of the text, found 'b'"},
      {"C.K=\"a\",", 8, "expected a key's name, found the end of the text"},
      {"C.K=1,k=2", 6, "the key k is there already"},
      {"C.K=1x", 4, "expected a number of at most 64 bits, found '1x'"},
      {"C.K=99999999999999999999", 4, "expected a number of at most 64 bits, found '99999999999999999999'"},
      {"C K", 1, "expected '.' and a key, or the end of the text, found ' '"},
      {"C\x01", 1, "expected '.' and a key, or the end of the text, found a byte of value 1"},
      {":C", 0, "expected a namespace, found ':'"},
      {"root cimv2:C", 4, "expected a namespace of names and '/', found ' '"},
      {"//host", 6, "expected '/' after the host's name, found the end of the text"},
      {"///root:C", 2, "expected the host's name, found '/'"},
      {"//host/C", 7, "expected a namespace and ':' after the host's name"},
      {"//host/C.K=1", 7, "expected a namespace and ':' before the class name"},
  };
  for (const Bad& bad : all) {
    const PathTextError error = failure(bad.text);
    EXPECT_EQ(error.position, bad.position) << bad.text;
    EXPECT_EQ(error.message, bad.message) << bad.text;
  }
}

TEST(PathText, RefusesWhatIsTooLong) {
  const PathTextError error = failure("C.K=\"" + std::string(1U << 20U, 'a') + "\"");
  EXPECT_EQ(error.position, kMaxPathText);
  EXPECT_EQ(error.message, "the path is 1048582 bytes long; at most 65536 are read");
  EXPECT_EQ(read("C.K=\"" + std::string(kMaxPathText - 6, 'a') + "\"").key("K")->asText().size(), kMaxPathText - 6);
}

TEST(PathText, RefusesMoreKeysThanAnyClassHas) {
  std::string text = "C.K0=1";
  for (int i = 1; i <= 256; ++i) text += ",K" + std::to_string(i) + "=1";
  EXPECT_EQ(failure(text).message, "more than 256 keys");
}

TEST(Value, NamesOfStatusCodes) {
  EXPECT_EQ(statusName(0), "CIM_ERR_SUCCESS");
  EXPECT_EQ(statusName(6), "CIM_ERR_NOT_FOUND");
  EXPECT_EQ(statusName(17), "CIM_ERR_METHOD_NOT_FOUND");
  EXPECT_EQ(statusName(60), "CMPI_RC_ERR_INVALID_HANDLE");
  EXPECT_EQ(statusName(12345), "an unknown status code");
}

TEST(Value, ReferencesAreCopiedWithWhatTheyHold) {
  Value value = Value::reference(read("C.K=1"));
  Value copy = value;
  std::get<Boxed<ObjectPath>>(copy.scalar)->className = "D";
  EXPECT_EQ(std::get<Boxed<ObjectPath>>(value.scalar)->className, "C");
  EXPECT_NE(value, copy);
}

}  // namespace
}  // namespace zorva::broker
