#include "agent/testing/TemporaryDirectory.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <system_error>

namespace zorva::agent::testing {

namespace fs = std::filesystem;

TemporaryDirectory::TemporaryDirectory() : TemporaryDirectory(fs::temp_directory_path().string()) {}

TemporaryDirectory::TemporaryDirectory(const std::string& where) {
  const fs::path base = fs::is_directory(where) ? fs::path(where) : fs::temp_directory_path();
  std::string pattern = base / "zorvagent-XXXXXX";
  if (::mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("no temporary directory can be made");
  path_ = pattern + '/';
}

TemporaryDirectory::~TemporaryDirectory() {
  std::error_code ignored;
  fs::remove_all(path_, ignored);
}

std::string TemporaryDirectory::write(const std::string& name, const std::string& text) const {
  const std::string path = path_ + name;
  fs::create_directories(fs::path(path).parent_path());
  std::ofstream(path, std::ios::binary) << text;
  return path;
}

void TemporaryDirectory::link(const std::string& target, const std::string& name) const {
  const std::string path = path_ + name;
  fs::create_directories(fs::path(path).parent_path());
  fs::create_symlink(target, path);
}

std::string contentsOf(const std::string& path) {
  std::ostringstream text;
  text << std::ifstream(path, std::ios::binary).rdbuf();
  return text.str();
}

}  // namespace zorva::agent::testing
