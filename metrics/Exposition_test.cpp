#include "metrics/Exposition.h"

#include <gtest/gtest.h>

#include <cmath>

namespace zorva::metrics {
namespace {

TEST(Exposition, WritesHelpAndTypeOnceBeforeTheSamplesOfAFamily) {
  Exposition out;
  out.family("zorva_dns_servers", Type::Gauge, "DNS servers.");
  out.sample({{"interface", "eth0"}}, 2);
  out.sample({{"interface", "eth1"}, {"system", "host"}}, 0.25);
  EXPECT_EQ(out.text(),
            "# HELP zorva_dns_servers DNS servers.\n"
            "# TYPE zorva_dns_servers gauge\n"
            "zorva_dns_servers{interface=\"eth0\"} 2\n"
            "zorva_dns_servers{interface=\"eth1\",system=\"host\"} 0.25\n");
}

TEST(Exposition, LeavesAFamilyWithoutSamplesOut) {
  Exposition out;
  out.family("zorva_nothing", Type::Gauge, "Nothing.");
  out.single("zorva_requests_total", Type::Counter, "Requests.", 1e15);
  EXPECT_EQ(out.text(),
            "# HELP zorva_requests_total Requests.\n"
            "# TYPE zorva_requests_total counter\n"
            "zorva_requests_total 1e+15\n");
}

std::string labelOf(std::string_view value) {
  Exposition out;
  out.family("m", Type::Gauge, "M.");
  out.sample({{"l", value}}, 1);
  const std::size_t begin = out.text().find("m{l=\"") + 5;
  return out.text().substr(begin, out.text().rfind("\"} 1\n") - begin);
}

TEST(Exposition, EscapesTheValuesOfLabels) {
  EXPECT_EQ(labelOf("a\"b\\c\nd"), "a\\\"b\\\\c\\nd");
  EXPECT_EQ(labelOf("\"} 1\nzorva_forged 1"), "\\\"} 1\\nzorva_forged 1");
}

TEST(Exposition, ReplacesBytesThatAreNotUtf8) { EXPECT_EQ(labelOf("é\xFFz"), "é\xEF\xBF\xBDz"); }

TEST(Exposition, CutsLongValuesBetweenCharacters) {
  const std::string label = labelOf(std::string(Exposition::kLongestLabel - 1, 'x') + "é");
  EXPECT_EQ(label, std::string(Exposition::kLongestLabel - 1, 'x'));
}

TEST(Exposition, WritesNumbersThatAreNone) {
  Exposition out;
  out.single("m", Type::Gauge, "M.", INFINITY);
  out.single("n", Type::Gauge, "N.", NAN);
  EXPECT_NE(out.text().find("m +Inf\n"), std::string::npos);
  EXPECT_NE(out.text().find("n NaN\n"), std::string::npos);
}

}  // namespace
}  // namespace zorva::metrics
