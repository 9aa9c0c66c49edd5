#pragma once

// Addresses, domains and lists of them, as the writers of DNS settings compare and keep them.

#include <string>

#include "agent/tree/Json.h"
#include "agent/tree/Node.h"
#include "util/Expected.h"

namespace zorva::agent {

/// At most 255 bytes of a text of a daemon's or a file's, without characters that disturb a line.
std::string inOneLine(const std::string& text);

/// An address in inet_ntop's form; empty where it is none. A server may have a zone, which stays.
std::string canonicalAddress(const std::string& address);
std::string canonicalServer(const std::string& server);
std::string withoutZone(const std::string& server);
std::string zoneOf(const std::string& server);

/// Why a link cannot have one of these servers, which has another link as its zone; empty where it can have all.
std::string foreignZone(const std::string& interface, const StringList& servers);

std::string withoutFinalDot(const std::string& domain);

bool holds(const StringList& list, const std::string& value);
void addOnce(StringList& list, const std::string& value);

/// What DnsWriter::save() has returned, or why that cannot be read.
Expected<JsonValue, std::string> stateIn(const std::string& saved);

/// The member of that name; empty, or 0, where there is none.
StringList textsIn(const JsonValue& object, const std::string& name);
std::string textIn(const JsonValue& object, const std::string& name);
std::uint64_t numberIn(const JsonValue& object, const std::string& name);

}  // namespace zorva::agent
