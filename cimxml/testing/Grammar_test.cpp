#include "cimxml/testing/Grammar.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace zorva::cimxml::testing {
namespace {

using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

std::string propertyWith(const std::string& value) {
  return "<CIM CIMVERSION='2.0' DTDVERSION='2.4'><DECLARATION><DECLGROUP><VALUE.OBJECT><INSTANCE CLASSNAME='C'>"
         "<PROPERTY NAME='P' TYPE='boolean'><VALUE>" +
         value + "</VALUE></PROPERTY></INSTANCE></VALUE.OBJECT></DECLGROUP></DECLARATION></CIM>";
}

TEST(GrammarProblem, IsNothingIfTheDocumentIsValid) { EXPECT_EQ(grammarProblem(propertyWith("TRUE")), ""); }

TEST(GrammarProblem, NamesTheElementThatIsWrong) {
  EXPECT_THAT(grammarProblem("<CIM/>"), HasSubstr("element CIM"));
  EXPECT_THAT(grammarProblem(propertyWith("yes")), HasSubstr("Element PROPERTY"));
}

TEST(GrammarProblem, RefusesWhatIsNotWellFormed) {
  EXPECT_THAT(grammarProblem("<CIM>"), Not(IsEmpty()));
  EXPECT_THAT(grammarProblem(""), Not(IsEmpty()));
}

}  // namespace
}  // namespace zorva::cimxml::testing
