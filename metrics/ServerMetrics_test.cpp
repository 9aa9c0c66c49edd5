#include "metrics/ServerMetrics.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace zorva::metrics {
namespace {

using namespace std::chrono_literals;
using ::testing::HasSubstr;
using ::testing::Not;

std::string textOf(const ServerMetrics& metrics) {
  Exposition out;
  metrics.write(out);
  return out.text();
}

TEST(ServerMetrics, CountRequestsByTargetAndCode) {
  ServerMetrics metrics;
  metrics.requestEnded(Target::Cim, 200, 3ms);
  metrics.requestEnded(Target::Cim, 200, 2s);
  metrics.requestEnded(Target::Page, 401, 1ms);
  const std::string text = textOf(metrics);
  EXPECT_THAT(text, HasSubstr("zorva_http_requests_total{target=\"cim\",code=\"200\"} 2\n"));
  EXPECT_THAT(text, HasSubstr("zorva_http_requests_total{target=\"page\",code=\"401\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_http_refusals_total 1\n"));
}

TEST(ServerMetrics, PutTimesIntoCumulativeBuckets) {
  ServerMetrics metrics;
  metrics.requestEnded(Target::Cim, 200, 3ms);
  metrics.requestEnded(Target::Cim, 200, 5ms);
  metrics.requestEnded(Target::Cim, 200, 2s);
  metrics.requestEnded(Target::Cim, 500, 61s);
  const std::string text = textOf(metrics);
  const std::string bucket = "zorva_http_request_duration_seconds_bucket{target=\"cim\",le=";
  EXPECT_THAT(text, HasSubstr(bucket + "\"0.0025\"} 0\n"));
  EXPECT_THAT(text, HasSubstr(bucket + "\"0.005\"} 2\n"));
  EXPECT_THAT(text, HasSubstr(bucket + "\"2.5\"} 3\n"));
  EXPECT_THAT(text, HasSubstr(bucket + "\"60\"} 3\n"));
  EXPECT_THAT(text, HasSubstr(bucket + "\"+Inf\"} 4\n"));
  EXPECT_THAT(text, HasSubstr("_count{target=\"cim\"} 4\n"));
  EXPECT_THAT(text, HasSubstr("_sum{target=\"cim\"} 63.008"));
}

TEST(ServerMetrics, LeaveTheTimeOfStreamsOut) {
  ServerMetrics metrics;
  metrics.requestEnded(Target::Stream, 200, 1h);
  const std::string text = textOf(metrics);
  EXPECT_THAT(text, HasSubstr("zorva_http_requests_total{target=\"stream\",code=\"200\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("_count{target=\"cim\"} 0\n"));
  EXPECT_THAT(text, HasSubstr("_count{target=\"page\"} 0\n"));
}

TEST(ServerMetrics, CountOperationsAndWhatFailsInProviders) {
  ServerMetrics metrics;
  metrics.operationEnded("GetInstance", 0);
  metrics.operationEnded("GetInstance", 6);
  metrics.operationEnded("SetDNSServers", 1);
  metrics.providerIsLate();
  const std::string text = textOf(metrics);
  EXPECT_THAT(text, HasSubstr("zorva_cim_operations_total{operation=\"GetInstance\",status=\"6\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_cim_operations_total{operation=\"method\",status=\"1\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_provider_errors_total{kind=\"failed\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_provider_errors_total{kind=\"late\"} 1\n"));
}

TEST(ServerMetrics, HaveNoMoreSeriesHoweverClientsNameTheirOperations) {
  ServerMetrics metrics;
  for (int i = 0; i < 1000; ++i) {
    metrics.operationEnded("Operation" + std::to_string(i), i);
    metrics.requestEnded(Target::Cim, i % 2 == 0 ? 100'000 + i : -i, 1ms);
  }
  const std::string text = textOf(metrics);
  EXPECT_THAT(text, Not(HasSubstr("=\"Operation")));
  EXPECT_LT(text.size(), 10'000U);
}

TEST(ServerMetrics, TellOfTheProcess) {
  Exposition out;
  writeProcess(out, "1.2.3");
  EXPECT_THAT(out.text(), HasSubstr("zorva_build_info{version=\"1.2.3\"} 1\n"));
  for (const char* name : {"process_cpu_seconds_total", "process_resident_memory_bytes", "process_start_time_seconds",
                           "process_open_fds"}) {
    const std::size_t at = out.text().find(std::string("\n") + name + " ");
    ASSERT_NE(at, std::string::npos) << name;
    EXPECT_NE(out.text().substr(at + 2 + std::string(name).size(), 2), "0\n") << name;
  }
}

}  // namespace
}  // namespace zorva::metrics
