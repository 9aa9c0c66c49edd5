#include "agent/Agent.h"
#include "server/Daemon.h"

int main(int argc, char** argv) {
  zorva::agent::askForExceptions();
  return zorva::server::runServer(argc, argv, zorva::server::makeBuiltInBroker);
}
