#include "cli/commands/CommandLine.h"

// The only source here that includes CLI11, because its headers take long to compile. Its templates are not used for
// the same reason: options are read by callbacks.
#include <CLI/CLI.hpp>
#include <algorithm>
#include <charconv>
#include <map>
#include <set>

#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "manual/AppTree.h"

namespace zorva::cli {

namespace {

constexpr const char* kExamples =
    R"(  zorvactl show                                          all at a glance; show eth0: all of one
  zorvactl check                                         do the servers answer?
  zorvactl ei ZORVA_DNSProtocolEndPoint --output json    the DNS client of each interface
  zorvactl get 'ZORVA_DNSProtocolEndPoint.Name="eth0"'   one of them
  zorvactl ai 'ZORVA_DNSProtocolEndPoint.Name="eth0"' --result-class CIM_RemoteServiceAccessPoint
  zorvactl ifcfg init eth0                               give eth0 a file of settings
  zorvactl dns set eth0 192.0.2.53 2001:db8::53          and change them
  zorvactl --url https://admin@host1 show                what the server of another host says
  zorvactl --hosts hosts.txt --user admin show           what those of many hosts say)";

constexpr const char* kClosing = R"(

A path may leave out keys where the rest is clear, and take any spelling of names. Exit status: 0 done, 1 the operation
failed, 2 wrong usage or configuration. "zorvactl help SUBCOMMAND" tells more.)";

}  // namespace

struct CommandLine::Registered {
  CLI::App app{"The DNS client configuration of this host as CIM objects; no server is needed.", "zorvactl"};
  Globals globals;
  const CLI::App* chosen = nullptr;  ///< the subcommand that was read
  Command command;                   ///< of that
  std::map<const CLI::App*, std::string> examples;
  std::map<const CLI::App*, std::vector<OutputFormat>> formats;
  std::set<const CLI::App*> formatsToRequire;
  std::set<const CLI::App*> local;
  std::map<const CLI::App*, CommandNature> natures;
  std::map<const CLI::Option*, std::string> kinds;  ///< if the name of the option does not say it
  std::map<const CLI::Option*, std::vector<std::string>> choices;

  /// The formats that a subcommand, or one under it, can write.
  std::vector<OutputFormat> formatsOf(const CLI::App& subcommand) const;
  std::string footerOf(const CLI::App& subcommand) const;
  /// Throws Failure unless the command can write the format and be run here.
  void requireRunnable() const;
  /// Those of all subcommands.
  void placeFooters(CLI::App& above) const;
  /// The kind of a word at its position: a subcommand, an option, or the positional with that number.
  Completion completionAt(const CLI::App& at, std::size_t positional) const;
};

namespace {

/// Every subcommand of this one, also hidden ones.
std::vector<const CLI::App*> subcommandsOf(const CLI::App& app) {
  return app.get_subcommands([](const CLI::App*) { return true; });
}

std::vector<std::string> shownSubcommandsOf(const CLI::App& app) {
  std::vector<std::string> names;
  for (const CLI::App* each : subcommandsOf(app)) {
    if (!each->get_group().empty()) names.push_back(each->get_name());
  }
  return names;
}

/// "dns set": the words of a subcommand.
std::string callOf(const CLI::App& subcommand) {
  const CLI::App* parent = subcommand.get_parent();
  if (parent == nullptr) return {};
  const std::string before = callOf(*parent);
  return before + (before.empty() ? "" : " ") + subcommand.get_name();
}

CLI::Option* addText(CLI::App& app, const std::string& name, const std::string& description, std::string& into) {
  const auto read = [&into](const CLI::results_t& words) {
    into = words.back();
    return true;
  };
  return app.add_option(name, read, description)->type_name("TEXT");
}

CLI::Option* addTexts(CLI::App& app, const std::string& name, const std::string& description,
                      std::vector<std::string>& into) {
  const auto read = [&into](const CLI::results_t& words) {
    into = words;
    return true;
  };
  return app.add_option(name, read, description)->type_name("TEXT")->expected(CLI::detail::expected_max_vector_size);
}

std::vector<std::string> namesOf(const std::vector<OutputFormat>& formats) {
  std::vector<std::string> names;
  for (const OutputFormat each : formats) names.emplace_back(formatName(each));
  return names;
}

OutputFormat formatOf(const std::string& word) {
  if (const auto format = formatNamed(word)) return *format;
  const std::vector<std::string> known = namesOf({std::begin(kAllFormats), std::end(kAllFormats)});
  throw CLI::ValidationError("--output", "'" + printable(word) + "' is no format; " +
                                             nearestOr(word, known, "there are " + joined(known, ", ")));
}

int levelOf(const std::string& word) {
  int level = 0;
  const auto [end, error] = std::from_chars(word.data(), word.data() + word.size(), level);
  if (error == std::errc() && end == word.data() + word.size() && level >= 0) return level;
  throw CLI::ValidationError("--log-level", "'" + printable(word) + "' is no level: a number from 0 on is wanted");
}

std::chrono::milliseconds durationOf(const std::string& word) {
  double seconds = 0;
  const auto [end, error] = std::from_chars(word.data(), word.data() + word.size(), seconds);
  const bool isNumber = error == std::errc() && end == word.data() + word.size();
  if (isNumber && seconds >= 0.001 && seconds <= 3600) {
    return std::chrono::milliseconds(static_cast<std::int64_t>(seconds * 1000));
  }
  throw CLI::ValidationError("--timeout",
                             "'" + printable(word) + "' is no time: a number of seconds up to 3600 is wanted");
}

/// The servers to ask; an option of what they replace excludes them.
void addServerOptions(CLI::App& app, ServerOptions& servers, const std::vector<CLI::Option*>& replaced) {
  CLI::Option* url = addTexts(app, "--url",
                              "Ask this CIM server, and not the providers: https://USER@HOST:PORT/NAMESPACE, "
                              "http://HOST, or unix: for this host's socket; may be repeated",
                              servers.urls)
                         ->type_name("URL")
                         ->allow_extra_args(false);
  CLI::Option* hosts =
      addText(app, "--hosts", "Ask the servers of this file: a host name or URL on each line", servers.hostsFile)
          ->type_name("FILE");
  for (CLI::Option* each : replaced) {
    url->excludes(each);
    hosts->excludes(each);
  }
  addText(app, "--user", "Who logs in at servers whose URL names no user", servers.user)->type_name("USER");
  addText(app, "--password-file",
          "The file with the password, or '-' for standard input (default: $ZORVACTL_PASSWORD_FILE, else the terminal)",
          servers.passwordFile)
      ->type_name("FILE");
  CLI::Option* authority =
      addText(app, "--ca", "Trust certificates of these authorities, and not those of the system", servers.caFile)
          ->type_name("FILE");
  addText(app, "--fingerprint", "Trust the certificate with this SHA-256, and no other", servers.fingerprint)
      ->type_name("SHA256")
      ->excludes(authority);
  const auto timeout = [&servers](const CLI::results_t& words) {
    servers.timeout = durationOf(words.back());
    return true;
  };
  app.add_option("--timeout", timeout, "How long a server may take in all; with several: 10, for changes 60")
      ->type_name("SECONDS");
  app.add_flag_callback(
      "--yes", [&servers] { servers.yes = true; }, "Change several hosts without a question");
}

void addGlobalOptions(CLI::App& app, Globals& globals) {
  const auto output = [&globals](const CLI::results_t& words) {
    globals.output = formatOf(words.back());
    return true;
  };
  app.add_option("-o,--output", output, "How to write the results: table, json, mof, xml; graph: dot, svg")
      ->type_name("FORMAT");
  app.add_flag_callback(
      "-q,--quiet", [&globals] { globals.quiet = true; },
      "Write errors only; the exit status says whether it succeeded");
  CLI::Option* config = addText(app, "--config",
                                "The agent's configuration (default: $ZORVAGENT_CONFIG, else "
                                "/etc/zorvagent/agent.toml)",
                                globals.config)
                            ->type_name("FILE");
  const auto level = [&globals](const CLI::results_t& words) {
    globals.logLevel = levelOf(words.back());
    return true;
  };
  app.add_option("--log-level", level, "Show log lines from this level on: 3000 flow, 4000 detail, 6000 errors")
      ->type_name("N");
  CLI::Option* directory =
      addText(app, "--provider-dir", "Where the provider libraries lie", globals.providerDirectory)->type_name("DIR");
  CLI::Option* added =
      addText(app, "--providers",
              "Further providers: the files .reg and .mof of a directory (default: /etc/zorvagent/providers.d)",
              globals.addedProviders)
          ->type_name("DIR");
  addServerOptions(app, globals.servers, {config, directory, added});
}

bool takesValue(const CLI::Option& option) { return option.get_items_expected_max() > 0; }

const CLI::Option* optionNamed(const CLI::App& at, const std::string& word) {
  for (const CLI::App* app = &at; app != nullptr; app = app->get_parent()) {
    for (const CLI::Option* option : app->get_options()) {
      if (!option->get_positional() && option->check_name(word)) return option;
    }
  }
  return nullptr;
}

const CLI::App* subcommandNamed(const CLI::App& at, const std::string& word) {
  for (const CLI::App* subcommand : at.get_subcommands([](const CLI::App*) { return true; })) {
    if (subcommand->check_name(word)) return subcommand;
  }
  return nullptr;
}

void addOnce(std::vector<std::string>& words, const std::string& word) {
  if (std::find(words.begin(), words.end(), word) == words.end()) words.push_back(word);
}

bool isLikeAnOption(const std::string& word) { return word.size() > 1 && word.starts_with('-'); }

/// Every option that may be given to a subcommand.
std::vector<std::string> optionsAt(const CLI::App& at) {
  std::vector<std::string> names;
  for (const CLI::App* app = &at; app != nullptr; app = app->get_parent()) {
    for (const CLI::Option* option : app->get_options()) {
      for (const std::string& name : option->get_lnames()) names.push_back("--" + name);
    }
  }
  return names;
}

/// What to do about the first of these words that looks like an option; empty if none does.
std::string hintForOption(const CLI::App& at, const std::vector<std::string>& unknown) {
  const auto option = std::find_if(unknown.begin(), unknown.end(), isLikeAnOption);
  if (option == unknown.end()) return {};
  const std::string name = option->substr(0, option->find('='));
  return nearestOr(name, optionsAt(at), "a value that begins with '-' goes after --") +
         (name.starts_with("--") ? " " : "; ");
}

/// A misspelt subcommand gets the nearest one; where none is given, the few that there are.
Telling wrongSubcommand(const CLI::App& at, const std::string& call, const std::vector<std::string>& unknown) {
  const std::vector<std::string> known = shownSubcommandsOf(at);
  if (unknown.empty()) {
    const bool areFew = known.size() <= 8;
    return {call + " needs a subcommand", true,
            (areFew ? "it has " + joined(known, ", ") + "; " : std::string()) + call + " --help " +
                (areFew ? "tells more" : "lists them")};
  }
  return {call + " has no subcommand '" + printable(unknown.front()) + "'", true,
          nearestOr(unknown.front(), known, call + " --help lists those that it has")};
}

/// The error in words that name the subcommand, and how to show its usage.
Telling wrongUsage(const CLI::App& app, const CLI::ParseError& error) {
  const CLI::App* at = &app;
  while (!at->get_subcommands().empty()) at = at->get_subcommands().back();
  const std::string call = "zorvactl" + (at == &app ? std::string() : " " + callOf(*at));
  const std::vector<std::string> unknown = app.remaining(true);
  const bool lacksSubcommand =
      at->get_require_subcommand_min() != 0 && dynamic_cast<const CLI::RequiredError*>(&error) != nullptr;
  const bool isOption = !unknown.empty() && isLikeAnOption(unknown.front());
  if (lacksSubcommand && !isOption) return wrongSubcommand(*at, call, unknown);
  const std::string hint = hintForOption(*at, unknown);
  return {printable(error.what()), true, hint + call + " --help shows the usage"};
}

}  // namespace

std::vector<OutputFormat> CommandLine::Registered::formatsOf(const CLI::App& subcommand) const {
  const auto found = formats.find(&subcommand);
  if (found != formats.end()) return found->second;
  if (subcommand.get_parent() == nullptr) return {std::begin(kAllFormats), std::end(kAllFormats)};
  return {OutputFormat::Table};
}

std::string CommandLine::Registered::footerOf(const CLI::App& subcommand) const {
  std::string text;
  const auto lines = examples.find(&subcommand);
  if (lines != examples.end()) text += "\nExamples:\n" + lines->second + "\n";
  const std::vector<std::string> names = namesOf(formatsOf(subcommand));
  if (names.size() > 1) text += "\nIt writes " + joined(names, ", ") + " (--output).";
  return text +
         "\nThe options of zorvactl itself may be given here as well: --url, --hosts, --config, --log-level, "
         "--provider-dir, --quiet; zorvactl --help lists them.";
}

void CommandLine::Registered::requireRunnable() const {
  const std::string call = "zorvactl " + callOf(*chosen);
  const std::vector<OutputFormat> allowed = formatsOf(*chosen);
  if (formatsToRequire.contains(chosen) && std::find(allowed.begin(), allowed.end(), globals.output) == allowed.end()) {
    throw Failure(ExitCode::WrongUsage, call + " has no output as " + formatName(globals.output),
                  "it writes " + joined(namesOf(allowed), ", "));
  }
  if (local.contains(chosen) && globals.servers.any()) {
    throw Failure(ExitCode::WrongUsage, call + " is about files of this host, which no CIM server hands out",
                  "leave out --url, and run it on the host that is meant");
  }
}

void CommandLine::Registered::placeFooters(CLI::App& above) const {
  for (CLI::App* each : above.get_subcommands([](CLI::App*) { return true; })) {
    each->footer(footerOf(*each));
    placeFooters(*each);
  }
}

Completion CommandLine::Registered::completionAt(const CLI::App& at, std::size_t positional) const {
  Completion completion{shownSubcommandsOf(at)};
  for (const CLI::App* each : subcommandsOf(at)) completion.meanings[each->get_name()] = each->get_description();
  std::vector<const CLI::Option*> positionals;
  for (const CLI::App* each = &at; each != nullptr; each = each->get_parent()) {
    for (const CLI::Option* option : each->get_options()) {
      for (const std::string& name : option->get_lnames()) {
        addOnce(completion.words, "--" + name);
        completion.meanings.emplace("--" + name, option->get_description());
      }
      if (option->get_positional() && each == &at) positionals.push_back(option);
    }
  }
  if (positionals.empty()) return completion;
  const CLI::Option* option = positionals[std::min(positional, positionals.size() - 1)];
  const auto kind = kinds.find(option);
  completion.kind = kind != kinds.end() ? kind->second : option->get_name(true);
  if (const auto found = choices.find(option); found != choices.end()) {
    completion.words.insert(completion.words.end(), found->second.begin(), found->second.end());
  }
  return completion;
}

Subcommand Subcommand::add(const std::string& name, const std::string& description) {
  app_.require_subcommand(1);
  return {line_, *app_.add_subcommand(name, description)};
}

Subcommand& Subcommand::alias(const std::string& name) {
  app_.alias(name);
  return *this;
}

Subcommand& Subcommand::hidden() {
  app_.group("");
  return *this;
}

Subcommand& Subcommand::examples(std::string_view lines) {
  line_.registered_->examples[&app_] = lines;
  return *this;
}

Subcommand& Subcommand::writes(std::vector<OutputFormat> formats) {
  line_.registered_->formatsToRequire.insert(&app_);
  return offers(std::move(formats));
}

Subcommand& Subcommand::offers(std::vector<OutputFormat> formats) {
  line_.registered_->formats[&app_] = std::move(formats);
  return *this;
}

Subcommand& Subcommand::readsInstances(std::vector<std::string>& properties) {
  return offers({OutputFormat::Table, OutputFormat::Json, OutputFormat::Mof, OutputFormat::Xml})
      .repeatable("--property", "PROPERTY", "Only this property; may be repeated", properties);
}

Subcommand& Subcommand::local() {
  line_.registered_->local.insert(&app_);
  return *this;
}

Subcommand& Subcommand::changes() {
  line_.registered_->natures[&app_].changes = true;
  return *this;
}

Subcommand& Subcommand::gathers() {
  line_.registered_->natures[&app_].gathers = true;
  return *this;
}

Subcommand& Subcommand::word(const std::string& name, const std::string& description, std::string& into) {
  addText(app_, name, description, into)->required();
  return *this;
}

Subcommand& Subcommand::optionalWord(const std::string& name, const std::string& description, std::string& into) {
  addText(app_, name, description, into);
  return *this;
}

Subcommand& Subcommand::words(const std::string& name, const std::string& description, Many many,
                              std::vector<std::string>& into, const std::string& kind) {
  CLI::Option* option = addTexts(app_, name, description, into)->required(many != Many::Any);
  if (many == Many::One) option->expected(1);
  if (!kind.empty()) line_.registered_->kinds[option] = kind;
  return *this;
}

Subcommand& Subcommand::choice(const std::string& name, const std::string& description,
                               std::vector<std::string> choices, std::string& into) {
  CLI::Option* option = addText(app_, name, description, into)->required();
  const auto isOne = [choices](const std::string& word) {
    const bool isAmong = std::find(choices.begin(), choices.end(), word) != choices.end();
    return isAmong ? std::string() : word + " not in {" + joined(choices, ",") + "}";
  };
  option->check(isOne, "{" + joined(choices, ",") + "}");
  line_.registered_->choices[option] = std::move(choices);
  return *this;
}

Subcommand& Subcommand::option(const std::string& name, const std::string& kind, const std::string& description,
                               std::string& into) {
  addText(app_, name, description, into)->type_name(kind);
  return *this;
}

Subcommand& Subcommand::repeatable(const std::string& name, const std::string& kind, const std::string& description,
                                   std::vector<std::string>& into) {
  addTexts(app_, name, description, into)->type_name(kind)->allow_extra_args(false);
  return *this;
}

Subcommand& Subcommand::flag(const std::string& name, const std::string& description, bool& into) {
  app_.add_flag_callback(
      name, [&into] { into = true; }, description);
  return *this;
}

Subcommand& Subcommand::dryRun(const char* description) {
  return flag("--dry-run", description, line_.registered_->globals.dryRun);
}

Subcommand& Subcommand::runs(Command command) {
  app_.callback([&read = *line_.registered_, &app = app_, command = std::move(command)] {
    read.chosen = &app;
    read.command = command;
  });
  return *this;
}

CommandLine::CommandLine() : registered_(std::make_unique<Registered>()) {
  CLI::App& app = registered_->app;
  app.require_subcommand(1);
  app.fallthrough();
  app.set_version_flag("--version", std::string("zorvactl ") + ZORVA_VERSION);
  addGlobalOptions(app, registered_->globals);
}

CommandLine::~CommandLine() = default;

Subcommand CommandLine::add(const std::string& name, const std::string& description) {
  CLI::App& app = *registered_->app.add_subcommand(name, description);
  return {*this, app};
}

const Globals& CommandLine::globals() const noexcept { return registered_->globals; }

void CommandLine::run() const {
  if (registered_->globals.quiet) writeOnlyErrors();
  registered_->requireRunnable();
  runOnHosts(registered_->globals, "zorvactl " + callOf(*registered_->chosen),
             registered_->natures[registered_->chosen], registered_->command);
}

std::optional<Telling> CommandLine::read(int argc, const char* const* argv) {
  CLI::App& app = registered_->app;
  registered_->placeFooters(app);
  app.footer(std::string("\nExamples:\n") + kExamples + kClosing);
  try {
    app.parse(argc, argv);
  } catch (const CLI::CallForHelp&) {
    return Telling{app.help()};
  } catch (const CLI::CallForAllHelp&) {
    return Telling{app.help("", CLI::AppFormatMode::All)};
  } catch (const CLI::CallForVersion& version) {
    return Telling{std::string(version.what()) + "\n"};
  } catch (const CLI::ParseError& error) {
    return wrongUsage(app, error);
  }
  return std::nullopt;
}

Completion CommandLine::completionAfter(const std::vector<std::string>& words) const {
  const CLI::App* at = &registered_->app;
  std::size_t positional = 0;
  const CLI::Option* waiting = nullptr;  // an option whose value comes next
  for (const std::string& word : words) {
    if (waiting != nullptr) {
      waiting = nullptr;
    } else if (word.starts_with("-")) {
      const CLI::Option* option = optionNamed(*at, word);
      if (option != nullptr && takesValue(*option)) waiting = option;
    } else if (const CLI::App* subcommand = subcommandNamed(*at, word); subcommand != nullptr && positional == 0) {
      at = subcommand;
    } else {
      ++positional;
    }
  }
  if (waiting == nullptr) return registered_->completionAt(*at, positional);
  Completion completion{.words = {}, .kind = waiting->get_type_name()};
  if (completion.kind == "FORMAT") completion.words = namesOf(registered_->formatsOf(*at));
  return completion;
}

manual::Command CommandLine::description() const {
  const auto complete = [this](const CLI::App& app, manual::Command& command) {
    const auto lines = registered_->examples.find(&app);
    if (lines != registered_->examples.end()) command.examples = lines->second;
    if (app.get_parent() == nullptr) {
      command.examples = kExamples;
    } else {
      command.outputs = namesOf(registered_->formatsOf(app));
    }
  };
  return manual::commandOf(registered_->app, complete);
}

}  // namespace zorva::cli
