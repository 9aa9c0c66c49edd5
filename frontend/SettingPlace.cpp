#include "frontend/SettingPlace.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <exception>

#include "agent/Agent.h"
#include "agent/files/SettingFiles.h"
#include "frontend/SettingsClaims.h"
#include "util/Names.h"
#include "util/ReadFile.h"

namespace zorva::frontend {

namespace {

struct FileSetting {
  std::string_view className;
  std::string_view property;
  const char* key;
};

constexpr FileSetting kFileSettings[] = {
    {kSettingClass, "RequestedHostname", "HOSTNAME"},
    {kSettingClass, "DomainName", "DOMAINNAME"},
    {kSettingClass, "DNSServerAddresses", "DNSSERVERS"},
    {kSettingClass, "ConfigurationName", "CONFIG_NAME"},
    {kGeneralSettingClass, "DNSSuffixesToAppend", "DNSSUFFIXES"},
    {kGeneralSettingClass, "ConfigurationName", "CONFIG_NAME"},
};

bool exists(const std::string& path) {
  struct stat status {};
  return ::stat(path.c_str(), &status) == 0;
}

/// Why the existing file `path` cannot be written.
std::optional<std::string> writingProblem(const std::string& path) {
  if (::faccessat(AT_FDCWD, path.c_str(), W_OK, AT_EACCESS) != 0) {
    return path + " cannot be written: " + std::strerror(errno);
  }
  struct statvfs disk {};
  if (::statvfs(path.c_str(), &disk) == 0 && (::geteuid() == 0 ? disk.f_bfree : disk.f_bavail) == 0) {
    return "the disk of " + path + " is full";
  }
  return std::nullopt;
}

std::optional<std::string> missingDirectory() {
  const std::string directory = zorva::agent::dataDirectory();
  if (exists(directory)) return std::nullopt;
  return "the data directory " + directory + " does not exist";
}

std::string fileOf(const std::string& interface) {
  return zorva::agent::dataDirectory() + zorva::agent::settingFileName(interface);
}

std::optional<std::string> fileAbsence(const std::string& interface) {
  if (interface.empty()) return "the interface has no name, and so no file";
  if (auto problem = missingDirectory()) return problem;
  const std::string path = fileOf(interface);
  if (exists(path)) return std::nullopt;
  return path + " does not exist; 'zorvactl ifcfg init " + interface + "' makes it, then repeat this";
}

std::optional<std::string> lineProblem(const std::string& interface, std::string_view key) {
  constexpr std::size_t kLargestFile = std::size_t{16} << 20U;
  const std::string path = fileOf(interface);
  const zorva::util::FileText file = zorva::util::readFile(path, kLargestFile);
  if (file.error != 0) return path + ": " + zorva::util::fileErrorText(file.error);
  if (file.truncated) return path + " is larger than 16 MiB";
  // If the disk is full, the line may be missing for that reason.
  if (auto problem = writingProblem(path)) return problem;
  // The providers look for the key anywhere in a line.
  if (file.text.find(key) != std::string::npos) return std::nullopt;
  return path + " has no line " + std::string(key) + "=; add it, or let 'zorvactl ifcfg init " + interface +
         " --force' write all six, then repeat this";
}

std::string interfaceOf(const broker::Instance& instance) {
  if (util::sameName(instance.path.className, kGeneralSettingClass)) {
    return interfaceOfHostSettings(*zorva::agent::currentTree()).value_or("");
  }
  const broker::Value* id = instance.property("InstanceID");
  if (id == nullptr) id = instance.path.key("InstanceID");
  return id == nullptr ? std::string() : interfaceOfId(id->asText());
}

}  // namespace

const char* settingKey(std::string_view className, std::string_view property) noexcept {
  const auto found = std::find_if(std::begin(kFileSettings), std::end(kFileSettings), [&](const FileSetting& each) {
    return util::sameName(className, each.className) && util::sameName(each.property, property);
  });
  return found == std::end(kFileSettings) ? nullptr : found->key;
}

std::optional<std::string> missingPlace(const broker::Instance& instance, std::string_view property) {
  try {
    if (const char* key = settingKey(instance.path.className, property)) {
      const std::string interface = interfaceOf(instance);
      const auto absence = fileAbsence(interface);
      return absence ? absence : lineProblem(interface, key);
    }
    if (!util::sameName(instance.path.className, kEndpointClass)) return std::nullopt;
    const auto absence = missingDirectory();
    return absence ? absence : writingProblem(zorva::agent::dataDirectory());
  } catch (const std::exception& problem) {  // the configuration or the tree cannot be read
    return problem.what();
  }
}

std::optional<std::string> missingFile(const broker::Instance& instance, std::string_view property) {
  try {
    if (settingKey(instance.path.className, property) == nullptr) return std::nullopt;
    return fileAbsence(interfaceOf(instance));
  } catch (const std::exception& problem) {
    return problem.what();
  }
}

}  // namespace zorva::frontend
