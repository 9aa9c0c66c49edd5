#include "agent/files/SettingFiles.h"

#include <dirent.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <string_view>

namespace zorva::agent {

namespace {

constexpr std::string_view kPrefix = "ifcfg-";

bool exists(const std::string& path) {
  struct stat status {};
  return ::stat(path.c_str(), &status) == 0;
}

}  // namespace

std::string settingFileName(std::string_view interface) { return std::string(kPrefix) + std::string(interface); }

bool SettingFiles::has(const std::string& interface) const {
  return std::binary_search(interfaces.begin(), interfaces.end(), interface);
}

SettingFiles findSettingFiles(const std::string& directory) {
  SettingFiles files;
  const std::unique_ptr<DIR, int (*)(DIR*)> open(::opendir(directory.c_str()), ::closedir);
  if (open == nullptr) {
    files.error = errno == ENOENT ? 0 : errno;
    return files;
  }
  while (const dirent* entry = ::readdir(open.get())) {
    const std::string_view name = entry->d_name;
    if (name.size() == kPrefix.size() || !name.starts_with(kPrefix)) continue;
    if (exists(directory + entry->d_name)) files.interfaces.emplace_back(name.substr(kPrefix.size()));
  }
  std::sort(files.interfaces.begin(), files.interfaces.end());
  return files;
}

}  // namespace zorva::agent
