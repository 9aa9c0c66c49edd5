#pragma once

// A line for each change that a client makes or tries, and for each refusal.

#include <functional>
#include <string>
#include <vector>

#include "access/Role.h"

namespace zorva::access {

struct AuditChange {
  std::string property;  ///< or a method's parameter
  std::string before;    ///< as text; empty where it is not known, as for a parameter
  std::string after;
};

struct AuditRecord {
  std::string user;  ///< as in Client; empty: anonymous
  Proof proof = Proof::None;
  std::string from;       ///< the client's address and port, or what else is known of it
  std::string operation;  ///< "ModifyInstance", "SetDNSServers"; of a request that was refused earlier, its HTTP method
  std::string object;     ///< the text of a path
  std::vector<AuditChange> changes;
  std::string result;      ///< "done", or why not
  bool isRefusal = false;  ///< the client may not do that; anybody can cause such records
};

/// Takes the records. Called on any thread; it must not wait.
using AuditHook = std::function<void(AuditRecord record)>;

/// The record as one line of pairs, without the time:
///
///   user="admin" login=password from="192.0.2.7:40312" operation=ModifyInstance object="root/cimv2:…"
///   change="DomainName: \"a.example\" -> \"b.example\"" result="done"
///
/// Each value is at most 1000 bytes long; what was cut ends with "…". Control characters and quotes are escaped, so no
/// client can add a line or a pair of its own.
std::string auditLine(const AuditRecord& record);

}  // namespace zorva::access
