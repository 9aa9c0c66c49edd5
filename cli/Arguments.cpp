#include "cli/Arguments.h"

#include <CLI/CLI.hpp>
#include <map>
#include <memory>
#include <utility>

#include "cli/Commands.h"
#include "cli/Text.h"

namespace zorva::cli {

namespace {

constexpr const char* kExamples = R"(
Examples:
  zorvactl show
  zorvactl tree --output json
  zorvactl ei ZORVA_DNSProtocolEndPoint --output json
  zorvactl get 'ZORVA_DNSProtocolEndPoint.Name="eth0"'

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
  void addGlobalOptions();
  void addReading();

  CLI::App app_{"The DNS client configuration of this host as CIM objects, without a server.", "zorvactl"};
  Invocation invocation_;
};

CommandLine::CommandLine() {
  app_.require_subcommand(1);
  app_.fallthrough();
  app_.footer(kExamples);
  app_.set_version_flag("--version", std::string("zorvactl ") + ZORVA_VERSION);
  addGlobalOptions();
  addReading();
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

void CommandLine::addReading() {
  add(app_, "show", "The endpoints, servers and settings of this host at a glance", showHost);
  add(app_, "tree", "The agent's instrumentation tree", showTree);
  add(app_, "classes", "The classes with their providers and instance counts", listClasses);
  CLI::App* enumerate = add(app_, "enumerate", "All instances of a class", enumerateInstances)->alias("ei");
  target(enumerate, "CLASS", "The class, or one above it");
  CLI::App* names = add(app_, "names", "The names of all instances of a class", enumerateNames)->alias("ein");
  target(names, "CLASS", "The class, or one above it");
  CLI::App* get = add(app_, "get", "One instance", getInstance)->alias("gi");
  target(get, "PATH", "Its object path");
  for (CLI::App* subcommand : {enumerate, get}) {
    subcommand->add_option("--property", invocation_.arguments.properties, "Only this property; may be repeated")
        ->type_name("NAME")
        ->expected(1)
        ->take_all();
  }
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

}  // namespace zorva::cli
