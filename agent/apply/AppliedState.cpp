#include "agent/apply/AppliedState.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <stdexcept>
#include <utility>

#include "agent/config/Config.h"
#include "agent/log/LogOutput.h"
#include "agent/tree/Json.h"
#include "util/FileError.h"
#include "util/ReadFile.h"
#include "util/ReplaceFile.h"

namespace zorva::agent {
namespace {

using Kind = JsonValue::Kind;

constexpr const char* kDirectory = "applied/";
constexpr const char* kFileName = "state.json";

// Reads a document whose every member is expected; throws ConfigError for any other shape.
class StateReader {
 public:
  explicit StateReader(std::string document) : document_(std::move(document)) {}

  AppliedState state(const JsonValue& value) const {
    AppliedState state;
    state.memory = memory(value);
    state.heldBack = textsByInterface(member(value, "held_back", Kind::Object));
    if (value.find("trial") == nullptr) return state;
    const JsonValue& trial = member(value, "trial", Kind::Object);
    state.trial.emplace();
    state.trial->until = member(trial, "until", Kind::Number).number;
    state.trial->saved = saved(member(trial, "saved", Kind::List));
    state.trial->before = memory(member(trial, "before", Kind::Object));
    return state;
  }

 private:
  AppliedMemory memory(const JsonValue& value) const {
    AppliedMemory memory;
    memory.first = saved(member(value, "first", Kind::List));
    memory.addedDomains = textsByInterface(member(value, "added_domains", Kind::Object));
    return memory;
  }

  std::map<std::string, std::string> textsByInterface(const JsonValue& object) const {
    std::map<std::string, std::string> texts;
    for (std::size_t i = 0; i < object.keys.size(); ++i) texts.emplace(object.keys[i], text(object.items[i]));
    return texts;
  }

  std::vector<SavedDns> saved(const JsonValue& list) const {
    std::vector<SavedDns> result;
    for (const JsonValue& item : list.items) {
      const auto textOf = [&](const char* name) { return member(item, name, Kind::Text).text; };
      SavedDns saved{textOf("interface"), textOf("owner"), textOf("profile"), textOf("saved"), {}};
      saved.shown.lists = {texts(member(item, "servers", Kind::List)), texts(member(item, "suffixes", Kind::List))};
      saved.shown.domain = textOf("domain");
      result.push_back(std::move(saved));
    }
    return result;
  }

  const JsonValue& member(const JsonValue& object, const char* name, Kind kind) const {
    const JsonValue* value = object.kind == Kind::Object ? object.find(name) : nullptr;
    if (value == nullptr || value->kind != kind) throw ConfigError(document_, object.line, name, "is missing or wrong");
    return *value;
  }

  std::string text(const JsonValue& value) const {
    if (value.kind != Kind::Text) throw ConfigError(document_, value.line, {}, "expected a text");
    return value.text;
  }

  StringList texts(const JsonValue& list) const {
    StringList result;
    for (const JsonValue& item : list.items) result.push_back(text(item));
    return result;
  }

  std::string document_;
};

JsonValue listOf(const std::vector<SavedDns>& all) {
  JsonValue list = JsonValue::list();
  for (const SavedDns& saved : all) {
    JsonValue item = JsonValue::object();
    item.add("interface", JsonValue::ofText(saved.interface));
    item.add("owner", JsonValue::ofText(saved.owner));
    item.add("profile", JsonValue::ofText(saved.profile));
    item.add("saved", JsonValue::ofText(saved.saved));
    item.add("servers", JsonValue::ofTexts(saved.shown.lists.servers));
    item.add("suffixes", JsonValue::ofTexts(saved.shown.lists.suffixes));
    item.add("domain", JsonValue::ofText(saved.shown.domain));
    list.add(std::move(item));
  }
  return list;
}

JsonValue objectOf(const std::map<std::string, std::string>& texts) {
  JsonValue object = JsonValue::object();
  for (const auto& [interface, text] : texts) object.add(interface, JsonValue::ofText(text));
  return object;
}

JsonValue objectOf(const AppliedMemory& memory) {
  JsonValue object = JsonValue::object();
  object.add("first", listOf(memory.first));
  object.add("added_domains", objectOf(memory.addedDomains));
  return object;
}

/// The server, which is not root, reads there what became of its changes. It is of the group of the data directory.
void shareWithGroupOf(const std::string& dataDir, const std::string& applied, const struct stat& now) {
  struct stat data {};
  if (::stat(dataDir.c_str(), &data) != 0 || data.st_gid == now.st_gid) return;
  if (::lchown(applied.c_str(), static_cast<uid_t>(-1), data.st_gid) != 0 && ::geteuid() == 0) {
    ZORVAGENT_LOG_ERROR(applied + ": its group cannot be set: " + util::fileErrorText(errno));
  }
}

}  // namespace

const SavedDns* AppliedMemory::find(const std::string& interface, const std::string& owner,
                                    const std::string& profile) const {
  const auto found = std::find_if(first.begin(), first.end(), [&](const SavedDns& saved) {
    return saved.interface == interface && saved.owner == owner && saved.profile == profile;
  });
  return found == first.end() ? nullptr : &*found;
}

std::string appliedDirectory(const std::string& dataDir) {
  std::string path = dataDir + kDirectory;
  if (::mkdir(path.c_str(), S_IRWXU | S_IRGRP | S_IXGRP | S_IROTH | S_IXOTH) != 0 && errno != EEXIST) {
    util::throwFileError(path, "cannot be made");
  }
  struct stat status {};
  // Without the slash at its end, a link is not followed.
  const std::string directory = path.substr(0, path.size() - 1);
  if (::lstat(directory.c_str(), &status) != 0) util::throwFileError(path, "cannot be looked at");
  const bool isOwn = S_ISDIR(status.st_mode) && (status.st_uid == 0 || status.st_uid == ::geteuid());
  if (isOwn && (status.st_mode & (S_IWGRP | S_IWOTH)) == 0) {
    shareWithGroupOf(dataDir, directory, status);
    return path;
  }
  throw std::runtime_error(path + ": is no directory that only its owner, root, may write to; remove it");
}

AppliedState AppliedStateFile::read() const {
  const std::string path = dataDir_ + kDirectory + kFileName;
  const util::FileText file = util::readFile(path, kLargestJson);
  if (file.error == ENOENT) return {};
  if (file.error != 0) throw ConfigError(path, 0, {}, "cannot be read: " + util::fileErrorText(file.error));
  if (file.owner != 0 && file.owner != ::geteuid()) {
    throw ConfigError(path, 0, {}, "belongs to user " + std::to_string(file.owner) + " and is not trusted; remove it");
  }
  if ((file.mode & (S_IWGRP | S_IWOTH)) != 0) {
    throw ConfigError(path, 0, {}, "can be written by other users and is not trusted; remove it");
  }
  if (file.truncated) throw ConfigError(path, 0, {}, "is larger than 64 MiB");
  return StateReader(path).state(parseJson(file.text, path));
}

void AppliedStateFile::write(const AppliedState& state) const {
  JsonValue document = objectOf(state.memory);
  if (state.trial.has_value()) {
    JsonValue trial = JsonValue::object();
    trial.add("until", JsonValue::ofNumber(state.trial->until));
    trial.add("saved", listOf(state.trial->saved));
    trial.add("before", objectOf(state.trial->before));
    document.add("trial", std::move(trial));
  }
  document.add("held_back", objectOf(state.heldBack));
  const std::string unsynced = util::replaceFile(appliedDirectory(dataDir_), kFileName, formatJson(document));
  if (!unsynced.empty()) ZORVAGENT_LOG_ERROR(unsynced);
}

}  // namespace zorva::agent
