// completion, and the hidden command of its script.

#include <algorithm>

#include "cli/commands/Commands.h"
#include "cli/output/Console.h"
#include "cli/session/Session.h"
#include "cli/session/SettingFiles.h"

namespace zorva::cli {

namespace {

// This program compares the words, because it knows the classes and interfaces; the shell shows the printed ones.
constexpr const char* kBashScript = R"(# Completion of zorvactl for bash: source <(zorvactl completion bash)
_zorvactl() {
  local IFS=$'\n'
  COMPREPLY=($("${COMP_WORDS[0]}" complete -- "${COMP_WORDS[@]:1:COMP_CWORD}" 2>/dev/null))
  if [[ ${COMPREPLY[0]} == *= ]]; then compopt -o nospace 2>/dev/null; fi
}
complete -o default -F _zorvactl zorvactl
)";

/// The words as they were typed: bash splits words at "=" and ":".
std::vector<std::string> joinedWords(const std::vector<std::string>& words) {
  const auto isBreak = [](const std::string& word) { return word == "=" || word == ":"; };
  std::vector<std::string> out;
  bool continues = false;
  for (const std::string& word : words) {
    if (!out.empty() && (continues || isBreak(word))) {
      out.back() += word;
    } else {
      out.push_back(word);
    }
    continues = isBreak(word);
  }
  return out;
}

/// The class of a path among the words; the path is as typed, with the shell's quotes. Null: none.
const schema::Class* classAmong(const schema::ClassRepository& classes, const std::vector<std::string>& words) {
  for (const std::string& word : words) {
    const std::size_t from = word.find_first_not_of("'\"");
    if (from == std::string::npos) continue;
    const std::string_view path = std::string_view(word).substr(from, word.find_first_of(".'\"", from) - from);
    const std::size_t colon = path.rfind(':');
    const schema::Class* found = classes.find(colon == std::string_view::npos ? path : path.substr(colon + 1));
    if (found != nullptr) return found;
  }
  return nullptr;
}

void addRoles(const schema::ClassRepository& classes, const schema::Class& source, std::vector<std::string>& words) {
  for (const schema::Class* association : classes.associationsOf(source)) {
    for (const schema::ClassProperty* each : association->references()) {
      if (std::find(words.begin(), words.end(), each->name) == words.end()) words.push_back(each->name);
    }
  }
}

/// The completions that depend on a class: its methods, properties, the parameters of its methods, the roles at its
/// associations.
void addNamesOf(const schema::ClassRepository& classes, const std::vector<std::string>& before,
                Completion& completion) {
  const schema::Class* found = classAmong(classes, before);
  if (found == nullptr) return;
  const std::string end = completion.kind.ends_with("=") ? "=" : "";
  if (completion.kind == "METHOD") {
    for (const schema::ClassMethod* each : found->methods()) completion.words.push_back(each->name);
  } else if (completion.kind == "ROLE") {
    addRoles(classes, *found, completion.words);
  } else if (completion.kind == "PARAMETER=") {
    for (const std::string& word : before) {
      const schema::ClassMethod* method = found->findMethod(word);
      if (method == nullptr) continue;
      for (const schema::Parameter& each : method->parameters) completion.words.push_back(each.name + end);
    }
  } else if (completion.kind.starts_with("PROPERTY")) {
    for (const schema::ClassProperty* each : found->properties()) {
      if (end.empty() || !each->isKey) completion.words.push_back(each->name + end);
    }
  }
}

void addInterfaces(const Globals& globals, std::vector<std::string>& words) {
  const Session session(globals);
  for (const zorva::agent::Node& node : session.tree()->nodes()) {
    const std::string* name = node.text(ZV::NodeLexicon::PROP_NAME);
    if (name != nullptr) words.push_back(*name);
  }
}

/// Those that are gone and have a file.
void addOrphans(const Globals& globals, std::vector<std::string>& words) {
  const Session session(globals);
  const std::vector<std::string> orphans = orphansAmong(findSettingFiles(), *session.tree());
  words.insert(words.end(), orphans.begin(), orphans.end());
}

bool begins(const std::string& word, const std::string& begun) {
  return word.size() >= begun.size() && util::sameName(std::string_view(word).substr(0, begun.size()), begun);
}

Completion completionOf(const CommandLine& line, const Globals& globals, const std::vector<std::string>& before) {
  Completion completion = line.completionAfter(before);
  if (completion.kind == "INTERFACE") {
    // Those of another host are not known here.
    const bool isHere = std::none_of(before.begin(), before.end(), [](const std::string& word) {
      return word == "--url" || word.starts_with("--url=") || word == "--hosts" || word.starts_with("--hosts=");
    });
    if (isHere) addInterfaces(globals, completion.words);
  } else if (completion.kind == "OLD") {
    addOrphans(globals, completion.words);
  } else if (!completion.kind.empty()) {
    Session session(globals);
    if (completion.kind == "CLASS" || completion.kind == "PATH") {
      for (const schema::Class* each : session.classes()->classes()) completion.words.push_back(each->name());
    } else {
      addNamesOf(*session.classes(), before, completion);
    }
  }
  return completion;
}

void writeCompletion(const Globals& /*globals*/) { write(kBashScript); }

void completeWords(const CommandLine& line, const Globals& globals, const std::vector<std::string>& typed) {
  std::vector<std::string> words = joinedWords(typed);
  if (words.empty()) return;
  std::string begun = std::move(words.back());
  words.pop_back();
  if (const std::size_t equals = begun.find('='); equals != std::string::npos) {
    // The value of an option; there are no lists for the text after another "=".
    if (!begun.starts_with("--")) return;
    words.push_back(begun.substr(0, equals));
    begun.erase(0, equals + 1);
  }
  for (const std::string& word : completionOf(line, globals, words).words) {
    // Options only if the word begins like one: there are more of them than of all else.
    const bool isWanted = word.starts_with("-") == begun.starts_with("-");
    if (isWanted && begins(word, begun)) write(printable(word) + "\n");
  }
}

}  // namespace

void addCompletionCommands(CommandLine& line) {
  line.add("completion", "Print the completion script of a shell")
      .examples("  source <(zorvactl completion bash)            in ~/.bashrc")
      .choice("SHELL", "bash", {"bash"})
      .runs(writeCompletion);

  // For the completion script only.
  const auto words = std::make_shared<std::vector<std::string>>();
  line.add("complete", "")
      .hidden()
      .offers({OutputFormat::Table, OutputFormat::Json})
      .words("WORD", "", Many::Any, *words)
      .runs([&line, words](const Globals& globals) { completeWords(line, globals, *words); });
}

}  // namespace zorva::cli
