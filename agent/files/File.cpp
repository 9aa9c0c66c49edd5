#include "agent/interface/File.h"

#include <sys/stat.h>

#include "agent/interface/StringConversion.h"

namespace ZV::File {

Path::Path(const std::string& path) : path_(path) {}

const std::string& Path::string() const { return path_; }

bool exists(const std::wstring& path) {
  const std::string narrow = make_string(path);
  // A NUL would cut the path short and name another file.
  if (narrow.find('\0') != std::string::npos) return false;
  struct stat status {};
  return ::stat(narrow.c_str(), &status) == 0;
}

}  // namespace ZV::File
