#pragma once

// What a client may do.

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <string_view>

#include "util/Names.h"

namespace zorva::access {

/// Each role includes those before it.
enum class Role : std::uint8_t {
  None,
  Read,     ///< all operations that only read
  Operate,  ///< also changes of instances, and methods
};

/// The role of a client in each namespace.
class Grants {
 public:
  explicit Grants(Role everywhere = Role::None) : everywhere_(everywhere) {}

  /// The role in one namespace, instead of the one that counts everywhere.
  void set(std::string nameSpace, Role role) { byNameSpace_[std::move(nameSpace)] = role; }

  Role everywhere() const noexcept { return everywhere_; }

  using ByNameSpace = std::map<std::string, Role, util::NameLess>;
  const ByNameSpace& byNameSpace() const noexcept { return byNameSpace_; }

  bool operator==(const Grants&) const = default;

  /// Names of namespaces are compared without regard to case.
  Role in(std::string_view nameSpace) const {
    const auto found = byNameSpace_.find(nameSpace);
    return found == byNameSpace_.end() ? everywhere_ : found->second;
  }

 private:
  Role everywhere_;
  ByNameSpace byNameSpace_;
};

/// How the server knows who a client is.
enum class Proof : std::uint8_t {
  None,         ///< it does not: the client is anonymous
  Kernel,       ///< the kernel told the user of the client's process
  Password,     ///< HTTP Basic over TLS
  Certificate,  ///< a client certificate
};

/// A client that was let in.
struct Client {
  std::string user;  ///< empty: anonymous
  Proof proof = Proof::None;
  Grants grants;
};

using ClientPtr = std::shared_ptr<const Client>;

}  // namespace zorva::access
