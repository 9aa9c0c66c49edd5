#pragma once

#include <string>
#include <string_view>

#include "broker/Broker.h"

// Where the lines of the broker and of the CIM operations come into the server's log. Thread-safe; nothing here throws.

namespace zorva::server {

/// Takes the broker's lines, and those of the providers that go through it.
void logBrokerLine(broker::LogLevel level, std::string_view text) noexcept;

/// Takes the lines about requests, which clients can bring about.
void logServiceLine(broker::LogLevel level, std::string_view text) noexcept;

/// Takes a line about a change that a client has made. None of them is left out.
void logChange(const std::string& line) noexcept;

}  // namespace zorva::server
