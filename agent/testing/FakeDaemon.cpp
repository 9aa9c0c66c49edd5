#include "agent/testing/FakeDaemon.h"

#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <stdexcept>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent::testing {
namespace {

int answerCall(sd_bus_message* call, void* userdata, sd_bus_error*) {
  std::uint8_t type = 0;
  ::sd_bus_message_get_type(call, &type);
  if (type != SD_BUS_MESSAGE_METHOD_CALL) return 0;
  sd_bus_message* answer = nullptr;
  ::sd_bus_message_new_method_return(call, &answer);
  const auto& fill = *static_cast<const FakeDaemon::Answer*>(userdata);
  if (fill(answer, ::sd_bus_message_get_member(call)) >= 0) {
    ::sd_bus_send(nullptr, answer, nullptr);
  } else {
    ::sd_bus_reply_method_errorf(call, SD_BUS_ERROR_FAILED, "it does not want to");
  }
  ::sd_bus_message_unref(answer);
  return 1;
}

// Tells by the pipe that it is there, and serves until it is killed.
bool serve(const std::string& busName, const FakeDaemon::Answer& answer, int pipe) {
  sd_bus* bus = nullptr;
  if (::sd_bus_open_system(&bus) < 0) return false;
  if (::sd_bus_add_filter(bus, nullptr, &answerCall, const_cast<FakeDaemon::Answer*>(&answer)) < 0) return false;
  if (::sd_bus_request_name(bus, busName.c_str(), 0) < 0 || ::write(pipe, "x", 1) != 1) return false;
  for (;;) {
    if (::sd_bus_process(bus, nullptr) == 0) ::sd_bus_wait(bus, UINT64_MAX);
  }
}

}  // namespace

FakeDaemon::FakeDaemon(const std::string& busName, const Answer& answer) {
  std::array<int, 2> pipe{};
  if (::pipe(pipe.data()) != 0) throw std::runtime_error("no pipe");
  process_ = startChild([&] { return serve(busName, answer, pipe[1]); });
  ::close(pipe[1]);
  char ready = 0;
  const bool runs = ::read(pipe[0], &ready, 1) == 1;
  ::close(pipe[0]);
  if (!runs) throw std::runtime_error(busName + " cannot be imitated");
}

FakeDaemon::~FakeDaemon() {
  ::kill(process_, SIGKILL);
  ::waitpid(process_, nullptr, 0);
}

}  // namespace zorva::agent::testing
