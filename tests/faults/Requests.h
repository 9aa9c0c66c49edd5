// Every request that a server can make of the twelve providers, on each of three hosts.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "ProviderCall.h"

namespace ZV::Test {

// One of the twelve providers, as a server knows it.
struct Provider {
  const char* prefix;  // of its create functions
  const char* className;
  InstanceProvider::Create createInstanceMI;
  AssociationProvider::Create createAssociationMI = nullptr;  // null if it has none
  MethodProvider::Create createMethodMI = nullptr;            // null if it has none
  // For an association: its two references and an object of each end on the host with interfaces. For others: an object
  // of the class.
  const char* leftRole = nullptr;
  Path left = {};
  const char* rightRole = nullptr;
  Path right = {};
  Instance change = {};  // the changes of a modification; without properties if the class refuses it

  bool isAssociation() const { return createAssociationMI != nullptr; }
  // An object of the class: the association of its two ends, or the object that left names.
  Path object() const;
};

const std::vector<Provider>& allProviders();

enum class Kind { Read, Modify, Method, Refused };

struct Request {
  std::string name;  // its name in a failure: "Associators of ZORVA_DNSProtocolEndPoint"
  Kind kind = Kind::Read;
  std::function<Outcome(RecordingBroker& broker)> run;
};

// The requests that a provider accepts; for each one the provider's create function is called again, for that broker.
std::vector<Request> requestsOf(const Provider& provider);

}  // namespace ZV::Test
