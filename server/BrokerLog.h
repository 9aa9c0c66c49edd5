#pragma once

// Writes the lines of the broker and of the CIM operations to the server's log. Thread-safe; nothing here throws.

#include <string_view>

#include "broker/Broker.h"

namespace zorva::server {

/// Takes the broker's lines, and those that providers log through the broker.
void logBrokerLine(broker::LogLevel level, std::string_view text) noexcept;

/// Takes the lines about requests. Clients can cause them, so their rate is limited.
void logServiceLine(broker::LogLevel level, std::string_view text) noexcept;

}  // namespace zorva::server
