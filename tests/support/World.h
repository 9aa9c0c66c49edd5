#pragma once

// A host for a test: an instrumentation tree written in a line or two, and its own data directory.

#include <cstddef>
#include <functional>
#include <initializer_list>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "agent/Seams.h"
#include "agent/tree/TreeSnapshot.h"
#include "util/NotCopied.h"

namespace ZV::Test {

/// A list that may be absent: {"a", "b"} and noTexts() are present; if left out it is absent.
class OptionalTexts {
 public:
  OptionalTexts() = default;
  OptionalTexts(std::initializer_list<std::string> texts) : texts_(texts) {}
  OptionalTexts(std::vector<std::string> texts) : texts_(std::move(texts)) {}
  bool given() const { return texts_.has_value(); }
  const std::vector<std::string>& texts() const { return *texts_; }

 private:
  std::optional<std::vector<std::string>> texts_;
};
inline OptionalTexts noTexts() { return std::vector<std::string>(); }

/// The properties of an interface's configuration. Properties that are left out are absent from the node, except the
/// name, which is that of the interface, unless isUnnamed.
struct NicProperties {
  std::optional<std::string> name = {};
  std::optional<std::string> hostName = {};
  std::optional<std::string> domain = {};
  OptionalTexts suffixes = {};
  OptionalTexts servers = {};
  std::optional<unsigned int> ifType = {};
  std::optional<unsigned int> state = {};  ///< as the agent has it: 1 up with carrier, 12 without, 16 down
  bool isUnnamed = false;
  std::vector<zorva::agent::InterfaceAddress> addresses = {};
};

/// An interface that has everything: host1 in example.org, one suffix, one server, up with carrier.
NicProperties usualNic();

/// Once installed, it is the host that the agent of this process sees, until the next one is installed or it is
/// destroyed:
///
///   World world;
///   world.host("host1").nic("eth0", {.domain = "example.org", .servers = {"192.0.2.53"}}).bmc().nic("bmc0").install();
///   world.file("eth0", "DOMAINNAME=lab.example.org\n");
///
/// The destructor resets the agent, except for an active RecordingLogger, and removes the data directory. One at a
/// time.
class World : zorva::util::NotCopied {
 public:
  /// A host without nodes, named host1, with an empty data directory.
  World();
  ~World();

  /// A system's node; interfaces that are added after it belong to it. host also names the managed system.
  World& host(const std::string& name = "host1", const std::string& description = "Computer");
  World& bmc();
  World& system(const std::string& nodeName, const std::string& description);

  /// An interface of the latest system, which is a plain host if none was named. Several may have one name.
  World& nic(const std::string& name, const NicProperties& properties = {});

  /// Makes this the host that the agent sees. Called again after changes, it replaces the tree.
  World& install();
  /// Installs a source of trees that throws a std::runtime_error with this text.
  World& installUnreadable(const std::string& reason = "the tree cannot be read");

  std::shared_ptr<const zorva::agent::TreeSnapshot> tree() const;
  /// The current properties of the n-th interface's node, read through the agent, including values that were set. Empty
  /// or no value if the property is absent.
  std::optional<std::string> text(std::size_t nic, zorva::agent::PropertyNumber property) const;
  std::optional<std::vector<std::string>> list(std::size_t nic, zorva::agent::PropertyNumber property) const;

  const std::string& dataDir() const { return dataDir_; }  ///< ends in a slash
  std::string filePath(const std::string& nic) const { return dataDir_ + "ifcfg-" + nic; }
  World& file(const std::string& nic, const std::string& content);
  /// The file's bytes; no value if there is none.
  std::optional<std::string> fileContent(const std::string& nic) const;

 private:
  struct Nic {
    std::size_t system;
    std::string name;
    NicProperties properties;
  };
  struct System {
    std::string name;
    std::string description;
  };

  void useConfig() const;
  const zorva::agent::Node* nodeOf(const zorva::agent::TreeSnapshot& snapshot, std::size_t nic) const;

  std::string systemName_ = "host1";
  std::vector<System> systems_;
  std::vector<Nic> nics_;
  std::string dataDir_;
  bool installed_ = false;
};

/// What a failing tree throws: an exception derived from std::exception, or an int.
enum class Thrown { StdException, Int };

/// Makes one call of the tree's cursors fail, the n-th from now on, counted from 1, or only counts them if n is 0. One
/// at a time.
class FailingTree : private zorva::agent::TreeCallHook, zorva::util::NotCopied {
 public:
  explicit FailingTree(std::size_t n = 0, Thrown thrown = Thrown::StdException);
  ~FailingTree() override;

  std::size_t callCount() const { return calls().size(); }
  std::vector<zorva::agent::TreeCall> calls() const;
  bool hasThrown() const { return n_ != 0 && callCount() >= n_; }

 private:
  void before(zorva::agent::TreeCall call) override;

  std::size_t n_;
  Thrown thrown_;
  mutable std::mutex mutex_;
  std::vector<zorva::agent::TreeCall> calls_;
};

/// Repeats the operation with the tree failing at its 1st call, its 2nd, and so on, in both ways, until the operation
/// makes no further call. The operation must catch its exceptions. Returns the number of failures tried.
std::size_t forEachTreeFailure(const std::function<void(std::size_t n, Thrown thrown)>& operation);

}  // namespace ZV::Test
