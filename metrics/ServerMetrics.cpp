#include "metrics/ServerMetrics.h"

#include <dirent.h>
#include <sys/resource.h>
#include <sys/sysinfo.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <memory>
#include <string>

#include "util/ReadFile.h"

namespace zorva::metrics {

namespace {

/// The operations of DSP0200; the last name is for all others.
constexpr std::string_view kOperations[] = {"GetClass",
                                            "EnumerateClasses",
                                            "EnumerateClassNames",
                                            "GetInstance",
                                            "DeleteInstance",
                                            "CreateInstance",
                                            "ModifyInstance",
                                            "EnumerateInstances",
                                            "EnumerateInstanceNames",
                                            "ExecQuery",
                                            "Associators",
                                            "AssociatorNames",
                                            "References",
                                            "ReferenceNames",
                                            "GetProperty",
                                            "SetProperty",
                                            "EnumerateQualifiers",
                                            "GetQualifier",
                                            "OpenEnumerateInstances",
                                            "OpenEnumerateInstancePaths",
                                            "OpenReferenceInstances",
                                            "OpenReferenceInstancePaths",
                                            "OpenAssociatorInstances",
                                            "OpenAssociatorInstancePaths",
                                            "PullInstancesWithPath",
                                            "PullInstancePaths",
                                            "CloseEnumeration",
                                            "method"};
constexpr std::size_t kMethod = std::size(kOperations) - 1;

constexpr int kFailed = 1;       // CIM_ERR_FAILED
constexpr int kLastStatus = 29;  // of DSP0200; higher ones count as one

const char* wordOf(Target target) noexcept {
  switch (target) {
    case Target::Cim:
      return "cim";
    case Target::Page:
      return "page";
    case Target::Stream:
      break;
  }
  return "stream";
}

/// A status that HTTP does not know comes from no code of this server.
int knownStatus(int status) noexcept { return status >= 100 && status < 600 ? status : 0; }

bool isRefusal(int status) noexcept { return status == 401 || status == 403 || status == 503; }

}  // namespace

void ServerMetrics::requestEnded(Target target, int status, std::chrono::microseconds time) {
  const double seconds = std::chrono::duration<double>(time).count();
  const std::lock_guard lock(mutex_);
  ++requests_[{target, knownStatus(status)}];
  if (isRefusal(status)) ++refusals_;
  if (target == Target::Stream) return;
  Histogram& histogram = times_[target == Target::Cim ? 0 : 1];
  const auto bucket = std::lower_bound(kBounds.begin(), kBounds.end(), seconds);
  if (bucket != kBounds.end()) ++histogram.counts[static_cast<std::size_t>(bucket - kBounds.begin())];
  ++histogram.total;
  histogram.seconds += seconds;
}

void ServerMetrics::operationEnded(std::string_view operation, int status) {
  const auto* known = std::find(std::begin(kOperations), std::end(kOperations) - 1, operation);
  const auto index = static_cast<std::size_t>(known - std::begin(kOperations));
  const std::lock_guard lock(mutex_);
  ++operations_[{index, status >= 0 && status <= kLastStatus ? status : kLastStatus + 1}];
  if (status == kFailed) ++failures_;
}

void ServerMetrics::providerIsLate() {
  const std::lock_guard lock(mutex_);
  ++late_;
}

void ServerMetrics::write(Exposition& out) const {
  const std::lock_guard lock(mutex_);
  writeRequests(out);
  writeTimes(out);
  writeOperations(out);
}

void ServerMetrics::writeRequests(Exposition& out) const {
  out.family("zorva_http_requests_total", Type::Counter, "HTTP requests that were answered, by what they were for.");
  for (const auto& [key, count] : requests_) {
    out.sample({{"target", wordOf(key.first)}, {"code", std::to_string(key.second)}}, static_cast<double>(count));
  }
  out.single("zorva_http_refusals_total", Type::Counter,
             "Requests that were refused: no login, no right, or no room for them.", static_cast<double>(refusals_));
}

void ServerMetrics::writeTimes(Exposition& out) const {
  out.family("zorva_http_request_duration_seconds", Type::Histogram,
             "Time from a request's first line to the end of its response.");
  for (const Target target : {Target::Cim, Target::Page}) {
    const Histogram& histogram = times_[target == Target::Cim ? 0 : 1];
    const char* word = wordOf(target);
    std::uint64_t below = 0;
    for (std::size_t i = 0; i < kBounds.size(); ++i) {
      below += histogram.counts[i];
      char bound[32];
      std::snprintf(bound, sizeof bound, "%g", kBounds[i]);
      out.sample("_bucket", {{"target", word}, {"le", bound}}, static_cast<double>(below));
    }
    out.sample("_bucket", {{"target", word}, {"le", "+Inf"}}, static_cast<double>(histogram.total));
    out.sample("_sum", {{"target", word}}, histogram.seconds);
    out.sample("_count", {{"target", word}}, static_cast<double>(histogram.total));
  }
}

void ServerMetrics::writeOperations(Exposition& out) const {
  out.family("zorva_cim_operations_total", Type::Counter,
             "CIM operations by their name and CIM status; 0 is success, 30 any status that DSP0200 does not have.");
  for (const auto& [key, count] : operations_) {
    out.sample({{"operation", kOperations[std::min(key.first, kMethod)]}, {"status", std::to_string(key.second)}},
               static_cast<double>(count));
  }
  out.family("zorva_provider_errors_total", Type::Counter,
             "Operations that failed in a provider (CIM_ERR_FAILED), and providers that did not return in time.");
  out.sample({{"kind", "failed"}}, static_cast<double>(failures_));
  out.sample({{"kind", "late"}}, static_cast<double>(late_));
}

namespace {

double secondsOf(const timeval& time) {
  return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) / 1e6;
}

/// The fields of /proc/self/stat after the name of the program, which may have blanks: the state is the first.
std::string statField(std::size_t index) {
  constexpr std::size_t kMost = 4096;
  const std::string text = util::readFile("/proc/self/stat", kMost).text;
  std::size_t begin = text.rfind(')');
  for (std::size_t i = 0; begin != std::string::npos && i <= index; ++i) begin = text.find(' ', begin + 1);
  if (begin == std::string::npos) return {};
  return text.substr(begin + 1, text.find(' ', begin + 1) - begin - 1);
}

double numberField(std::size_t index) {
  try {
    return std::stod(statField(index));
  } catch (const std::exception&) {
    return 0;
  }
}

/// Computed once: the result must not jitter with the clock.
double startTime() {
  constexpr std::size_t kStart = 19;
  static const double start = [] {
    timespec now{};
    timespec sinceBoot{};
    ::clock_gettime(CLOCK_REALTIME, &now);
    ::clock_gettime(CLOCK_BOOTTIME, &sinceBoot);
    const double boot = static_cast<double>(now.tv_sec - sinceBoot.tv_sec);
    return boot + numberField(kStart) / static_cast<double>(::sysconf(_SC_CLK_TCK));
  }();
  return start;
}

std::size_t openDescriptors() {
  const std::unique_ptr<DIR, int (*)(DIR*)> open(::opendir("/proc/self/fd"), ::closedir);
  std::size_t count = 0;
  while (open != nullptr && ::readdir(open.get()) != nullptr) ++count;
  constexpr std::size_t kOwn = 3;  // "." and "..", and the directory itself
  return count > kOwn ? count - kOwn : 0;
}

}  // namespace

void writeProcess(Exposition& out, std::string_view version) {
  constexpr std::size_t kResidentPages = 21;
  rusage used{};
  ::getrusage(RUSAGE_SELF, &used);
  out.family("zorva_build_info", Type::Gauge, "The version of the server.");
  out.sample({{"version", version}}, 1);
  out.single("process_cpu_seconds_total", Type::Counter, "Processor time of the server.",
             secondsOf(used.ru_utime) + secondsOf(used.ru_stime));
  out.single("process_resident_memory_bytes", Type::Gauge, "Resident memory of the server.",
             numberField(kResidentPages) * static_cast<double>(::sysconf(_SC_PAGESIZE)));
  out.single("process_start_time_seconds", Type::Gauge, "Start of the server, in seconds since 1970.", startTime());
  out.single("process_open_fds", Type::Gauge, "Open file descriptors.", static_cast<double>(openDescriptors()));
}

}  // namespace zorva::metrics
