#include "agent/apply/Applier.h"

#include <unistd.h>

#include <algorithm>
#include <optional>
#include <set>
#include <stdexcept>
#include <utility>

#include "agent/files/FileLock.h"
#include "agent/log/LogOutput.h"
#include "agent/tree/TreeJson.h"
#include "util/Escape.h"
#include "util/FileError.h"
#include "util/Names.h"
#include "util/Text.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using std::chrono::system_clock;

constexpr const char* kNetworkdOwner = "systemd-networkd";
constexpr const char* kResolvedOwner = "systemd-resolved";

util::FileDescriptor openLock(const std::string& path) {
  constexpr mode_t kRights = 0600;
  util::FileDescriptor file = openLockFile(path, kRights);
  if (!file) util::throwFileError(path, "cannot be opened");
  return file;
}

// One process at a time applies.
class ApplyLock {
 public:
  explicit ApplyLock(const std::string& dataDir)
      : path_(appliedDirectory(dataDir) + "lock"),
        lock_(openLock(path_), path_, FileLock::Mode::Exclusive, std::chrono::steady_clock::now() + kLongest) {}

 private:
  static constexpr std::chrono::seconds kLongest{30};

  std::string path_;
  FileLock lock_;
};

StringList listOfText(const std::string& text) { return text.empty() ? StringList() : StringList{text}; }

std::vector<PropertyChange> differences(const ShownDns& before, const ShownDns& after) {
  std::vector<PropertyChange> changes;
  const auto compare = [&changes](PropertyNumber property, const StringList& left, const StringList& right) {
    if (!sameLists({left, {}}, {right, {}})) changes.push_back({propertyName(property), left, right});
  };
  compare(PROP_DNS_SERVER_ADDRESSES, before.lists.servers, after.lists.servers);
  compare(PROP_DNS_SUFFIXES, before.lists.suffixes, after.lists.suffixes);
  compare(PROP_DOMAIN_NAME, listOfText(before.domain), listOfText(after.domain));
  return changes;
}

std::string inOneLine(const std::string& text) {
  std::string line;
  util::appendEscaped(line, text);
  return line;
}

std::string noInterface(const std::string& name) {
  return "there is no interface " + inOneLine(name) + "; 'zorvactl show --all' lists those that there are";
}

bool hasDnsSettings(const OverlayValues& overlay, const std::string& path) {
  const auto node = overlay.find(path);
  if (node == overlay.end()) return false;
  return std::any_of(node->second.begin(), node->second.end(),
                     [](const auto& property) { return property.first != PROP_HOST_NAME; });
}

std::uint64_t secondsOf(system_clock::time_point time) {
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::seconds>(time.time_since_epoch()).count());
}

}  // namespace

Applier::Applier(const std::string& dataDir, HostDns::Look look, OverlayValues overlay, const std::string& bmcFile)
    : dataDir_(dataDir), file_(dataDir), overlay_(std::move(overlay)), host_(std::move(look), bmcFile) {}

std::vector<ApplyResult> Applier::apply(const std::vector<std::string>& names, const ApplyOptions& options) {
  std::optional<ApplyLock> lock;
  if (!options.dryRun) lock.emplace(dataDir_);
  host_.look();
  readState(!options.dryRun);
  std::vector<Plan> plans;
  const auto hasSettings = [&](const HostInterface& interface) {
    const bool hasFile = !interface.settingsName.empty() &&
                         ::access(settingsFileOf(dataDir_, interface.settingsName).c_str(), F_OK) == 0;
    return hasFile || hasDnsSettings(overlay_, interface.path);
  };
  for (const HostInterface& interface : choose(names, hasSettings))
    plans.push_back(planFor(interface, options.automatic));
  refuseSharedStores(plans);
  if (!options.dryRun && options.trial.has_value()) {
    std::vector<SavedDns> saved;
    for (const Plan& plan : plans) {
      if (plan.mustWrite()) saved.push_back(plan.savedDns());
    }
    beginTrial(std::move(saved), *options.trial);
  }
  std::vector<ApplyResult> results;
  for (Plan& plan : plans) {
    if (!options.dryRun && plan.mustWrite()) execute(plan);
    if (!plan.result.problem.empty()) plan.result.changes.clear();
    results.push_back(std::move(plan.result));
  }
  return results;
}

// Names that are in no tree come first. Without names those that are meant.
std::vector<HostInterface> Applier::choose(const std::vector<std::string>& names,
                                           const std::function<bool(const HostInterface&)>& isMeant) const {
  std::vector<HostInterface> chosen;
  std::set<std::string> named;
  for (const std::string& name : names) {
    const std::vector<HostInterface> found = host_.named(name);
    for (const HostInterface& interface : found) named.insert(interface.path);
    const auto isSame = [&](const HostInterface& other) { return other.name == name; };
    if (found.empty() && std::none_of(chosen.begin(), chosen.end(), isSame)) chosen.push_back(host_.interface(name));
  }
  for (HostInterface& interface : host_.interfaces()) {
    if (names.empty() ? isMeant(interface) : named.contains(interface.path)) chosen.push_back(std::move(interface));
  }
  return chosen;
}

Expected<WantedSettings, std::string> Applier::wantedOf(const HostInterface& interface) const {
  return readWanted(dataDir_, interface.settingsName, overlay_, interface.path);
}

Applier::Plan Applier::planFor(const HostInterface& interface, bool automatic) {
  Plan plan;
  plan.interface = interface;
  plan.result.interface = interface.name;
  if (!interface.exists()) {
    plan.result.problem = noInterface(interface.name);
    return plan;
  }
  const auto read = wantedOf(interface);
  if (!read) {
    plan.result.problem = read.error();
    return plan;
  }
  const auto held = state_.heldBack.find(interface.name);
  if (automatic && held != state_.heldBack.end() && held->second == textOf(*read)) {
    plan.result.note = "these settings were taken back; 'zorvactl apply " + interface.name + "' applies them again";
    return plan;
  }
  const auto wanted = checked(*read, host_.targetFor(interface, {}).zone);
  if (!wanted) {
    plan.result.problem = wanted.error();
    return plan;
  }
  planOwner(plan);
  if (!plan.result.problem.empty()) return plan;
  plan.hasSettings = wanted->any();
  if (plan.hasSettings) {
    planSettings(plan, *wanted);
  } else {
    plan.result.note = "no DNS settings are stored for it";
  }
  return plan;
}

void Applier::planOwner(Plan& plan) {
  const auto owner = host_.ownerOf(plan.interface);
  if (!owner) {
    plan.result.problem = owner.error();
    return;
  }
  plan.result.owner = owner->name;
  plan.result.profile = owner->profile;
  plan.target = host_.targetFor(plan.interface, owner->profile);
  if (host_.writerOf(owner->name) == nullptr) {
    plan.result.problem = owner->name + " owns " + plan.interface.name + " and cannot be changed from here";
  }
}

void Applier::planSettings(Plan& plan, const WantedSettings& wanted) {
  const std::string& owner = plan.result.owner;
  DnsWriter& writer = *host_.writerOf(owner);
  plan.before = host_.shown(plan.interface, owner);
  plan.settings = plan.before.lists;
  if (wanted.servers.has_value()) plan.settings.servers = *wanted.servers;
  const bool hasOwnDomain = owner != kResolvConfOwner && owner != kBmcOwner;
  const std::string ownDomain = hasOwnDomain ? host_.ownDomain() : std::string();
  planSuffixes(plan, wanted, ownDomain);

  plan.after.lists = writer.asHeld(plan.settings);
  if (sameLists(plan.after.lists, writer.asHeld(plan.before.lists))) return;
  const StringList& names = plan.after.lists.suffixes;
  if (owner != kResolvConfOwner) plan.after.domain = names.empty() ? ownDomain : names.front();
  plan.result.changes = differences(plan.before, plan.after);
  const auto warning = writer.warningBefore(plan.target, plan.settings);
  const auto saved = warning ? writer.save(plan.target) : Expected<std::string, Refusal>(unexpected(warning.error()));
  if (saved) {
    plan.saved = *saved;
    plan.result.note = *warning;
  } else {
    plan.result.problem = saved.error();
  }
}

// A domain that was put before the suffixes by an earlier call is none of them.
void Applier::planSuffixes(Plan& plan, const WantedSettings& wanted, const std::string& ownDomain) const {
  StringList& suffixes = plan.settings.suffixes;
  if (plan.interface.isOfBmc) {
    // It has no search list but its domain.
    if (wanted.domain.has_value()) suffixes = listOfText(*wanted.domain);
    return;
  }
  const auto added = state_.memory.addedDomains.find(plan.interface.name);
  const bool hasAdded =
      added != state_.memory.addedDomains.end() && !suffixes.empty() && util::sameName(suffixes.front(), added->second);
  if (!wanted.suffixes.has_value() && !wanted.domain.has_value()) {
    if (hasAdded) plan.addedDomain = added->second;
    return;
  }
  if (hasAdded) suffixes.erase(suffixes.begin());
  if (wanted.suffixes.has_value()) suffixes = *wanted.suffixes;
  StringList list = searchListOf(suffixes, wanted.domain.value_or(""), ownDomain);
  if (list.size() > suffixes.size()) plan.addedDomain = list.front();
  suffixes = std::move(list);
}

// A file of several interfaces has one list for all of them.
void Applier::refuseSharedStores(std::vector<Plan>& plans) const {
  for (Plan& plan : plans) {
    const std::string& owner = plan.result.owner;
    if (!plan.mustWrite() || (owner != kResolvConfOwner && owner != kNetworkdOwner)) continue;
    StringList others;
    if (owner == kNetworkdOwner) others = host_.othersWith({owner, plan.result.profile}, plan.interface);
    for (const Plan& other : plans) {
      const bool shares = &other != &plan && other.result.owner == owner && other.result.profile == plan.result.profile;
      if (!shares || !other.hasSettings) continue;
      std::erase(others, other.interface.name);
      if (!sameLists(other.settings, plan.settings)) others.push_back(other.interface.name);
    }
    if (others.empty()) continue;
    plan.result.problem = owner == kResolvConfOwner
                              ? owner + " is that of the whole host, and " + plan.interface.name +
                                    " has other settings than " + util::joined(others) +
                                    "; apply one of them by its name"
                              : plan.result.profile + " is the file of " + util::joined(others) + " too; give " +
                                    plan.interface.name + " a file of its own in /etc/systemd/network";
  }
}

// The state from before is on the disk before the owner is touched.
void Applier::execute(Plan& plan) {
  const AppliedState before = state_;
  DnsWriter& writer = *host_.writerOf(plan.result.owner);
  remember(plan);
  file_.write(state_);
  const auto written = writer.write(plan.target, plan.settings);
  if (written && host_.waitUntilShown(plan.target, plan.result.owner, plan.after.lists)) {
    plan.result.note = writer.note();
    return;
  }
  plan.result.problem = written ? notTaken(plan) : written.error();
  if (written ? !putBack(plan) : !isAsBefore(plan)) return;
  state_ = before;
  file_.write(state_);
}

bool Applier::putBack(Plan& plan) {
  const auto restored = host_.writerOf(plan.result.owner)->restore(plan.target, plan.saved);
  plan.result.problem += restored ? "; " + plan.interface.name + " is as it was before"
                                  : "; and " + plan.interface.name + " could not be put back: " + restored.error();
  return restored.has_value();
}

// An owner that ended in the middle may have the new settings, on the disk or in use.
bool Applier::isAsBefore(Plan& plan) {
  const auto now = host_.writerOf(plan.result.owner)->save(plan.target);
  if (now && *now == plan.saved && host_.waitUntilShown(plan.target, plan.result.owner, plan.before.lists)) return true;
  plan.result.problem += "; 'zorvactl revert " + plan.interface.name + "' takes back what may have been changed";
  return false;
}

// What is host-wide was saved at the first change for any interface.
void Applier::remember(const Plan& plan) {
  AppliedMemory& memory = state_.memory;
  if (memory.find(plan.interface.name, plan.result.owner, plan.result.profile) == nullptr) {
    SavedDns saved = plan.savedDns();
    for (const SavedDns& other : memory.first) {
      if (other.owner != kResolvConfOwner || saved.owner != kResolvConfOwner) continue;
      saved.saved = other.saved;
      saved.shown = other.shown;
    }
    memory.first.push_back(std::move(saved));
  }
  memory.addedDomains.erase(plan.interface.name);
  if (!plan.addedDomain.empty()) memory.addedDomains[plan.interface.name] = plan.addedDomain;
  state_.heldBack.erase(plan.interface.name);
}

// What a person took back must not come again by itself.
void Applier::holdBack(const std::string& interface) {
  const auto wanted = wantedOf(host_.interface(interface));
  if (wanted && wanted->any()) state_.heldBack[interface] = textOf(*wanted);
}

std::string Applier::notTaken(const Plan& plan) {
  const ShownDns shown = host_.shown(plan.interface, plan.result.owner);
  ShownDns wanted = plan.after;
  wanted.domain = shown.domain;
  std::string problem = plan.result.owner + " did not take";
  for (const PropertyChange& change : differences(shown, wanted)) {
    problem += (problem.ends_with(')') ? ", " : " ") + change.property + " (it has " +
               (change.before.empty() ? "none" : util::joined(change.before)) + ", not " +
               (change.after.empty() ? "none" : util::joined(change.after)) + ")";
  }
  return problem + "; see what else sets it there, and apply again";
}

std::vector<ApplyResult> Applier::revert(const std::vector<std::string>& names, const ApplyOptions& options) {
  std::optional<ApplyLock> lock;
  if (!options.dryRun) lock.emplace(dataDir_);
  host_.look();
  readState(!options.dryRun);
  StringList meant = names;
  if (names.empty()) {
    for (const SavedDns& entry : state_.memory.first) meant.push_back(entry.interface);
  }
  if (meant.empty()) return {};
  const std::vector<HostInterface> chosen = choose(meant, [](const HostInterface&) { return false; });
  if (!options.dryRun && options.trial.has_value()) {
    std::vector<SavedDns> saved;
    for (const HostInterface& interface : chosen) {
      for (const SavedDns& entry : entriesOf(interface.name)) saved.push_back(saveNow(entry));
    }
    beginTrial(std::move(saved), *options.trial);
  }
  std::vector<ApplyResult> results;
  for (const HostInterface& interface : chosen) results.push_back(revertOne(interface, options.dryRun));
  return results;
}

std::vector<SavedDns> Applier::entriesOf(const std::string& interface) const {
  std::vector<SavedDns> entries;
  for (const SavedDns& entry : state_.memory.first) {
    if (entry.interface == interface) entries.push_back(entry);
  }
  return entries;
}

// An interface has an entry for each owner that was changed for it.
ApplyResult Applier::revertOne(const HostInterface& interface, bool dryRun) {
  ApplyResult result;
  result.interface = interface.name;
  const std::vector<SavedDns> entries = entriesOf(interface.name);
  if (entries.empty() && !interface.exists()) result.problem = noInterface(interface.name);
  for (const SavedDns& entry : entries) {
    const ApplyResult one = restore(entry, dryRun);
    result.owner = one.owner;
    result.profile = one.profile;
    result.changes.insert(result.changes.end(), one.changes.begin(), one.changes.end());
    if (!one.problem.empty()) result.problem += (result.problem.empty() ? "" : "; ") + one.problem;
    if (!one.note.empty()) result.note += (result.note.empty() ? "" : "; ") + one.note;
    if (dryRun || !one.problem.empty()) continue;
    forget(entry);
    holdBack(entry.interface);
    file_.write(state_);
  }
  return result;
}

void Applier::forget(const SavedDns& saved) {
  std::erase_if(state_.memory.first, [&](const SavedDns& other) {
    const bool isSame = other.interface == saved.interface && other.profile == saved.profile;
    return other.owner == saved.owner && (isSame || other.owner == kResolvConfOwner);
  });
  state_.memory.addedDomains.erase(saved.interface);
}

ApplyResult Applier::restore(const SavedDns& saved, bool dryRun) {
  ApplyResult result;
  result.interface = saved.interface;
  result.owner = saved.owner;
  result.profile = saved.profile;
  DnsWriter* writer = host_.writerOf(saved.owner);
  if (writer == nullptr) {
    result.problem = inOneLine(saved.owner) + " had " + saved.interface + " and cannot be changed from here";
    return result;
  }
  const HostInterface interface = host_.interface(saved.interface);
  const std::string otherOwner = otherOwnerThan(saved, interface);
  const DnsTarget target = host_.targetFor(interface, saved.profile);
  const ShownDns before = host_.shown(interface, saved.owner);
  if (dryRun) {
    if (otherOwner.empty()) result.changes = differences(before, saved.shown);
    return result;
  }
  if (!otherOwner.empty()) {
    restoreElsewhere(result, saved, target, otherOwner);
    return result;
  }
  if (const auto restored = writer->restore(target, saved.saved); !restored) {
    result.problem = restored.error();
    return result;
  }
  if (!interface.exists()) return result;
  // What is learned may be another list by now.
  const bool isShown = host_.waitUntilShown(target, saved.owner, saved.shown.lists);
  const ShownDns after = host_.shown(interface, saved.owner);
  result.changes = differences(before, after);
  if (!isShown && before == after) result.problem = saved.owner + " still has the settings of before";
  return result;
}

// Who has the interface instead of the owner, or of the profile, whose settings were saved. Empty where that is the
// same, or is not known.
std::string Applier::otherOwnerThan(const SavedDns& saved, const HostInterface& interface) {
  if (!interface.exists()) return {};
  const auto owner = host_.ownerOf(interface);
  if (!owner || (owner->name == saved.owner && owner->profile == saved.profile)) return {};
  return owner->profile.empty() ? owner->name : owner->name + " (" + inOneLine(owner->profile) + ")";
}

// What is left of the change where another owner has the interface now. Nothing of it is shown. systemd-resolved has
// what that owner gives it, which must stay.
void Applier::restoreElsewhere(ApplyResult& result, const SavedDns& saved, const DnsTarget& target,
                               const std::string& otherOwner) {
  result.note = otherOwner + " has " + saved.interface + " now; ";
  if (saved.owner == kResolvedOwner) {
    result.note += "nothing is left of what " + saved.owner + " was given";
    return;
  }
  DnsWriter& writer = *host_.writerOf(saved.owner);
  const auto restored = writer.restore(target, saved.saved);
  const auto now = restored ? Expected<std::string, Refusal>(saved.saved) : writer.save(target);
  const bool isOver = now ? *now == saved.saved : saved.owner == kResolvConfOwner;
  if (!isOver) {
    result.note.clear();
    result.problem = restored.error();
    return;
  }
  result.note += now ? saved.owner + " has its settings of before, which are not in use"
                     : saved.owner + " is left as it is: " + now.error();
}

SavedDns Applier::saveNow(const SavedDns& entry) {
  SavedDns now = entry;
  const HostInterface interface = host_.interface(entry.interface);
  DnsWriter* writer = host_.writerOf(entry.owner);
  if (writer == nullptr) throw std::runtime_error(inOneLine(entry.owner) + " cannot be changed from here");
  const auto saved = writer->save(host_.targetFor(interface, entry.profile));
  if (!saved) throw std::runtime_error(entry.interface + ": " + saved.error());
  now.saved = *saved;
  now.shown = host_.shown(interface, entry.owner);
  return now;
}

// Before a change a trial that ran out is taken back. One that runs would lose what it is to bring back.
void Applier::readState(bool mayChange) {
  state_ = file_.read();
  if (!mayChange || !state_.trial.has_value()) return;
  if (state_.trial->until > secondsOf(system_clock::now())) {
    throw std::runtime_error("a trial has not been confirmed; confirm it, or wait until it ends");
  }
  for (const ApplyResult& result : takeBackTrial()) {
    ZORVAGENT_LOG_ERROR(result.interface + ": a trial ended without a confirmation and is taken back" +
                        (result.problem.empty() ? "" : ": " + result.problem));
  }
  host_.look();
}

void Applier::beginTrial(std::vector<SavedDns> saved, std::chrono::seconds length) {
  if (saved.empty()) return;
  state_.trial = AppliedTrial{secondsOf(system_clock::now() + length), std::move(saved), state_.memory};
  file_.write(state_);
}

// What cannot be taken back now stays, for the next attempt.
std::vector<ApplyResult> Applier::takeBackTrial() {
  std::vector<ApplyResult> results;
  std::vector<SavedDns> left;
  for (const SavedDns& saved : state_.trial->saved) {
    results.push_back(restore(saved, false));
    if (!results.back().problem.empty()) left.push_back(saved);
    holdBack(saved.interface);
  }
  if (left.empty()) {
    state_.memory = state_.trial->before;
    state_.trial.reset();
  } else {
    state_.trial->saved = std::move(left);
  }
  file_.write(state_);
  return results;
}

std::vector<ApplyResult> Applier::endTrial() {
  const ApplyLock lock(dataDir_);
  state_ = file_.read();
  if (!state_.trial.has_value()) return {};
  host_.look();
  return takeBackTrial();
}

std::optional<system_clock::time_point> pendingTrialIn(const std::string& dataDir) {
  const AppliedState state = AppliedStateFile(dataDir).read();
  if (!state.trial.has_value()) return std::nullopt;
  return system_clock::time_point(std::chrono::seconds(state.trial->until));
}

void confirmTrialIn(const std::string& dataDir) {
  const ApplyLock lock(dataDir);
  const AppliedStateFile file(dataDir);
  AppliedState state = file.read();
  if (!state.trial.has_value()) return;
  state.trial.reset();
  file.write(state);
}

}  // namespace zorva::agent
