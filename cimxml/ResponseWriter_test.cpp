#include "cimxml/ResponseWriter.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <vector>

namespace zorva::cimxml {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::SizeIs;

class ResponseWriterTest : public ::testing::Test {
 protected:
  ResponseWriter writer(std::size_t most = 1000) {
    return {buffer_, most, [this](std::string_view text) { pieces_.emplace_back(text); }};
  }
  std::string text() const {
    std::string all;
    for (const std::string& piece : pieces_) all += piece;
    return all;
  }

  std::string buffer_ = "left from before";
  std::vector<std::string> pieces_;
};

TEST_F(ResponseWriterTest, WritesTheFrameOfASimpleResponse) {
  ResponseWriter response = writer();
  response.beginMessage("4<2", false);
  response.beginResponse("GetInstance", false);
  response.endResponse();
  response.endMessage();
  EXPECT_THAT(pieces_, SizeIs(1));
  EXPECT_EQ(text(),
            "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n<CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\"><MESSAGE "
            "ID=\"4&lt;2\" PROTOCOLVERSION=\"1.0\"><SIMPLERSP><IMETHODRESPONSE NAME=\"GetInstance\">"
            "</IMETHODRESPONSE></SIMPLERSP></MESSAGE></CIM>\n");
}

TEST_F(ResponseWriterTest, WritesOneResponseForEachRequest) {
  ResponseWriter response = writer();
  response.beginMessage("1", true);
  for (const char* name : {"A", "B"}) {
    response.beginResponse(name, true);
    response.endResponse();
  }
  response.endMessage();
  EXPECT_THAT(text(), HasSubstr("<MULTIRSP><SIMPLERSP><METHODRESPONSE NAME=\"A\"></METHODRESPONSE></SIMPLERSP>"
                                "<SIMPLERSP><METHODRESPONSE NAME=\"B\"></METHODRESPONSE></SIMPLERSP></MULTIRSP>"));
}

TEST_F(ResponseWriterTest, PutsAnErrorInThePlaceOfWhatWasWritten) {
  ResponseWriter response = writer();
  response.beginMessage("1", false);
  response.beginResponse("M", false);
  response.beginReturnValue();
  response.out() += "half";
  EXPECT_TRUE(response.putError(6, "no \"such\" thing"));
  response.endResponse();
  response.endMessage();
  EXPECT_THAT(text(), HasSubstr("<IMETHODRESPONSE NAME=\"M\"><ERROR CODE=\"6\" DESCRIPTION=\"no &quot;such&quot; "
                                "thing\"/></IMETHODRESPONSE>"));
  EXPECT_THAT(text(), Not(HasSubstr("half")));
}

TEST_F(ResponseWriterTest, HandsTextOnInPiecesAndCannotTakeThemBack) {
  ResponseWriter response = writer(50);
  response.beginMessage("1", false);
  response.beginResponse("M", false);
  for (int i = 0; i < 10; ++i) {
    response.out() += std::string(20, 'x');
    response.drainIfFull();
  }
  EXPECT_GT(pieces_.size(), 2U);
  EXPECT_FALSE(response.putError(1, "too late"));
  EXPECT_LT(buffer_.size(), 50U);
}

TEST_F(ResponseWriterTest, CanStillFailALaterResponseOfTheSameMessage) {
  ResponseWriter response = writer(50);
  response.beginMessage("1", true);
  response.beginResponse("A", false);
  response.out() += std::string(100, 'x');
  response.drainIfFull();
  response.endResponse();
  response.beginResponse("B", false);
  EXPECT_TRUE(response.putError(1, ""));
  response.endResponse();
  response.endMessage();
  EXPECT_THAT(text(), HasSubstr("NAME=\"B\"><ERROR CODE=\"1\"/></IMETHODRESPONSE>"));
}

}  // namespace
}  // namespace zorva::cimxml
