#pragma once

// A tree from a JSON document, for demonstrations and tests.

#include <string>

#include "agent/files/FileWatch.h"
#include "agent/tree/TreeSource.h"

namespace zorva::agent {

class FileSource : public TreeSource {
 public:
  /// comparisons is the number of comparisons of the file before it is watched.
  explicit FileSource(std::string path, int comparisons = FileWatch::kComparisons);

  bool changed() override;

  /// Throws ConfigError if the document is wrong or cannot be read.
  std::shared_ptr<const TreeSnapshot> read() override;

  void addWakers(Wakers& wakers) override;

  void reopen() override;

 private:
  std::string path_;
  int comparisons_;
  FileWatch watch_;
};

}  // namespace zorva::agent
