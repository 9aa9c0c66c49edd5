#include "agent/sources/FileSource.h"

#include <utility>

#include "agent/tree/TreeJson.h"

namespace zorva::agent {

FileSource::FileSource(std::string path) : path_(std::move(path)) {}

bool FileSource::changed() { return watch_.changed(); }

std::shared_ptr<const TreeSnapshot> FileSource::read() {
  watch_.watch({path_});
  return treeFromJsonValue(readJsonFile(path_), path_);
}

void FileSource::reopen() { watch_ = FileWatch(); }

}  // namespace zorva::agent
