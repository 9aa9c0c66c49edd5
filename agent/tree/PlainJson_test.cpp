#include "agent/tree/PlainJson.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "agent/tree/Json.h"

namespace zorva::agent {
namespace {

// The events of a document, each as a line of text.
class Recorder : public JsonEvents {
 public:
  std::string events;

  bool null() override { return record("null"); }
  bool boolean(bool value) override { return record(value ? "true" : "false"); }
  bool number_integer(number_integer_t value) override { return record("integer " + std::to_string(value)); }
  bool number_unsigned(number_unsigned_t value) override { return record("whole number " + std::to_string(value)); }
  bool number_float(number_float_t, const string_t& text) override { return record("other number " + text); }
  bool string(string_t& value) override { return record("text " + value); }
  bool binary(binary_t&) override { return false; }
  bool start_object(std::size_t) override { return record("{"); }
  bool key(string_t& value) override { return record("key " + value); }
  bool end_object() override { return record("}"); }
  bool start_array(std::size_t) override { return record("["); }
  bool end_array() override { return record("]"); }
  bool parse_error(std::size_t, const std::string&, const nlohmann::detail::exception&) override {
    record("error");
    return false;
  }

 private:
  bool record(const std::string& event) {
    events += event + '\n';
    return true;
  }
};

constexpr std::string_view kDocument =
    "{\"nodes\": [\r\n  {\"name\":\"eth0\", \"list\" : [\"192.0.2.53\",\"\"],\n\t\"state\": 10, \"none\": [ ], "
    "\"zero\": 0},\n{}]}\n";

bool isPlain(std::string_view document) {
  Recorder recorder;
  int line = 1;
  return readPlainJson(document, line, recorder);
}

// A document that is read has the events that nlohmann's parser reports.
void compare(const std::string& document, int& plain) {
  Recorder recorder;
  int line = 1;
  if (!readPlainJson(document, line, recorder)) return;
  ++plain;
  Recorder expected;
  nlohmann::json::sax_parse(document, &expected);
  EXPECT_EQ(recorder.events, expected.events) << document;
}

TEST(PlainJson, WhatTheAgentWritesIsPlain) { EXPECT_TRUE(isPlain(kDocument)); }

TEST(PlainJson, EachDocumentThatDiffersInAByteIsReadAsByTheGeneralParserOrLeftToIt) {
  int plain = 0;
  for (std::size_t i = 0; i < kDocument.size(); ++i) {
    for (int byte = 0; byte < 256; ++byte) {
      std::string document(kDocument);
      document[i] = static_cast<char>(byte);
      compare(document, plain);
      if (byte < 128) compare(document.insert(i, 1, kDocument[i]), plain);
    }
    compare(std::string(kDocument).erase(i, 1), plain);
    compare(std::string(kDocument.substr(0, i)), plain);
  }
  EXPECT_GT(plain, 1000) << "most changes of a character in a text leave the document plain";
}

TEST(PlainJson, NumbersAreWholeAndFit) {
  EXPECT_TRUE(isPlain("18446744073709551615"));
  for (const char* number : {"18446744073709551616", "-1", "1.5", "1e3", "01", "+1", "00"}) {
    EXPECT_FALSE(isPlain(number)) << number;
  }
}

TEST(PlainJson, ValuesHaveTheirLinesWhoeverReadsThem) {
  const std::string plain = "\n[1,\n\n\"a\",{\r\n\"b\":\n2\n}\n,[\n]]";
  const std::string general = "\n[1,\n\n\"\\u0061\",{\r\n\"b\":\n2\n}\n,[\n]]";
  ASSERT_TRUE(isPlain(plain));
  ASSERT_FALSE(isPlain(general));
  for (const std::string& document : {plain, general}) {
    const JsonValue value = parseJson(document, "document");
    EXPECT_EQ(value.line, 2);
    ASSERT_EQ(value.items.size(), 4U);
    EXPECT_EQ(value.items[0].line, 2);
    EXPECT_EQ(value.items[1].line, 4);
    EXPECT_EQ(value.items[2].line, 4);
    EXPECT_EQ(value.items[2].items[0].line, 6);
    EXPECT_EQ(value.items[3].line, 8);
  }
}

TEST(PlainJson, ADocumentThatStopsBeingPlainIsReadFromItsBeginning) {
  const JsonValue value = parseJson("{\"a\": [1, 2], \"b\": [3, true, 4.5], \"c\": \"\xC3\xA4\"}", "document");
  ASSERT_EQ(value.keys, (std::vector<std::string>{"a", "b", "c"}));
  EXPECT_EQ(value.items[0].items.size(), 2U);
  EXPECT_EQ(value.items[1].items.size(), 3U);
  EXPECT_EQ(value.items[2].text, "\xC3\xA4");
}

}  // namespace
}  // namespace zorva::agent
