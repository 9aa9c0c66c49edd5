#include "server/CommandLine.h"

#include <CLI/CLI.hpp>
#include <filesystem>

#include "http/Listener.h"
#include "manual/AppTree.h"
#include "server/Manual.h"

namespace zorva::server {

namespace {

constexpr const char* kExamples =
    R"(  zorvacimd                                     serve as /etc/zorvagent/zorvacimd.toml says
  zorvacimd --port 0                            on a port that is free, and print it
  zorvacimd --listen ::1 --log-level 4500       on one address, with a log line for each request
  zorvacimd --anonymous operate                 every user of this host may change settings
  zorvacimd --config my.toml --check-config     is that configuration good?
  zorvacimd --make-certificate                  a certificate for HTTPS, where there is none)";

constexpr const char* kClosing = R"(

Plain HTTP is for this host only; other hosts use HTTPS ([tls] in the configuration). SIGHUP reads the configuration
and the certificate again, SIGTERM ends it when the requests in work are done. Exit status: 0 ended as it was told to, 1 it cannot serve, 2 wrong usage or configuration.
man zorvacimd tells more, and man zorvacimd.toml explains every key.)";

void addOptions(CLI::App& app, CommandLine& line) {
  app.add_option("--config", line.configFile, "The configuration (default: /etc/zorvagent/zorvacimd.toml)")
      ->type_name("FILE");
  app.add_option("--listen", line.addresses, "Listen on this loopback address; may be repeated")
      ->type_name("ADDRESS")
      ->allow_extra_args(false);
  app.add_option("--port", line.port, "Listen on this port (default: 5988); 0 takes one that is free and prints it")
      ->type_name("N")
      ->check(CLI::Range(0, 65535));
  app.add_option("--log-level", line.logLevel,
                 "Log lines from this level on: 4500 each request, 5000 changes and what was refused (the default), "
                 "6000 errors")
      ->type_name("N");
  app.add_option("--anonymous", line.anonymous,
                 "What clients of this host may do without a login: read (the default), operate or none")
      ->type_name("ROLE")
      ->check(CLI::IsMember({"read", "operate", "none"}));
  app.add_option("--agent-config", line.agentConfig,
                 "The agent's configuration (default: $ZORVAGENT_CONFIG, else /etc/zorvagent/agent.toml)")
      ->type_name("FILE");
  app.add_option("--provider-dir", line.providerDirectory, "Where the provider libraries lie")->type_name("DIR");
  app.add_option("--providers", line.addedProviders,
                 "Further providers: the files .reg and .mof of a directory (default: /etc/zorvagent/providers.d)")
      ->type_name("DIR");
  app.add_flag("--check-config", line.checkConfig, "Tell whether the configuration is good, and end");
  app.add_flag("--make-certificate", line.makeCertificate,
               "Write a self-signed certificate for HTTPS and its key, print its fingerprint, and end");
  app.add_flag("--greet", line.greet, "Print how to ask this server something, as on a terminal");
  // For the build only.
  app.add_option("--manual", line.manualDirectory, "")->group("");
}

Telling tellManual(const CLI::App& app, const std::string& directory) try {
  manual::Command program = manual::commandOf(app);
  program.examples = kExamples;
  writeManual(directory, program);
  return {};
} catch (const std::runtime_error& error) {
  return {error.what(), true};
}

std::string absolute(const std::string& path) { return path.empty() ? path : std::filesystem::absolute(path).string(); }

}  // namespace

std::variant<CommandLine, Telling> readCommandLine(int argc, const char* const* argv) {
  CommandLine line;
  CLI::App app("A CIM server: CIM-XML over HTTP (DSP0200, DSP0201) for the DNS client configuration of this host.",
               "zorvacimd");
  app.set_version_flag("--version", std::string("zorvacimd ") + ZORVA_VERSION);
  app.footer(std::string("\nExamples:\n") + kExamples + kClosing);
  addOptions(app, line);
  try {
    app.parse(argc, argv);
  } catch (const CLI::CallForHelp&) {
    return Telling{app.help(), false};
  } catch (const CLI::CallForVersion& version) {
    return Telling{std::string(version.what()) + "\n", false};
  } catch (const CLI::ParseError& error) {
    return Telling{std::string(error.what()) + "\nzorvacimd --help shows the usage", true};
  }
  return line.manualDirectory.empty() ? std::variant<CommandLine, Telling>(line)
                                      : tellManual(app, line.manualDirectory);
}

Config configOf(const CommandLine& line) {
  Config config = line.configFile.empty() ? readDefaultConfig() : readConfig(line.configFile);
  if (line.addresses.has_value()) config.addresses = line.addresses;
  if (line.port.has_value()) config.port = *line.port;
  if (line.logLevel.has_value()) config.logLevel = *line.logLevel;
  if (line.anonymous.has_value()) config.access.anonymous = access::roleOf(*line.anonymous).value();
  if (!line.agentConfig.empty()) config.agentConfig = absolute(line.agentConfig);
  if (!line.providerDirectory.empty()) config.providerDirectory = absolute(line.providerDirectory);
  if (!line.addedProviders.empty()) config.addedProviders = absolute(line.addedProviders);
  if (config.addresses.has_value()) http::checkAddresses(*config.addresses);
  if (config.tlsAddresses.has_value()) http::checkAddresses(*config.tlsAddresses, http::Door::Https);
  return config;
}

}  // namespace zorva::server
