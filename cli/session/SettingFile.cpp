#include "cli/session/SettingFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <utility>

#include "agent/Agent.h"
#include "agent/files/SettingFiles.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "util/FileDescriptor.h"
#include "util/ReadFile.h"
#include "util/ReplaceFile.h"

namespace zorva::cli {

namespace {

constexpr const char* kListHint = "zorvactl ifcfg list shows the files that there are";
constexpr std::size_t kLargestFile = std::size_t{16} << 20U;

[[noreturn]] void fail(const std::string& path, const std::string& what, const std::string& hint = {}) {
  throw Failure(ExitCode::Failed, printable(path) + ": " + what, hint);
}

/// A temporary file beside the final one; removed unless it has replaced that one.
class DraftFile {
 public:
  explicit DraftFile(const std::string& target)
      : path_(target + ".XXXXXX"), descriptor_(::mkostemp(path_.data(), O_CLOEXEC)) {
    if (descriptor_) return;
    const int error = errno;
    fail(target, std::string("cannot be written: ") + std::strerror(error),
         error == ENOENT ? "make the data directory, or name another: data_dir in the agent's configuration" : "");
  }
  ~DraftFile() { ::unlink(path_.c_str()); }
  DraftFile(const DraftFile&) = delete;
  DraftFile& operator=(const DraftFile&) = delete;

  const std::string& path() const noexcept { return path_; }

  /// Writes the whole text to the disk. False with errno if that fails.
  bool fill(std::string_view text) const {
    util::giveToOwnerOfDirectory(descriptor_, path_);
    const std::string folder = path_.substr(0, path_.rfind('/') + 1);
    return util::writeAll(descriptor_, text) && ::fchmod(descriptor_.get(), util::rightsIn(folder)) == 0 &&
           ::fsync(descriptor_.get()) == 0;
  }

 private:
  std::string path_;
  util::FileDescriptor descriptor_;
};

void requireLine(const std::string& path, const SettingLine& line) {
  const bool isBroken = std::any_of(line.value.begin(), line.value.end(),
                                    [](char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7F; });
  if (isBroken) fail(path, line.key + " would hold control characters: '" + printable(line.value) + "'");
}

std::string listText(const zorva::agent::StringList* list) {
  std::string text;
  // As the providers write lists: a blank after every element.
  if (list != nullptr) {
    for (const std::string& element : *list) text += element + " ";
  }
  return text;
}

std::string textOr(const std::string* text) { return text == nullptr ? std::string() : *text; }

const char* bootProtocol(const zorva::agent::AddressList& addresses) {
  const auto from = [&addresses](zorva::agent::AddressOrigin origin) {
    return std::any_of(addresses.begin(), addresses.end(),
                       [origin](const auto& each) { return each.origin == origin; });
  };
  if (from(zorva::agent::AddressOrigin::Dhcp)) return "dhcp";
  return from(zorva::agent::AddressOrigin::Static) ? "static" : "none";
}

}  // namespace

SettingFile::SettingFile(const std::string& interface)
    : path_(zorva::agent::dataDirectory() + zorva::agent::settingFileName(interface)) {
  if (interface.empty() || interface.find('/') != std::string::npos || interface.find('\0') != std::string::npos) {
    throw Failure(ExitCode::WrongUsage, "'" + printable(interface) + "' cannot be the name of an interface");
  }
}

std::string SettingFile::contents() const {
  zorva::util::FileText file = zorva::util::readFile(path_, kLargestFile);
  if (file.error == EINVAL) fail(path_, "is no regular file");
  if (file.error != 0) {
    fail(path_, std::strerror(file.error), file.error == ENOENT ? "zorvactl ifcfg init makes it" : "");
  }
  if (file.truncated) fail(path_, "is larger than 16 MiB");
  return std::move(file.text);
}

std::vector<SettingLine> SettingFile::read() const {
  const std::string text = contents();
  std::vector<SettingLine> lines;
  for (std::size_t at = 0; at < text.size();) {
    const std::size_t end = std::min(text.find('\n', at), text.size());
    std::string_view line = std::string_view(text).substr(at, end - at);
    at = end + 1;
    if (line.ends_with('\r')) line.remove_suffix(1);
    const std::size_t equals = line.find('=');
    if (equals == std::string_view::npos || line.starts_with('#')) continue;
    lines.push_back({std::string(line.substr(0, equals)), std::string(line.substr(equals + 1))});
  }
  return lines;
}

void SettingFile::write(const std::vector<SettingLine>& lines, bool replaces) const {
  std::string text;
  for (const SettingLine& line : lines) {
    requireLine(path_, line);
    text += line.key + "=" + line.value + "\n";
  }
  struct stat status {};
  if (replaces && ::lstat(path_.c_str(), &status) == 0 && !S_ISREG(status.st_mode)) {
    fail(path_, "is no regular file, and is left as it is");
  }
  const DraftFile draft(path_);
  if (!draft.fill(text)) fail(path_, std::string("cannot be written: ") + std::strerror(errno));
  // A link never replaces an existing file.
  const int placed =
      replaces ? ::rename(draft.path().c_str(), path_.c_str()) : ::link(draft.path().c_str(), path_.c_str());
  if (placed != 0) {
    const int error = errno;
    fail(path_, error == EEXIST ? "exists already" : std::string("cannot be written: ") + std::strerror(error),
         error == EEXIST ? "--force puts a new file in its place" : "");
  }
  syncFolder();
}

bool SettingFile::exists() const {
  struct stat status {};
  return ::lstat(path_.c_str(), &status) == 0;
}

void SettingFile::remove() const {
  if (::unlink(path_.c_str()) != 0) fail(path_, std::string("cannot be removed: ") + std::strerror(errno), kListHint);
  syncFolder();
}

void SettingFile::moveTo(const SettingFile& other) const {
  if (::renameat2(AT_FDCWD, path_.c_str(), AT_FDCWD, other.path_.c_str(), RENAME_NOREPLACE) != 0) {
    const int error = errno;
    if (error == EEXIST) fail(other.path_, "exists already, and is left as it is", "zorvactl ifcfg show shows it");
    fail(path_, std::string("cannot become ") + printable(other.path_) + ": " + std::strerror(error), kListHint);
  }
  syncFolder();
}

void SettingFile::syncFolder() const { util::syncDirectory(path_.substr(0, path_.rfind('/') + 1)); }

std::vector<SettingLine> settingsOfHost(const zorva::agent::Node& interface) {
  using namespace ZV::NodeLexicon;
  return {{"BOOTPROTO", bootProtocol(interface.addresses())},
          {"HOSTNAME", textOr(interface.text(PROP_HOST_NAME))},
          {"DOMAINNAME", textOr(interface.text(PROP_DOMAIN_NAME))},
          {"CONFIG_NAME", ""},
          {"DNSSERVERS", listText(interface.list(PROP_DNS_SERVER_ADDRESSES))},
          {"DNSSUFFIXES", listText(interface.list(PROP_DNS_SUFFIXES))}};
}

const zorva::agent::Node& interfaceNode(const zorva::agent::TreeSnapshot& tree, const std::string& interface) {
  std::vector<std::string> names;
  for (const zorva::agent::Node& node : tree.nodes()) {
    if (node.type() != zorva::agent::NodeType::NetworkIPConfig) continue;
    const std::string* name = node.text(ZV::NodeLexicon::PROP_NAME);
    if (name != nullptr && *name == interface) return node;
    if (name != nullptr) names.push_back(*name);
  }
  throw Failure(ExitCode::Failed, "this host has no interface " + printable(interface),
                names.empty() ? "it has none at all"
                              : nearestOr(interface, names, "zorvactl show --all lists those that it has"));
}

}  // namespace zorva::cli
