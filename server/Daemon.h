#pragma once

#include <functional>
#include <memory>

#include "broker/Broker.h"
#include "server/CommandLine.h"

// The server as a process: its sockets, signals, log, and the word with the service manager.

namespace zorva::server {

/// Makes the broker that answers.
using MakeBroker = std::function<std::unique_ptr<broker::Broker>(const Config&)>;

/// The classes and providers of this project, the libraries from where the configuration says or beside the program.
std::unique_ptr<broker::Broker> makeBuiltInBroker(const Config& config);

/// The whole of main(): reads the arguments, serves until it is told to end, returns the exit status. To be called
/// before the process has other threads.
int runServer(int argc, const char* const* argv, const MakeBroker& makeBroker);

}  // namespace zorva::server
