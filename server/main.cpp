#include "server/Daemon.h"

int main(int argc, char** argv) { return zorva::server::runServer(argc, argv, zorva::server::makeBuiltInBroker); }
