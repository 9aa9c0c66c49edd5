#include "server/BrokerLog.h"

#include <string>

#include "http/Log.h"

namespace zorva::server {

namespace {

http::Level levelOf(broker::LogLevel level) { return static_cast<http::Level>(level); }

}  // namespace

void logServiceLine(broker::LogLevel level, std::string_view text) noexcept try {
  http::logClientLine(levelOf(level), std::string(text), "service", __FILE__, __LINE__);
} catch (...) {
  // The line is lost, like any line that cannot be written.
}

void logBrokerLine(broker::LogLevel level, std::string_view text) noexcept try {
  if (http::isLogged(levelOf(level))) {
    http::logLine(levelOf(level), std::string(text), "broker", __FILE__, __LINE__);
  }
} catch (...) {
  // The line is lost, like any line that cannot be written.
}

}  // namespace zorva::server
