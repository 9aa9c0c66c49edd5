#include "settings/InterfaceFile.h"

#include <File.h>
#include <PlatformUtilities.h>
#include <PropertyFile.h>
#include <StringConversion.h>

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>
#include <system_error>
#include <utility>

namespace ZV {

std::string interfaceFileName(const std::string& interfaceName) {
  return std::string(PlatformUtilities::getMaroviaDataDir()) + "ifcfg-" + interfaceName;
}

bool interfaceFileExists(const std::string& fileName) { return File::exists(make_wstring(fileName)); }

namespace {

// Calls take with the value of a key while the reader is open. A reader that did not open has no keys, so its value is
// the empty text too.
template <typename Take>
void readValue(const std::string& fileName, const char* key, Take take) {
  PropertyFile file{File::Path(fileName)};
  file.open(1);
  take(make_string(file.getValue(make_wstring(key))));
  file.close();
}

void split(const std::string& text, std::vector<std::string>& values) {
  std::size_t start = text.find_first_not_of(' ');
  while (start != std::string::npos) {
    const std::size_t end = text.find(' ', start);
    values.push_back(text.substr(start, end - start));
    start = text.find_first_not_of(' ', end);
  }
}

}  // namespace

std::string readScalar(const std::string& fileName, const char* key, const std::string& logger, const LogSite& site,
                       const char* name) {
  std::string value;
  readValue(fileName, key, [&](std::string read) {
    value = std::move(read);
    const std::size_t last = value.find_last_not_of('\n');
    if (last != std::string::npos) value.erase(last + 1);
    logVariable(logger, site, name, value);
  });
  return value;
}

void readList(const std::string& fileName, const char* key, std::vector<std::string>& values) {
  readValue(fileName, key, [&values](const std::string& read) { split(read, values); });
}

namespace {

struct CloseFile {
  void operator()(std::FILE* file) const { std::fclose(file); }
};
using Stream = std::unique_ptr<std::FILE, CloseFile>;

// Opening anything but a regular file could block.
bool isRegularFile(const std::string& fileName) {
  std::error_code error;
  return std::filesystem::is_regular_file(fileName, error);
}

std::string lineOf(const std::string& key, const std::string& value) {
  // Each ends at its first NUL.
  return std::string(key.c_str()) + "=" + value.c_str() + "\n";  // NOLINT(readability-redundant-string-cstr)
}

// Replaces every line that contains the key. For appendAbsent see modifyValue.
void rewrite(const std::string& fileName, const std::string& key, const std::string& value, bool appendAbsent) {
  if (!isRegularFile(fileName)) return;
  Stream in(std::fopen(fileName.c_str(), "r"));
  if (!in) return;
  std::vector<std::string> pieces;
  bool matched = false;
  char buffer[512];
  while (std::fgets(buffer, sizeof buffer, in.get()) != nullptr) {
    const bool matches = std::strstr(buffer, key.c_str()) != nullptr;
    pieces.push_back(matches ? lineOf(key, value) : std::string(buffer));
    matched = matched || matches;
  }
  if (std::ferror(in.get()) != 0) return;  // unread text must not be lost
  in.reset();
  if (!matched && appendAbsent) pieces.push_back(lineOf(key, value));

  const Stream out(std::fopen(fileName.c_str(), "w"));
  if (!out) return;  // the old contents survive
  for (const std::string& piece : pieces) std::fputs(piece.c_str(), out.get());
}

}  // namespace

void modifyValue(std::string fileName, std::string key, std::string value) { rewrite(fileName, key, value, true); }

bool modifyDNSValue(std::string fileName, std::string key, std::string value) {
  logVariable(loggerDNSSettingData, ZV_HERE, "FileName", fileName);
  logVariable(loggerDNSSettingData, ZV_HERE, "propertyName", key);
  logVariable(loggerDNSSettingData, ZV_HERE, "propValue", value);
  rewrite(fileName, key, value, false);
  return true;
}

}  // namespace ZV
