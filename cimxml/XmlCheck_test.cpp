#include "cimxml/XmlCheck.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

namespace zorva::cimxml {
namespace {

using Cases = std::vector<std::pair<std::string, std::string>>;
using ::testing::HasSubstr;

/// The error of a text; empty if there is none.
std::string problemOf(std::string_view text, const XmlLimits& limits = {}) {
  const auto checked = checkXml(text, limits);
  return checked ? std::string() : checked.error().message;
}

std::string bytes(std::string_view text) { return "<a>" + std::string(text) + "</a>"; }

TEST(XmlCheck, PassesWhatIsWellFormed) {
  EXPECT_EQ(problemOf("<a/>"), "");
  EXPECT_EQ(problemOf("\xEF\xBB\xBF<?xml version='1.0' encoding='UTF-8'?>\n<!-- <b> & --><a x='>' y=\"'\">t</a>\n"),
            "");
  EXPECT_EQ(problemOf("<a><b/><![CDATA[ & < ]]><?pi & ?>&amp;&lt;&gt;&quot;&apos;&#10;&#x1F310;</a>"), "");
  EXPECT_EQ(problemOf("<!DOCTYPE CIM SYSTEM \"cim.dtd\"><a b='&amp;'/>"), "");
}

TEST(XmlCheck, RefusesBytesThatAreNoUtf8) {
  for (const char* text : {"\xFF", "\xC0\x80", "\xED\xA0\x80", "\xF4\x90\x80\x80", "\xC3"}) {
    EXPECT_EQ(problemOf(bytes(text)), "this is no UTF-8") << text;
  }
}

TEST(XmlCheck, RefusesCharactersThatXmlLacks) {
  EXPECT_EQ(problemOf(bytes("\x01")), "XML 1.0 has no such character");
  EXPECT_EQ(problemOf(bytes(std::string_view("\0", 1))), "XML 1.0 has no such character");
  EXPECT_EQ(problemOf(bytes("\xEF\xBF\xBF")), "XML 1.0 has no such character");
  for (const char* text : {"&#0;", "&#x1;", "&#xD800;", "&#x110000;", "&#;", "&#x;", "&#99999999999;", "&#12a;"}) {
    EXPECT_THAT(problemOf(bytes(text)), HasSubstr("a reference to what is no character")) << text;
  }
}

TEST(XmlCheck, KnowsNoEntitiesButXmlsOwn) {
  EXPECT_THAT(problemOf(bytes("&secret;")), HasSubstr("&secret;"));
  EXPECT_THAT(problemOf("<a b='&x;'/>"), HasSubstr("&x;"));
  EXPECT_EQ(problemOf(bytes("a & b")), "'&' that begins no reference");
  EXPECT_EQ(problemOf("<!DOCTYPE a [<!ENTITY x SYSTEM 'file:///etc/passwd'>]><a>&x;</a>"),
            "a document type with declarations is not taken");
  EXPECT_EQ(problemOf("<a><!ENTITY x 'y'></a>"), "a declaration within a document");
  EXPECT_EQ(problemOf("<a/><!DOCTYPE a>"), "a declaration within a document");
}

TEST(XmlCheck, RequiresOneRootElementAndNothingBesideIt) {
  const Cases cases = {
      {"", "the text has no element"},
      {"  \n", "the text has no element"},
      {"<a/><b/>", "a second root element"},
      {"<a/>x", "text outside the root element"},
      {"x<a/>", "text outside the root element"},
      {"<![CDATA[x]]><a/>", "text outside the root element"},
  };
  for (const auto& [text, problem] : cases) EXPECT_EQ(problemOf(text), problem) << text;
}

TEST(XmlCheck, RefusesATextThatEndsTooSoon) {
  const Cases cases = {
      {"<a><b></b>", "the text ends within an element"},
      {"<a b='", "a tag that does not end"},
      {"<a", "a tag that does not end"},
      {"<a><!-- ", "a comment does not end"},
      {"<a><![CDATA[ ]]", "a CDATA section does not end"},
      {"<?xml ", "a processing instruction does not end"},
      {"<!DOCTYPE a", "the document type does not end"},
      {"<a/></a>", "an end tag that ends nothing"},
      {"<a></a", "an end tag that ends nothing"},
      {"<a b='<'/>", "'<' within a tag"},
  };
  for (const auto& [text, problem] : cases) EXPECT_EQ(problemOf(text), problem) << text;
}

TEST(XmlCheck, TakesNoOtherEncoding) {
  EXPECT_THAT(problemOf("<?xml version=\"1.0\" encoding=\"ISO-8859-1\"?><a/>"), HasSubstr("ISO-8859-1"));
  EXPECT_EQ(problemOf("<?xml version=\"1.0\" encoding=\"us-ascii\"?><a/>"), "");
}

TEST(XmlCheck, BoundsDepthAndNumberOfElements) {
  const XmlLimits limits{3, 5};
  EXPECT_EQ(problemOf("<a><a><a/></a></a>", limits), "");
  EXPECT_EQ(problemOf("<a><a><a></a></a></a>", limits), "");
  const auto deep = checkXml("<a><a><a><a></a></a></a></a>", limits);
  ASSERT_FALSE(deep);
  EXPECT_TRUE(deep.error().isLimit);
  EXPECT_EQ(deep.error().message, "elements nested deeper than 3");
  EXPECT_EQ(deep.error().position, 9U);
  EXPECT_EQ(problemOf("<a><b/><b/><b/><b/><b/></a>", limits), "more than 5 elements");
}

TEST(XmlCheck, ReportsPlacesAsAPersonCountsThem) {
  EXPECT_EQ(placeText("ab\ncd", 0), "line 1, column 1");
  EXPECT_EQ(placeText("ab\ncd", 4), "line 2, column 2");
  EXPECT_EQ(placeText("ab\n", 99), "line 2, column 1");
}

}  // namespace
}  // namespace zorva::cimxml
