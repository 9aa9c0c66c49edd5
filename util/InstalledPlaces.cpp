#include "util/InstalledPlaces.h"

#include <dlfcn.h>
#include <link.h>

#include <filesystem>
#include <system_error>

namespace zorva::util {

namespace {

using std::filesystem::path;

bool isLibraries(const path& name) { return name == "lib" || name == "lib64"; }

/// The prefix that a file in this directory belongs to; empty if the directory has none of the usual names.
path prefixOf(const path& directory) {
  const path name = directory.filename();
  path above = directory.parent_path();
  if (name == "bin" || name == "sbin" || isLibraries(name)) return above;
  return isLibraries(above.filename()) ? above.parent_path() : path();
}

/// Empty if it cannot be told, as for a library that was loaded by a relative path.
std::string ownFile() {
  Dl_info info{};
  link_map* object = nullptr;
  const auto* here = reinterpret_cast<const void*>(&ownFile);
  if (::dladdr1(here, &info, reinterpret_cast<void**>(&object), RTLD_DL_LINKMAP) == 0 || object == nullptr) return {};
  const char* file = *object->l_name == '\0' ? "/proc/self/exe" : object->l_name;
  std::error_code error;
  return std::filesystem::canonical(file, error).string();
}

}  // namespace

InstalledPlaces placesOf(const std::string& file) {
  const path prefix = prefixOf(path(file).parent_path());
  std::error_code ignored;
  if (prefix.empty() || prefix == "/" || prefix == "/usr" ||
      !std::filesystem::is_directory(prefix / "etc/zorvagent", ignored)) {
    return {};
  }
  return {(prefix / "etc/zorvagent/").string(), (prefix / "var/lib/zorvagent/").string()};
}

InstalledPlaces installedPlaces() { return placesOf(ownFile()); }

}  // namespace zorva::util
