#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

TEST_F(Changing, OverlayClearGivesBackWhatTheHostSays) {
  done(host_, {"mi", kEndpoint, "DomainName=set.example"});
  EXPECT_EQ(done(host_, {"overlay", "clear", "eth0"}), "1 value taken back\n");
  EXPECT_THAT(done(host_, {"tree"}), AllOf(HasSubstr("example.org"), Not(HasSubstr("not the host's own"))));
  expectFailed(host_, {"overlay", "clear", "eth0"}, 1, "no value is set for eth0");
  EXPECT_EQ(done(host_, {"overlay", "clear"}), "0 values taken back\n");
  EXPECT_EQ(contentOf(done(host_, {"overlay", "clear", "-o", "json"})), json::parse(R"({"cleared": 0})"));
  EXPECT_THAT(host_.run({"overlay", "show"}).err, HasSubstr("note: no value is set"));
}

TEST_F(Changing, OverlayThatIsWrongIsReportedAndCanBeCleared) {
  host_.directory().write("data/overlay.json", "{\n{");
  expectFailed(host_, {"overlay", "show"}, 2, "overlay.json:2: ");
  EXPECT_EQ(host_.run({"overlay", "clear"}).exitCode, 0);
  EXPECT_EQ(host_.run({"overlay", "show"}).exitCode, 0);
}

}  // namespace
}  // namespace zorva::cli
