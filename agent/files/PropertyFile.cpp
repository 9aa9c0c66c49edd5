#include "agent/interface/PropertyFile.h"

#include <string_view>

#include "agent/files/Lines.h"
#include "agent/interface/StringConversion.h"
#include "util/ReadFile.h"

namespace ZV {
namespace {

// Far more than any interface file has; a larger file is no settings file.
constexpr std::size_t kLargestFile = std::size_t{4} << 20;

}  // namespace

PropertyFile::PropertyFile(const File::Path& path) : path_(path.string()) {}

PropertyFile::~PropertyFile() = default;

bool PropertyFile::open(unsigned long) {
  entries_.clear();
  const zorva::util::FileText file = zorva::util::readFile(path_, kLargestFile);
  if (file.error != 0 || file.truncated) return false;
  for (std::string_view rest = file.text; !rest.empty();) {
    const std::string_view line = zorva::agent::takeLine(rest);
    const std::size_t split = line.find('=');
    if (line.starts_with('#') || split == std::string_view::npos) continue;
    entries_.push_back({std::string(line.substr(0, split)), std::string(line.substr(split + 1))});
  }
  return true;
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
