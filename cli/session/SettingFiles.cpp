#include "cli/session/SettingFiles.h"

#include <algorithm>
#include <string_view>
#include <unordered_set>

#include "cli/output/Console.h"
#include "cli/output/Text.h"

namespace zorva::cli {

std::vector<std::string> orphansAmong(const SettingFiles& files, const zorva::agent::TreeSnapshot& tree) {
  std::unordered_set<std::string_view> names;
  for (const zorva::agent::Node& node : tree.nodes()) {
    const std::string* name = node.text(ZV::NodeLexicon::PROP_NAME);
    if (name != nullptr) names.insert(*name);
  }
  std::vector<std::string> orphans;
  for (const std::string& interface : files.interfaces) {
    if (!names.contains(interface)) orphans.push_back(interface);
  }
  return orphans;
}

void warnOfOrphans(const Session& session) {
  constexpr std::size_t kShownNames = 5;
  if (session.isRemote()) return;
  const std::vector<std::string> orphans =
      orphansAmong(findSettingFiles(zorva::agent::dataDirectory()), *session.tree());
  if (orphans.empty()) return;
  std::vector<std::string> names;
  for (std::size_t i = 0; i < std::min(orphans.size(), kShownNames); ++i) {
    names.push_back(printable(zorva::agent::settingFileName(orphans[i])));
  }
  const std::string more =
      orphans.size() > names.size() ? " and " + std::to_string(orphans.size() - names.size()) + " more" : "";
  tellWarning("nothing reads " + joined(names, ", ") + more + ": this host has no such interface" +
              (orphans.size() > 1 ? "s" : "") + "; zorvactl ifcfg list, adopt and remove deal with that");
}

}  // namespace zorva::cli
