#include "agent/interface/PropertyFile.h"

#include <string_view>

#include "agent/files/KeyValues.h"
#include "agent/interface/StringConversion.h"

namespace ZV {

PropertyFile::PropertyFile(const File::Path& path) : path_(path.string()) {}

PropertyFile::~PropertyFile() = default;

bool PropertyFile::open(unsigned long) {
  entries_.clear();
  const auto take = [this](std::string_view key, std::string_view value) {
    entries_.push_back({std::string(key), std::string(value)});
  };
  return zorva::agent::readKeyValues(path_, take) == 0;
}

std::wstring PropertyFile::getValue(const std::wstring& key) const {
  const std::string wanted = make_string(key);
  for (const Entry& entry : entries_) {
    if (entry.key == wanted) return make_wstring(entry.value);
  }
  return {};
}

void PropertyFile::close() { entries_.clear(); }

}  // namespace ZV
