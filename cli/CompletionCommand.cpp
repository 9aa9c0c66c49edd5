// completion, and what its script asks.
#include "cli/Commands.h"
#include "cli/Session.h"

namespace zorva::cli {

namespace {

// Words are compared by this program, which knows the classes and interfaces; the shell shows what it prints.
constexpr const char* kBashScript = R"(# Completion of zorvactl for bash: source <(zorvactl completion bash)
_zorvactl() {
  local IFS=$'\n'
  COMPREPLY=($("${COMP_WORDS[0]}" complete -- "${COMP_WORDS[@]:1:COMP_CWORD}" 2>/dev/null))
}
complete -o default -F _zorvactl zorvactl
)";

void addClasses(const Arguments& arguments, std::vector<std::string>& words) {
  Session session(arguments);
  for (const schema::Class* each : session.classes()->classes()) words.push_back(each->name());
}

void addInterfaces(const Arguments& arguments, std::vector<std::string>& words) {
  const Session session(arguments);
  for (const zorvagent::Node& node : session.tree()->nodes()) {
    const std::string* name = node.text(ZV::NodeLexicon::PROP_NAME);
    if (name != nullptr) words.push_back(*name);
  }
}

bool begins(const std::string& word, const std::string& begun) {
  return word.size() >= begun.size() && schema::sameName(std::string_view(word).substr(0, begun.size()), begun);
}

}  // namespace

void writeCompletion(const Arguments&) { write(kBashScript); }

void completeWords(const Arguments& arguments) {
  if (arguments.values.empty()) return;
  const std::string& begun = arguments.values.back();
  Completion completion = completionBehind({arguments.values.begin(), arguments.values.end() - 1});
  if (completion.kind == "CLASS" || completion.kind == "PATH") addClasses(arguments, completion.words);
  if (completion.kind == "INTERFACE") addInterfaces(arguments, completion.words);
  for (const std::string& word : completion.words) {
    // Options only where one is begun: there are more of them than of all else.
    const bool isWanted = word.starts_with("-") == begun.starts_with("-");
    if (isWanted && begins(word, begun)) write(printable(word) + "\n");
  }
}

}  // namespace zorva::cli
