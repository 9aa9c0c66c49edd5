#pragma once

// The host's tree together with its service processors.

#include <chrono>
#include <functional>
#include <memory>
#include <string>

#include "agent/files/FileWatch.h"
#include "agent/tree/BmcJson.h"
#include "agent/tree/TreeSource.h"

namespace zorva::agent {

/// Adds the nodes of the file that zorva-bmc keeps to the tree of another source. A file that is not there adds none.
/// One that is wrong adds none either, and the reason is logged once. So the host's own tree never depends on it.
///
/// What was read more than ten intervals ago counts as unknown: the nodes then have no enabled state, so that CIM says
/// "Unknown". Their other values stay, with the time at which they were read.
class BmcSource : public TreeSource {
 public:
  using Clock = std::function<std::chrono::system_clock::time_point()>;

  BmcSource(std::shared_ptr<TreeSource> host, std::string file, Clock clock = std::chrono::system_clock::now,
            int comparisons = FileWatch::kComparisons);

  bool changed() override;

  /// Throws what the other source throws.
  std::shared_ptr<const TreeSnapshot> read() override;

  void addWakers(Wakers& wakers) override;

  void reopen() override;

 private:
  bool isUnknown() const;
  void readState();
  std::shared_ptr<const TreeSnapshot> merged() const;
  void addSystem(TreeBuilder& builder, const Node& system) const;

  std::shared_ptr<TreeSource> host_;
  std::string file_;
  Clock clock_;
  int comparisons_;
  FileWatch watch_;
  bool hostChanged_ = true;
  bool fileChanged_ = true;
  std::shared_ptr<const TreeSnapshot> hostTree_;
  BmcState state_;        ///< its tree is null where there is none
  bool unknown_ = false;  ///< in the tree of the last read()
  std::string reported_;  ///< the problem of the file that is in the log already
};

}  // namespace zorva::agent
