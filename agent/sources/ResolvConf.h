// What the host's resolver configuration says.
#pragma once

#include <string>
#include <string_view>

#include "agent/tree/Node.h"

namespace zorva::agent {

// The contents of a resolv.conf(5) as the resolver takes them: a keyword counts at the very beginning of a line alone,
// of "domain" and "search" the last one counts, lines that begin with "#" or ";" are comments, a name server that is no
// IPv4 or IPv6 address (with or without a zone) is passed over. Three things are kinder than the resolver: a line may
// end in CRLF, a word that begins with "#" or ";" starts a comment, and name servers past the third, which the resolver
// does not ask, are listed, since the file names them. A search list of "." alone is empty.
struct ResolvConf {
  StringList servers;
  StringList search;   // from "search", or the one domain of "domain"
  std::string domain;  // from "domain", if that was the last of the two
};

ResolvConf parseResolvConf(std::string_view text);

// True where the only servers are the stub that systemd-resolved listens on: whom it asks in turn is told elsewhere.
bool namesOnlyLocalStub(const ResolvConf& conf);

}  // namespace zorva::agent
