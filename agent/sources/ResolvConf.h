#pragma once

// What the host's resolver configuration says.

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "agent/tree/Node.h"

namespace zorva::agent {

/// The C library asks no more servers of /etc/resolv.conf.
inline constexpr std::size_t kMostAskedServers = 3;

/// A resolv.conf(5) as glibc takes it, to the letter: a keyword counts at the very beginning of a line and with a blank
/// after it; of "domain" and "search" the last one counts; a line's end is a line feed alone, so that a carriage return
/// belongs to the last word, which is then no address; an IPv4 address may have any form of inet_aton(3).
///
/// Names with control characters are left out, as nobody could show them.
struct ResolvConf {
  StringList servers;   ///< that are asked: the first three, or 127.0.0.1 where the file names none
  StringList notAsked;  ///< what the file names beyond these, up to 256
  StringList search;    ///< from "search" or "domain"; where neither stands, the domain of the host's name
  std::string domain;   ///< from "domain", if that was the last of the two
  StringList options;   ///< that the resolver knows, in its own spelling, with the values that it takes: "ndots:2"
};

/// nodeName is the kernel's name of the host.
ResolvConf parseResolvConf(std::string_view text, std::string_view nodeName);

/// The text with other servers, or with another search list, where they are given. The new lines are in the place of
/// the first old one; all others stay. An empty search list is written as such, because without one the domain of the
/// host's name would be searched.
std::string replaceInResolvConf(std::string_view text, const std::optional<StringList>& servers,
                                const std::optional<StringList>& search);

/// True if the only server is the stub resolver of systemd-resolved. The servers that it asks are in a file of its own.
bool namesOnlyLocalStub(const ResolvConf& conf);

}  // namespace zorva::agent
