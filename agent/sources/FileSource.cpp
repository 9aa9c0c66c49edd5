#include "agent/sources/FileSource.h"

#include <utility>

#include "agent/tree/TreeJson.h"

namespace zorva::agent {

FileSource::FileSource(std::string path, int comparisons)
    : path_(std::move(path)), comparisons_(comparisons), watch_(comparisons) {}

bool FileSource::changed() { return watch_.changed(); }

std::shared_ptr<const TreeSnapshot> FileSource::read() {
  watch_.watch({path_});
  return treeFromJsonValue(readJsonFile(path_), path_);
}

void FileSource::addWakers(Wakers& wakers) { wakers.addOrLook(watch_.descriptor()); }

void FileSource::reopen() { watch_ = FileWatch(comparisons_); }

}  // namespace zorva::agent
