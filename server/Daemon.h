#pragma once

// The server as a process: its sockets, signals, log, and messages to the service manager.

#include <functional>
#include <memory>

#include "broker/Broker.h"
#include "server/CommandLine.h"

namespace zorva::server {

/// Makes the broker that serves the requests.
using MakeBroker = std::function<std::unique_ptr<broker::Broker>(const Config&)>;

/// The classes and providers of this project. The libraries are in the configured directory or beside the program.
std::unique_ptr<broker::Broker> makeBuiltInBroker(const Config& config);

/// The whole of main(): reads the arguments, serves until a signal ends it, returns the exit status. Call it before the
/// process has other threads.
int runServer(int argc, const char* const* argv, const MakeBroker& makeBroker);

}  // namespace zorva::server
