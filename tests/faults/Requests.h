// Every request that a server can make of the twelve providers, on each of three hosts.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "ProviderCall.h"

namespace ZV::Test {

// One of the twelve, as a server knows it.
struct Provider {
  const char* prefix;  // of its create functions
  const char* className;
  InstanceProvider::Create createInstanceMI;
  AssociationProvider::Create createAssociationMI = nullptr;  // null where it has none
  MethodProvider::Create createMethodMI = nullptr;            // null where it has none
  // Of an association: its two references and an object of each end on the host with interfaces. Of the others: an
  // object of the class.
  const char* leftRole = nullptr;
  Path left = {};
  const char* rightRole = nullptr;
  Path right = {};
  Instance change = {};  // what a modification asks for; without properties where the class refuses it

  bool isAssociation() const { return createAssociationMI != nullptr; }
  // An object of the class: the association of its two ends, or the object that left names.
  Path object() const;
};

const std::vector<Provider>& allProviders();

enum class Kind { Read, Modify, Method, Refused };

struct Request {
  std::string name;  // as a failure tells it: "Associators of ZORVA_DNSProtocolEndPoint"
  Kind kind = Kind::Read;
  std::function<Outcome(RecordingBroker& broker)> run;
};

// The requests that a provider takes; each is made with the provider's create function called anew, for that broker.
std::vector<Request> requestsOf(const Provider& provider);

}  // namespace ZV::Test
