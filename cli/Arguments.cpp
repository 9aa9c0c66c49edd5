#include "cli/Arguments.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <map>
#include <memory>
#include <utility>

#include "cli/Commands.h"
#include "cli/Text.h"

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

A path may leave out keys where the rest is clear, and take any spelling of names. Exit status: 0 done, 1 the operation
failed, 2 wrong usage or configuration.)";

const std::map<std::string, OutputFormat> kFormats = {
    {"table", OutputFormat::Table}, {"json", OutputFormat::Json}, {"mof", OutputFormat::Mof},
    {"xml", OutputFormat::Xml},     {"dot", OutputFormat::Dot},   {"svg", OutputFormat::Svg},
};

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

  CLI::App app_{"The DNS client configuration of this host as CIM objects, without a server.", "zorvactl"};
  Invocation invocation_;
};

CommandLine::CommandLine() {
  app_.require_subcommand(1);
  app_.fallthrough();
  // What subcommands have at the end of their help: they take over what stands here when they are added.
  app_.footer(
      "\nThe options of zorvactl itself may stand here as well: --output, --config, --log-level, --provider-dir.");
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
  app_.add_option("--config", arguments.config,
                  "The agent's configuration (default: $ZORVAGENT_CONFIG, else "
                  "/etc/zorvagent/agent.toml)")
      ->type_name("FILE");
  app_.add_option("--log-level", arguments.logLevel,
                  "Show log lines from this level on: 3000 flow, 4000 detail, 6000 errors")
      ->type_name("N");
  app_.add_option("--provider-dir", arguments.providerDirectory, "Where the provider libraries lie")->type_name("DIR");
}

void CommandLine::addPropertyOption(CLI::App* subcommand) {
  subcommand->add_option("--property", invocation_.arguments.properties, "Only this property; may be repeated")
      ->type_name("NAME")
      ->allow_extra_args(false);
}

void CommandLine::addOverviews() {
  add(app_, "show", "The endpoints, servers and settings of this host at a glance", showHost);
  add(app_, "tree", "The agent's instrumentation tree", showTree);
  add(app_, "classes", "The classes with their providers and instance counts", listClasses);
  CLI::App* graph = add(app_, "graph", "The objects and how they are associated", showGraph);
  graph->add_option("PATH", invocation_.arguments.target, "Begin at this object; without it, all are shown");
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
        ->type_name("NAME");
    return subcommand;
  };
  for (CLI::App* subcommand :
       {addOne("associators", "ai", "The objects that an object is associated with", showAssociators),
        addOne("associator-names", "ain", "Their names", showAssociatorNames)}) {
    subcommand->add_option("--assoc-class", arguments.associationClass, "Only through this association")
        ->type_name("CLASS");
    subcommand->add_option("--result-class", arguments.resultClass, "Only objects of this class")->type_name("CLASS");
    subcommand->add_option("--result-role", arguments.resultRole, "Only where the far end stands at this reference")
        ->type_name("NAME");
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

/// What a word at a place of its own can be: a subcommand, an option, or the positional of that number.
Completion completionAt(const CLI::App& at, std::size_t positional) {
  Completion completion;
  for (const CLI::App* subcommand : at.get_subcommands([](const CLI::App*) { return true; })) {
    if (!subcommand->get_group().empty()) completion.words.push_back(subcommand->get_name());
  }
  std::vector<const CLI::Option*> positionals;
  for (const CLI::App* app = &at; app != nullptr; app = app->get_parent()) {
    for (const CLI::Option* option : app->get_options()) {
      for (const std::string& name : option->get_lnames()) completion.words.push_back("--" + name);
      if (option->get_positional() && app == &at) positionals.push_back(option);
    }
  }
  if (!positionals.empty()) {
    completion.kind = positionals[std::min(positional, positionals.size() - 1)]->get_name(true);
  }
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
    return Telling{printable(error.what()), true};
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
  if (completion.kind == "FORMAT") {
    for (const auto& [word, format] : kFormats) completion.words.push_back(word);
  }
  return completion;
}

}  // namespace zorva::cli
