#include "cli/commands/Arguments.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <charconv>
#include <map>
#include <memory>
#include <utility>

#include "cli/commands/Commands.h"
#include "cli/output/Text.h"

namespace zorva::cli {

namespace {

constexpr const char* kExamples = R"(
Examples:
  zorvactl show                                          all at a glance
  zorvactl ei ZORVA_DNSProtocolEndPoint --output json    the DNS client of each interface
  zorvactl get 'ZORVA_DNSProtocolEndPoint.Name="eth0"'   one of them
  zorvactl ai 'ZORVA_DNSProtocolEndPoint.Name="eth0"' --result-class CIM_RemoteServiceAccessPoint
  zorvactl ifcfg init eth0                               give eth0 a file of settings
  zorvactl dns set eth0 192.0.2.53 2001:db8::53          and change them
  zorvactl --url http://localhost:5988/root/cimv2 show   what a CIM server says

A path may leave out keys where the rest is clear, and take any spelling of names. Exit status: 0 done, 1 the operation
failed, 2 wrong usage or configuration. "zorvactl SUBCOMMAND --help" tells more.)";

/// What stands at the end of a subcommand's help: how it is called, a line each.
struct SubcommandExamples {
  std::string_view name;
  std::string_view lines;
};

constexpr SubcommandExamples kSubcommandExamples[] = {
    {"show",
     "  zorvactl show\n"
     "  zorvactl show --output json\n"
     "  zorvactl show --url http://localhost:5988/root/cimv2"},
    {"tree",
     "  zorvactl tree\n"
     "  zorvactl tree --output json > tree.json       to be read back as [tree] source = \"file\""},
    {"classes", "  zorvactl classes"},
    {"graph",
     "  zorvactl graph\n"
     "  zorvactl graph 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"'\n"
     "  zorvactl graph --output svg > dns.svg         needs Graphviz"},
    {"enumerate",
     "  zorvactl ei ZORVA_DNSProtocolEndPoint\n"
     "  zorvactl ei ZORVA_DNSSettingData --property DomainName --property DNSServerAddresses --output json\n"
     "  zorvactl ei CIM_SettingData                   and of all classes below it"},
    {"names", "  zorvactl ein ZORVA_DNSSettingData"},
    {"get",
     "  zorvactl gi 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"'\n"
     "  zorvactl gi 'ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"' --output mof\n"
     "  zorvactl gi ZORVA_DNSGeneralSettingData       the only one needs no keys"},
    {"associators",
     "  zorvactl ai 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' --result-class CIM_RemoteServiceAccessPoint\n"
     "  zorvactl ai 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' --assoc-class ZORVA_DNSEndPointElementSettingData"},
    {"associator-names",
     "  zorvactl ain 'ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"'\n"
     "  zorvactl ain 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' --role Dependent --result-role Antecedent"},
    {"references", "  zorvactl ri 'ZORVA_RemoteServiceAccessPoint.Name=\"192.0.2.53\"'"},
    {"reference-names",
     "  zorvactl rin 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' --result-class ZORVA_DNSHostedAccessPoint"},
    {"modify",
     "  zorvactl modify 'ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"' DomainName=lab.example.org\n"
     "  zorvactl modify 'ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"' \\\n"
     "    DNSServerAddresses=192.0.2.1 DNSServerAddresses=192.0.2.2\n"
     "  zorvactl modify 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' DomainName=node.example.org --dry-run"},
    {"invoke", "  zorvactl invoke 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' SetDNSDomain DNSDomain=x.example.org"},
    {"ifcfg", "  zorvactl ifcfg init eth0\n  zorvactl ifcfg show eth0"},
    {"ifcfg init",
     "  zorvactl ifcfg init eth0 --dry-run            what it would write\n"
     "  zorvactl ifcfg init eth0 --force              puts a new file in the old one's place"},
    {"ifcfg show", "  zorvactl ifcfg show eth0"},
    {"dns", "  zorvactl dns set eth0 192.0.2.53 2001:db8::53\n  zorvactl dns add eth0 192.0.2.54"},
    {"dns show", "  zorvactl dns show eth0"},
    {"dns set",
     "  zorvactl dns set eth0 192.0.2.53 2001:db8::53\n"
     "  zorvactl dns set eth0                         none at all"},
    {"dns add", "  zorvactl dns add eth0 192.0.2.54"},
    {"dns remove", "  zorvactl dns remove eth0 192.0.2.54"},
    {"domain", "  zorvactl domain eth0 lab.example.org\n  zorvactl domain eth0 ''"},
    {"suffixes", "  zorvactl suffixes set example.org example.net\n  zorvactl suffixes add lab.example.org"},
    {"suffixes show", "  zorvactl suffixes show"},
    {"suffixes set", "  zorvactl suffixes set example.org example.net"},
    {"suffixes add", "  zorvactl suffixes add lab.example.org"},
    {"suffixes remove", "  zorvactl suffixes remove lab.example.org"},
    {"overlay", "  zorvactl overlay show\n  zorvactl overlay clear eth0"},
    {"overlay show", "  zorvactl overlay show"},
    {"overlay clear",
     "  zorvactl overlay clear eth0\n"
     "  zorvactl overlay clear                        of all interfaces"},
    {"completion", "  source <(zorvactl completion bash)            in ~/.bashrc"},
};

/// The formats that a subcommand, or one under it, can write.
std::vector<std::string> formatsOf(const CLI::App& subcommand) {
  const CLI::App* top = &subcommand;
  while (top->get_parent() != nullptr && top->get_parent()->get_parent() != nullptr) top = top->get_parent();
  const std::string& name = top->get_name();
  if (top->get_parent() == nullptr) return {"table", "json", "mof", "xml", "dot", "svg"};
  if (name == "graph") return {"table", "json", "dot", "svg"};
  for (const char* each : {"enumerate", "get", "associators", "references"}) {
    if (name == each) return {"table", "json", "mof", "xml"};
  }
  if (name == "completion" || subcommand.get_name() == "clear") return {"table"};
  return {"table", "json"};
}

/// "dns set": the words that call a subcommand.
std::string callOf(const CLI::App& subcommand) {
  const CLI::App* parent = subcommand.get_parent();
  if (parent == nullptr) return {};
  const std::string before = callOf(*parent);
  return before + (before.empty() ? "" : " ") + subcommand.get_name();
}

void addFooter(CLI::App& subcommand) {
  const std::string call = callOf(subcommand);
  std::string text;
  for (const SubcommandExamples& each : kSubcommandExamples) {
    if (each.name == call) text += "\nExamples:\n" + std::string(each.lines) + "\n";
  }
  const std::vector<std::string> formats = formatsOf(subcommand);
  if (formats.size() > 1) text += "\nIt writes " + joined(formats, ", ") + " (--output).";
  subcommand.footer(text +
                    "\nThe options of zorvactl itself may stand here as well: --url, --config, --log-level, "
                    "--provider-dir.");
}

const std::map<std::string, OutputFormat> kFormats = {
    {"table", OutputFormat::Table}, {"json", OutputFormat::Json}, {"mof", OutputFormat::Mof},
    {"xml", OutputFormat::Xml},     {"dot", OutputFormat::Dot},   {"svg", OutputFormat::Svg},
};

int levelOf(const std::string& word) {
  int level = 0;
  const auto [end, error] = std::from_chars(word.data(), word.data() + word.size(), level);
  if (error == std::errc() && end == word.data() + word.size() && level >= 0) return level;
  throw CLI::ValidationError("--log-level", "'" + printable(word) + "' is no level: a number from 0 on is wanted");
}

/// Builds the tree of subcommands; each sets the command that is to run.
class CommandLine {
 public:
  CommandLine();

  CLI::App& app() { return app_; }
  Invocation& invocation() { return invocation_; }

 private:
  CLI::App* add(CLI::App& parent, const std::string& name, const std::string& description, const Command& command);
  CLI::Option* target(CLI::App* subcommand, const std::string& name, const std::string& description);
  CLI::Option* values(CLI::App* subcommand, const std::string& name, const std::string& description);
  void addGlobalOptions();
  void addOverviews();
  void addReading();
  void addAssociations();
  void addChanges();
  void addSettings();
  void addOverlay();
  void addCompletion();
  void addPropertyOption(CLI::App* subcommand);

  CLI::App app_{"The DNS client configuration of this host as CIM objects; no server is needed.", "zorvactl"};
  Invocation invocation_;
};

CommandLine::CommandLine() {
  app_.require_subcommand(1);
  app_.fallthrough();
  app_.set_version_flag("--version", std::string("zorvactl ") + ZORVA_VERSION);
  addGlobalOptions();
  addOverviews();
  addReading();
  addAssociations();
  addChanges();
  addSettings();
  addOverlay();
  addCompletion();
  app_.footer(kExamples);
  for (CLI::App* subcommand : app_.get_subcommands([](CLI::App*) { return true; })) {
    addFooter(*subcommand);
    for (CLI::App* below : subcommand->get_subcommands([](CLI::App*) { return true; })) addFooter(*below);
  }
}

CLI::App* CommandLine::add(CLI::App& parent, const std::string& name, const std::string& description,
                           const Command& command) {
  CLI::App* subcommand = parent.add_subcommand(name, description);
  subcommand->callback([this, command] { invocation_.command = command; });
  return subcommand;
}

CLI::Option* CommandLine::target(CLI::App* subcommand, const std::string& name, const std::string& description) {
  return subcommand->add_option(name, invocation_.arguments.target, description)->required();
}

void CommandLine::addGlobalOptions() {
  Arguments& arguments = invocation_.arguments;
  app_.add_option_function<std::string>(
          "-o,--output",
          [&arguments](const std::string& word) {
            const auto format = kFormats.find(word);
            if (format == kFormats.end()) {
              throw CLI::ValidationError("--output",
                                         "'" + printable(word) + "' is none of table, json, mof, xml, dot, svg");
            }
            arguments.output = format->second;
          },
          "How to write the results: table, json, mof, xml; graph: dot, svg")
      ->type_name("FORMAT");
  CLI::Option* config = app_.add_option("--config", arguments.config,
                                        "The agent's configuration (default: $ZORVAGENT_CONFIG, else "
                                        "/etc/zorvagent/agent.toml)")
                            ->type_name("FILE");
  app_.add_option_function<std::string>(
          "--log-level", [&arguments](const std::string& word) { arguments.logLevel = levelOf(word); },
          "Show log lines from this level on: 3000 flow, 4000 detail, 6000 errors")
      ->type_name("N");
  CLI::Option* directory =
      app_.add_option("--provider-dir", arguments.providerDirectory, "Where the provider libraries lie")
          ->type_name("DIR");
  app_.add_option("--url", arguments.url, "Ask this CIM server, and not the providers: http://HOST:PORT/NAMESPACE")
      ->type_name("URL")
      ->excludes(config)
      ->excludes(directory);
}

void CommandLine::addPropertyOption(CLI::App* subcommand) {
  subcommand->add_option("--property", invocation_.arguments.properties, "Only this property; may be repeated")
      ->type_name("PROPERTY")
      ->allow_extra_args(false);
}

void CommandLine::addOverviews() {
  const auto all = [this](CLI::App* subcommand, const char* description) {
    subcommand->add_flag("--all", invocation_.arguments.all, description);
  };
  constexpr const char* kCountsAll = "Count the associations of a host with very many interfaces, too; takes long";
  all(add(app_, "show", "The endpoints, servers and settings of this host at a glance", showHost), kCountsAll);
  add(app_, "tree", "The agent's instrumentation tree", showTree);
  all(add(app_, "classes", "The classes with their providers and instance counts", listClasses), kCountsAll);
  CLI::App* graph = add(app_, "graph", "The objects and how they are associated", showGraph);
  graph->add_option("PATH", invocation_.arguments.target, "Begin at this object; without it, all are shown");
  all(graph, "Follow all objects of a host with very many interfaces, too; takes long");
}

void CommandLine::addReading() {
  CLI::App* enumerate = add(app_, "enumerate", "All instances of a class", enumerateInstances)->alias("ei");
  target(enumerate, "CLASS", "The class, or one above it");
  addPropertyOption(enumerate);
  CLI::App* names = add(app_, "names", "The names of all instances of a class", enumerateNames)->alias("ein");
  target(names, "CLASS", "The class, or one above it");
  CLI::App* get = add(app_, "get", "One instance", getInstance)->alias("gi");
  target(get, "PATH", "Its object path");
  addPropertyOption(get);
}

void CommandLine::addAssociations() {
  Arguments& arguments = invocation_.arguments;
  const auto addOne = [&](const char* name, const char* alias, const char* description, const Command& command) {
    CLI::App* subcommand = add(app_, name, description, command)->alias(alias);
    target(subcommand, "PATH", "The object path at the near end");
    subcommand->add_option("--role", arguments.role, "Only where the near end stands at this reference")
        ->type_name("ROLE");
    return subcommand;
  };
  for (CLI::App* subcommand :
       {addOne("associators", "ai", "The objects that an object is associated with", showAssociators),
        addOne("associator-names", "ain", "Their names", showAssociatorNames)}) {
    subcommand->add_option("--assoc-class", arguments.associationClass, "Only through this association")
        ->type_name("CLASS");
    subcommand->add_option("--result-class", arguments.resultClass, "Only objects of this class")->type_name("CLASS");
    subcommand->add_option("--result-role", arguments.resultRole, "Only where the far end stands at this reference")
        ->type_name("ROLE");
  }
  for (CLI::App* subcommand : {addOne("references", "ri", "The associations of an object", showReferences),
                               addOne("reference-names", "rin", "Their names", showReferenceNames)}) {
    subcommand
        ->add_option("--result-class,--assoc-class", arguments.associationClass, "Only associations of this class")
        ->type_name("CLASS");
  }
  addPropertyOption(app_.get_subcommand("associators"));
  addPropertyOption(app_.get_subcommand("references"));
}

void CommandLine::addChanges() {
  Arguments& arguments = invocation_.arguments;
  CLI::App* modify = add(app_, "modify", "Change properties of an instance", modifyInstance)->alias("mi");
  target(modify, "PATH", "Its object path");
  values(modify, "NAME=VALUE", "A property; repeat its name for an array, NAME= empties it, NAME=null is CIM's NULL")
      ->required();
  modify->add_flag("--only", arguments.only, "Send these properties alone, and not the others as they were read");
  modify->add_flag("--dry-run", arguments.dryRun, "Show what would be sent, and send nothing");
  CLI::App* invoke = add(app_, "invoke", "Call a method of an instance", invokeMethod)->alias("cm");
  target(invoke, "PATH", "Its object path");
  invoke->add_option("METHOD", arguments.method, "The method")->required();
  values(invoke, "NAME=VALUE", "A parameter; repeat its name for an array");
}

void CommandLine::addSettings() {
  Arguments& arguments = invocation_.arguments;
  const auto addParent = [&](const char* name, const char* description) {
    return app_.add_subcommand(name, description)->require_subcommand(1);
  };
  const auto dryRun = [&](CLI::App* subcommand) {
    subcommand->add_flag("--dry-run", arguments.dryRun, "Show what would be done, and do nothing");
    return subcommand;
  };
  const auto ofInterface = [&](CLI::App* subcommand) {
    target(subcommand, "INTERFACE", "The interface's name");
    return subcommand;
  };

  CLI::App* ifcfg = addParent("ifcfg", "The file of an interface's settings");
  CLI::App* init = add(*ifcfg, "init", "Write it, with what the host says now", initInterfaceFile);
  dryRun(ofInterface(init))->add_flag("--force", arguments.force, "Replace a file that is there");
  ofInterface(add(*ifcfg, "show", "Show it", showInterfaceFile));

  CLI::App* dns = addParent("dns", "The DNS servers of an interface");
  ofInterface(add(*dns, "show", "Show them", showServers));
  values(dryRun(ofInterface(add(*dns, "set", "Replace them; none at all empties the list", setServers))), "SERVER",
         "An IP address");
  values(dryRun(ofInterface(add(*dns, "add", "Add servers behind the others", addServers))), "SERVER", "An IP address")
      ->required();
  values(dryRun(ofInterface(add(*dns, "remove", "Remove servers", removeServers))), "SERVER", "An IP address")
      ->required();

  CLI::App* domain = dryRun(ofInterface(add(app_, "domain", "Set the DNS domain of an interface", setDomain)));
  values(domain, "NAME", "The domain's name; '' empties it")->required()->expected(1);

  CLI::App* suffixes = addParent("suffixes", "The DNS suffixes of the host");
  add(*suffixes, "show", "Show them", showSuffixes);
  values(dryRun(add(*suffixes, "set", "Replace them; none at all empties the list", setSuffixes)), "SUFFIX",
         "A domain's name");
  values(dryRun(add(*suffixes, "add", "Add suffixes behind the others", addSuffixes)), "SUFFIX", "A domain's name")
      ->required();
  values(dryRun(add(*suffixes, "remove", "Remove suffixes", removeSuffixes)), "SUFFIX", "A domain's name")->required();
}

void CommandLine::addOverlay() {
  CLI::App* overlay =
      app_.add_subcommand("overlay", "Values that were set and stand in for the host's own")->require_subcommand(1);
  add(*overlay, "show", "Show them", showOverlay);
  add(*overlay, "clear", "Take them back", clearOverlay)
      ->add_option("INTERFACE", invocation_.arguments.target, "Of this interface alone");
}

void CommandLine::addCompletion() {
  CLI::App* completion = add(app_, "completion", "Print the completion script of a shell", writeCompletion);
  target(completion, "SHELL", "bash")->check(CLI::IsMember({"bash"}));
  // For that script alone.
  values(add(app_, "complete", "", completeWords)->group(""), "WORD", "");
}

CLI::Option* CommandLine::values(CLI::App* subcommand, const std::string& name, const std::string& description) {
  return subcommand->add_option(name, invocation_.arguments.values, description);
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

/// What a word at a place of its own can be: a subcommand, an option, or the positional of that number.
Completion completionAt(const CLI::App& at, std::size_t positional) {
  Completion completion;
  for (const CLI::App* subcommand : at.get_subcommands([](const CLI::App*) { return true; })) {
    if (!subcommand->get_group().empty()) completion.words.push_back(subcommand->get_name());
  }
  std::vector<const CLI::Option*> positionals;
  for (const CLI::App* app = &at; app != nullptr; app = app->get_parent()) {
    for (const CLI::Option* option : app->get_options()) {
      for (const std::string& name : option->get_lnames()) addOnce(completion.words, "--" + name);
      if (option->get_positional() && app == &at) positionals.push_back(option);
    }
  }
  if (positionals.empty()) return completion;
  completion.kind = positionals[std::min(positional, positionals.size() - 1)]->get_name(true);
  if (completion.kind == "SHELL") completion.words.emplace_back("bash");
  // Names of properties and parameters.
  if (completion.kind == "NAME=VALUE") completion.kind = at.get_name() == "invoke" ? "PARAMETER=" : "PROPERTY=";
  return completion;
}

}  // namespace

const char* formatName(OutputFormat format) noexcept {
  switch (format) {
    case OutputFormat::Table:
      return "table";
    case OutputFormat::Json:
      return "json";
    case OutputFormat::Mof:
      return "mof";
    case OutputFormat::Xml:
      return "xml";
    case OutputFormat::Dot:
      return "dot";
    case OutputFormat::Svg:
      break;
  }
  return "svg";
}

namespace {

/// The error in words that name the subcommand, and where its usage is told.
Telling wrongUsage(const CLI::App& app, const CLI::ParseError& error) {
  const CLI::App* at = &app;
  while (!at->get_subcommands().empty()) at = at->get_subcommands().back();
  const std::string call = "zorvactl" + (at == &app ? std::string() : " " + callOf(*at));
  if (at->get_require_subcommand_min() == 0 || dynamic_cast<const CLI::RequiredError*>(&error) == nullptr) {
    const std::vector<std::string> unknown = app.remaining(true);
    const bool isLikeAnOption = std::any_of(unknown.begin(), unknown.end(), [](const std::string& word) {
      return word.size() > 1 && word.starts_with('-');
    });
    return {printable(error.what()), true,
            (isLikeAnOption ? "a value that begins with '-' goes after --; " : "") + call + " --help shows the usage"};
  }
  std::vector<std::string> names;
  for (const CLI::App* each : at->get_subcommands([](const CLI::App*) { return true; })) {
    if (!each->get_group().empty()) names.push_back(each->get_name());
  }
  const std::vector<std::string> unknown = app.remaining(true);
  return {
      unknown.empty() ? call + " needs a subcommand" : call + " has no subcommand '" + printable(unknown.front()) + "'",
      true, "it has " + joined(names, ", ") + "; " + call + " --help tells more"};
}

}  // namespace

std::variant<Invocation, Telling> readArguments(int argc, const char* const* argv) {
  CommandLine line;
  try {
    line.app().parse(argc, argv);
  } catch (const CLI::CallForHelp&) {
    return Telling{line.app().help()};
  } catch (const CLI::CallForAllHelp&) {
    return Telling{line.app().help("", CLI::AppFormatMode::All)};
  } catch (const CLI::CallForVersion& version) {
    return Telling{std::string(version.what()) + "\n"};
  } catch (const CLI::ParseError& error) {
    return wrongUsage(line.app(), error);
  }
  return std::move(line.invocation());
}

Completion completionBehind(const std::vector<std::string>& words) {
  CommandLine line;
  const CLI::App* at = &line.app();
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
  if (waiting == nullptr) return completionAt(*at, positional);
  Completion completion{{}, waiting->get_type_name()};
  if (completion.kind == "FORMAT") completion.words = formatsOf(*at);
  return completion;
}

}  // namespace zorva::cli
