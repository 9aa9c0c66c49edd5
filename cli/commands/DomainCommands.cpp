// domain, suffixes: the domain of an interface, and those that the host appends.

#include <ProviderUtilities.h>

#include "cli/commands/Commands.h"
#include "cli/commands/SettingList.h"
#include "cli/session/Assignments.h"
#include "util/Names.h"

namespace zorva::cli {

namespace {

/// Checked as in the providers, because a server might check too.
bool isName(const std::string& text) { return ZV::ProviderUtilities::ValidateInput(text, {}) != 0; }

constexpr const char* kNameRule =
    "letters, digits, '-' and '_' between single dots, at most 63 in each part and 253 in all";

void requireSuffix(const std::string& text) {
  requirePlainText("SUFFIX", text);
  if (text.empty() || !isName(text)) throw refused(text, "is no suffix", std::string("a suffix is ") + kNameRule);
}

bool sameSuffix(const std::string& a, const std::string& b) {
  const auto plain = [](std::string_view text) { return text.substr(0, text.size() - (text.ends_with('.') ? 1 : 0)); };
  return util::sameName(plain(a), plain(b));
}

constexpr ListSetting kSuffixes{"DNSSuffixesToAppend", "suffix",  "SUFFIX", "A domain's name", false,
                                requireSuffix,         sameSuffix};

void setDomain(const Globals& globals, const SettingOptions& options) {
  const std::string& name = options.values.front();
  requirePlainText("NAME", name);
  if (!isName(name)) throw refused(name, std::string("is no domain name: it has ") + kNameRule);
  Session session(globals);
  const Session::Changing alone(session, globals.dryRun);
  const broker::Instance setting = settingOfInterface(session, options.interface);
  changeSetting(session, globals, setting, "DomainName", broker::Value::text(name));
}

}  // namespace

void addDomainCommand(CommandLine& line) {
  const auto options = std::make_shared<SettingOptions>();
  line.add("domain", "Set the DNS domain of an interface")
      .writesJson()
      .changes()
      .gathers()
      .examples("  zorvactl domain eth0 lab.example.org\n  zorvactl domain eth0 ''")
      .interface(options->interface)
      .dryRun()
      .words("NAME", "The domain's name; '' empties it", Many::One, options->values)
      .runs<SettingOptions>(setDomain, options);
}

void addSuffixesCommands(CommandLine& line) {
  Subcommand suffixes = line.add("suffixes", "The DNS suffixes of the host");
  suffixes.writesJson().examples(
      "  zorvactl suffixes set example.org example.net\n  zorvactl suffixes add lab.example.org");
  addShow(suffixes, kSuffixes).examples("  zorvactl suffixes show");
  addChange(suffixes, kSuffixes, "set", "Replace them; none at all empties the list", Many::Any, setList)
      .examples("  zorvactl suffixes set example.org example.net");
  addChange(suffixes, kSuffixes, "add", "Add suffixes after the others", Many::Some, addToList)
      .examples("  zorvactl suffixes add lab.example.org");
  addChange(suffixes, kSuffixes, "remove", "Remove suffixes", Many::Some, removeFromList)
      .examples("  zorvactl suffixes remove lab.example.org");
}

}  // namespace zorva::cli
