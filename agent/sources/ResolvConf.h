#pragma once

// The host's resolver configuration.

#include <string>
#include <string_view>

#include "agent/tree/Node.h"

namespace zorva::agent {

/// The contents of a resolv.conf(5) as the resolver reads them. A keyword counts only at the very beginning of a line.
/// Of "domain" and "search" the last one counts. Lines that begin with "#" or ";" are comments. A name server that is
/// no IPv4 or IPv6 address (with or without a zone) is skipped. In three points the reader accepts more than the
/// resolver: a line may end in CRLF; a word that begins with "#" or ";" starts a comment; and name servers after the
/// third, which the resolver does not use, are listed, because the file names them. A search list that is only "." is
/// empty.
struct ResolvConf {
  StringList servers;
  StringList search;   ///< from "search", or the one domain of "domain"
  std::string domain;  ///< from "domain", if that was the last of the two
};

ResolvConf parseResolvConf(std::string_view text);

/// True if the only server is the stub on which systemd-resolved listens: its own servers are in another file.
bool namesOnlyLocalStub(const ResolvConf& conf);

}  // namespace zorva::agent
