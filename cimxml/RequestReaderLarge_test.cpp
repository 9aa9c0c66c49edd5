// Requests in which one element repeats as often as a body has room for. Reading takes time in proportion to their
// size, and ends when its time is over.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <functional>

#include "cimxml/RequestReader.h"

namespace zorva::cimxml {
namespace {

using ::testing::HasSubstr;

/// piece(0), piece(1), … one after the other.
std::string repeated(std::size_t count, const std::function<std::string(const std::string& number)>& piece) {
  std::string text;
  for (std::size_t i = 0; i < count; ++i) text += piece(std::to_string(1'000'000 + i));
  return text;
}

std::string nested(std::size_t count, const std::string& begin, const std::string& inner, const std::string& end) {
  std::string text;
  for (std::size_t i = 0; i < count; ++i) text += begin;
  text += inner;
  for (std::size_t i = 0; i < count; ++i) text += end;
  return text;
}

std::string escaped(const std::string& text) {
  std::string out;
  for (const char c : text) out += c == '<' ? "&lt;" : c == '&' ? "&amp;" : std::string(1, c);
  return out;
}

std::string message(const std::string& content) {
  return R"(<CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="7" PROTOCOLVERSION="1.0"><SIMPLEREQ>)" + content +
         "</SIMPLEREQ></MESSAGE></CIM>";
}

constexpr const char* kNamespace = R"(<LOCALNAMESPACEPATH><NAMESPACE NAME="n"/></LOCALNAMESPACEPATH>)";

std::string intrinsic(const std::string& parameters) {
  return message("<IMETHODCALL NAME=\"M\">" + std::string(kNamespace) + parameters + "</IMETHODCALL>");
}

std::string value(const std::string& content) {
  return intrinsic("<IPARAMVALUE NAME=\"P\">" + content + "</IPARAMVALUE>");
}

std::string instance(const std::string& properties) {
  return value("<INSTANCE CLASSNAME=\"C\">" + properties + "</INSTANCE>");
}

std::string extrinsic(const std::string& parameters) {
  return message("<METHODCALL NAME=\"M\"><LOCALCLASSPATH>" + std::string(kNamespace) +
                 "<CLASSNAME NAME=\"C\"/></LOCALCLASSPATH>" + parameters + "</METHODCALL>");
}

std::string embedded(const std::string& properties) {
  return extrinsic("<PARAMVALUE NAME=\"P\" EmbeddedObject=\"instance\"><VALUE>" +
                   escaped("<INSTANCE CLASSNAME=\"C\">" + properties + "</INSTANCE>") + "</VALUE></PARAMVALUE>");
}

std::string keys(std::size_t count) {
  return "<INSTANCENAME CLASSNAME=\"C\">" +
         repeated(count,
                  [](const std::string& i) {
                    return "<KEYBINDING NAME=\"K" + i + "\"><KEYVALUE>v</KEYVALUE></KEYBINDING>";
                  }) +
         "</INSTANCENAME>";
}

std::string properties(std::size_t count, const std::string& element) {
  return repeated(count, [&](const std::string& i) {
    return "<" + element + " NAME=\"P" + i + "\" TYPE=\"string\"></" + element + ">";
  });
}

std::string always(std::size_t count, const std::string& piece) {
  return repeated(count, [&](const std::string&) { return piece; });
}

struct Kind {
  const char* name;
  std::function<std::string(std::size_t count)> body;
  const char* cap;  ///< the error with 20,000 of them; null: they are read, or end for another reason
};

std::vector<Kind> kinds() {
  return {
      {"IPARAMVALUE",
       [](std::size_t n) {
         return intrinsic(repeated(n, [](const std::string& i) { return "<IPARAMVALUE NAME=\"P" + i + "\"/>"; }));
       },
       "IMETHODCALL has more than 256 parameters"},
      {"PARAMVALUE",
       [](std::size_t n) {
         return extrinsic(repeated(n, [](const std::string& i) { return "<PARAMVALUE NAME=\"P" + i + "\"/>"; }));
       },
       "METHODCALL has more than 256 parameters"},
      {"KEYBINDING", [](std::size_t n) { return value(keys(n)); }, "INSTANCENAME has more than 256 keys"},
      {"PROPERTY", [](std::size_t n) { return instance(properties(n, "PROPERTY")); },
       "INSTANCE has more than 1024 properties"},
      {"PROPERTY.ARRAY", [](std::size_t n) { return instance(properties(n, "PROPERTY.ARRAY")); },
       "INSTANCE has more than 1024 properties"},
      {"PROPERTY.REFERENCE", [](std::size_t n) { return instance(properties(n, "PROPERTY.REFERENCE")); },
       "INSTANCE has more than 1024 properties"},
      {"PROPERTY of an embedded instance", [](std::size_t n) { return embedded(properties(n, "PROPERTY")); },
       "INSTANCE has more than 1024 properties"},
      {"QUALIFIER",
       [](std::size_t n) {
         return instance(always(n, "<QUALIFIER NAME=\"Q\" TYPE=\"string\"><VALUE>q</VALUE></QUALIFIER>"));
       },
       nullptr},
      {"VALUE in VALUE.ARRAY",
       [](std::size_t n) { return value("<VALUE.ARRAY>" + always(n, "<VALUE>v</VALUE>") + "</VALUE.ARRAY>"); },
       nullptr},
      {"VALUE.REFERENCE in VALUE.REFARRAY",
       [](std::size_t n) {
         return extrinsic("<PARAMVALUE NAME=\"P\"><VALUE.REFARRAY>" +
                          always(n, "<VALUE.REFERENCE><CLASSNAME NAME=\"C\"/></VALUE.REFERENCE>") +
                          "</VALUE.REFARRAY></PARAMVALUE>");
       },
       nullptr},
      {"nested VALUE.REFERENCE",
       [](std::size_t n) {
         const std::string one = nested(30, "<VALUE.REFERENCE><INSTANCENAME CLASSNAME=\"C\"><KEYBINDING NAME=\"K\">",
                                        "<KEYVALUE/>", "</KEYBINDING></INSTANCENAME></VALUE.REFERENCE>");
         return extrinsic("<PARAMVALUE NAME=\"P\"><VALUE.REFARRAY>" + always(n / 100, one) +
                          "</VALUE.REFARRAY></PARAMVALUE>");
       },
       nullptr},
      {"VALUE.REFERENCE nested too deep",
       [](std::size_t n) { return value(nested(n, "<VALUE.REFERENCE>", "", "</VALUE.REFERENCE>")); },
       "elements nested deeper than 128"},
      {"NAMESPACE",
       [](std::size_t n) {
         return message("<IMETHODCALL NAME=\"M\"><LOCALNAMESPACEPATH>" + always(n, "<NAMESPACE NAME=\"n\"/>") +
                        "</LOCALNAMESPACEPATH></IMETHODCALL>");
       },
       "LOCALNAMESPACEPATH has more than 64 namespaces"},
      {"attribute",
       [](std::size_t n) {
         return "<CIM" + repeated(n, [](const std::string& i) { return " a" + i + "=\"\""; }) + "/>";
       },
       "CIM has more than 32 attributes"},
      {"attribute of an embedded instance",
       [](std::size_t n) {
         return extrinsic(
             "<PARAMVALUE NAME=\"P\" EmbeddedObject=\"instance\"><VALUE>" +
             escaped("<INSTANCE" + repeated(n, [](const std::string& i) { return " a" + i + "=\"\""; }) + "/>") +
             "</VALUE></PARAMVALUE>");
       },
       "INSTANCE has more than 32 attributes"},
      {"unknown element", [](std::size_t n) { return intrinsic(always(n, "<EXTRA A=\"b\"/>")); }, nullptr},
      {"long name", [](std::size_t n) { return intrinsic("<IPARAMVALUE NAME=\"" + std::string(n, 'x') + "\"/>"); },
       "the attribute NAME with more than 1024 bytes"},
      {"comment", [](std::size_t n) { return value("<VALUE>" + always(n, "a<!-- -->") + "</VALUE>"); }, nullptr},
      {"CDATA section", [](std::size_t n) { return value("<VALUE>" + always(n, "<![CDATA[a]]>") + "</VALUE>"); },
       nullptr},
      {"instruction", [](std::size_t n) { return value("<VALUE>" + always(n, "<?a b?>") + "</VALUE>"); }, nullptr},
      {"entity in a text", [](std::size_t n) { return value("<VALUE>" + always(n, "&amp;&#65;") + "</VALUE>"); },
       nullptr},
      {"entity in an attribute", [](std::size_t n) { return intrinsic("<EXTRA A=\"" + always(n, "&amp;") + "\"/>"); },
       nullptr},
      {"line end", [](std::size_t n) { return value("<VALUE>" + always(n, "a\r\n") + "</VALUE>"); }, nullptr},
      {"document type", [](std::size_t n) { return always(n, "<!DOCTYPE a>"); }, "the text has no element"},
  };
}

std::string errorOf(const std::string& text) {
  const auto request = readRequest(text, {});
  return request ? "no error" : request.error().message;
}

TEST(LargeRequests, ACapIsNamedInTheError) {
  for (const Kind& kind : kinds()) {
    SCOPED_TRACE(kind.name);
    EXPECT_THAT(errorOf(kind.body(20'000)), HasSubstr(kind.cap == nullptr ? "no error" : kind.cap));
  }
}

TEST(LargeRequests, TheCapsLeaveRoomForWhatTheyName) {
  EXPECT_EQ(errorOf(value(keys(256))), "no error");
  EXPECT_EQ(errorOf(instance(properties(1024, "PROPERTY"))), "no error");
  EXPECT_EQ(errorOf(value("<VALUE.ARRAY>" + always(65'536, "<VALUE/>") + "</VALUE.ARRAY>")), "no error");
  EXPECT_THAT(errorOf(value("<VALUE.ARRAY>" + always(65'537, "<VALUE/>") + "</VALUE.ARRAY>")),
              HasSubstr("VALUE.ARRAY has more than 65536 values"));
}

/// Without the limits, because the reading itself is measured.
ReaderLimits wide() {
  ReaderLimits limits;
  constexpr std::size_t kMany = 100'000'000;
  limits.xml.elements = limits.parameters = limits.keys = limits.properties = limits.values = kMany;
  limits.namespaces = limits.nameBytes = kMany;
  return limits;
}

std::chrono::duration<double> timeToRead(const std::string& text, const ReaderLimits& limits) {
  auto best = std::chrono::duration<double>::max();
  for (int i = 0; i < 3; ++i) {
    const auto begin = std::chrono::steady_clock::now();
    const auto request = readRequest(text, limits);
    best = std::min<std::chrono::duration<double>>(best, std::chrono::steady_clock::now() - begin);
  }
  return best;
}

TEST(LargeRequests, TakeTimeInProportionToTheirSize) {
  constexpr std::size_t kFew = 400;
  constexpr std::size_t kTimes = 16;  // quadratic: 256 times the time
  for (const Kind& kind : kinds()) {
    SCOPED_TRACE(kind.name);
    for (const ReaderLimits& limits : {ReaderLimits(), wide()}) {
      const auto few = timeToRead(kind.body(kFew), limits);
      const auto many = timeToRead(kind.body(kFew * kTimes), limits);
      EXPECT_LT(many / few, kTimes * 10);
    }
  }
}

TEST(LargeRequests, AreLeftWhenTheirTimeIsOver) {
  for (const Kind& kind : kinds()) {
    const std::string text = kind.body(30'000);
    if (errorOf(text) != "no error") continue;
    SCOPED_TRACE(kind.name);
    int looks = 0;
    ReaderLimits limits;
    limits.xml.isOver = [&] { return ++looks < 0; };
    EXPECT_TRUE(readRequest(text, limits));
    EXPECT_GT(looks, 0);
    for (const int last : {1, (looks + 1) / 2, looks}) {
      int asked = 0;
      limits.xml.isOver = [&] { return ++asked >= last; };
      const auto request = readRequest(text, limits);
      ASSERT_FALSE(request);
      EXPECT_EQ(request.error().fault, Fault::TimeIsOver);
      EXPECT_EQ(asked, last);
    }
  }
}

}  // namespace
}  // namespace zorva::cimxml
