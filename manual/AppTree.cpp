#include "manual/AppTree.h"

#include <CLI/CLI.hpp>

namespace zorva::manual {

namespace {

bool isRepeatable(const CLI::Option& option) {
  return option.get_items_expected_max() >= CLI::detail::expected_max_vector_size;
}

DeclaredOption argumentOf(const CLI::Option& option) {
  return {option.get_name(true), {}, {}, option.get_description(), option.get_required(), isRepeatable(option)};
}

DeclaredOption optionOf(const CLI::Option& option) {
  const bool takesValue = option.get_items_expected_max() > 0;
  // A validator's text, as in "N:INT in [0 - 65535]", is part of the type's name.
  const std::string type = option.get_type_name();
  return {option.get_lnames().empty() ? std::string() : "--" + option.get_lnames().front(),
          option.get_snames().empty() ? std::string() : "-" + option.get_snames().front(),
          takesValue ? type.substr(0, type.find(':')) : std::string(),
          option.get_description(),
          option.get_required(),
          takesValue && isRepeatable(option)};
}

std::string callOf(const CLI::App& app) {
  return app.get_parent() == nullptr ? app.get_name() : callOf(*app.get_parent()) + " " + app.get_name();
}

}  // namespace

Command commandOf(const CLI::App& app, const std::function<void(const CLI::App&, Command&)>& complete) {
  Command command{callOf(app), app.get_description(), app.get_aliases(), {}, {}, {}, {}, {}};
  for (const CLI::Option* each : app.get_options()) {
    if (each->get_positional()) {
      command.arguments.push_back(argumentOf(*each));
    } else if (!each->get_group().empty()) {
      command.options.push_back(optionOf(*each));
    }
  }
  for (const CLI::App* each : app.get_subcommands([](const CLI::App* one) { return !one->get_group().empty(); })) {
    command.commands.push_back(commandOf(*each, complete));
  }
  if (complete) complete(app, command);
  return command;
}

}  // namespace zorva::manual
