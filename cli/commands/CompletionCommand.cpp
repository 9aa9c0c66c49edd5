// completion, and the hidden command of its script.

#include <algorithm>

#include "cli/commands/Commands.h"
#include "cli/operations/ServerUrl.h"
#include "cli/output/Console.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"
#include "cli/session/Session.h"
#include "cli/session/SettingFiles.h"

namespace zorva::cli {

namespace {

// The shells show what "zorvactl complete" prints: it knows the command line, the classes and this host. Each line is a
// word, with a tab and its meaning for shells that show meanings; ":files" and ":directories" ask for names of files.

constexpr const char* kBashScript = R"(# Completion of zorvactl for bash: source <(zorvactl completion bash)
_zorvactl() {
  local word=${COMP_WORDS[COMP_CWORD]} line
  local -a lines
  COMPREPLY=()
  mapfile -t lines < <("${COMP_WORDS[0]}" complete bash -- "${COMP_WORDS[@]:1:COMP_CWORD}" 2>/dev/null)
  for line in "${lines[@]}"; do
    case $line in
      :files) compopt -o default 2>/dev/null; continue ;;
      :directories) compopt -o dirnames 2>/dev/null; continue ;;
      *=) compopt -o nospace 2>/dev/null ;;
      *\"*)
        case $word in
          \'*) ;;
          \"*) line=${line//\"/\\\"} ;;
          *) line=\'$line\' ;;
        esac ;;
    esac
    COMPREPLY+=("$line")
  done
}
complete -F _zorvactl zorvactl
)";

constexpr const char* kZshScript = R"(#compdef zorvactl
# Completion of zorvactl for zsh: source <(zorvactl completion zsh), after compinit
_zorvactl() {
  local line word meaning
  local -a words_open words_whole
  for line in "${(@f)$("${(Q)words[1]}" complete zsh -- "${(@Q)words[2,CURRENT-1]}" "${(Q)PREFIX}" 2>/dev/null)}"; do
    case $line in
      '') continue ;;
      :files) _files; continue ;;
      :directories) _files -/; continue ;;
    esac
    word=${line%%$'\t'*}
    meaning=${line#*$'\t'}
    if [[ $word == *= ]]; then
      words_open+=("${word//:/\\:}:$meaning")
    elif [[ $line == *$'\t'* ]]; then
      words_whole+=("${word//:/\\:}:$meaning")
    else
      words_whole+=("${word//:/\\:}")
    fi
  done
  (( $#words_open )) && _describe -V zorvactl words_open -U -S ''
  (( $#words_whole )) && _describe -V zorvactl words_whole -U
}
if [ "$funcstack[1]" = _zorvactl ]; then _zorvactl "$@"; else compdef _zorvactl zorvactl; fi
)";

constexpr const char* kFishScript = R"(# Completion of zorvactl for fish: zorvactl completion fish | source
function __zorvactl_complete
    set -l before (commandline -opc)
    set -l word (commandline -ct)
    for line in ($before[1] complete fish -- $before[2..-1] $word 2>/dev/null)
        switch $line
            case :files
                __fish_complete_path $word
            case :directories
                __fish_complete_directories $word
            case '*'
                echo $line
        end
    end
end
complete -c zorvactl -f -a '(__zorvactl_complete)'
)";

const char* scriptFor(const std::string& shell) {
  if (shell == "zsh") return kZshScript;
  return shell == "fish" ? kFishScript : kBashScript;
}

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
  const std::vector<std::string> orphans =
      orphansAmong(findSettingFiles(zorva::agent::dataDirectory()), *session.tree());
  words.insert(words.end(), orphans.begin(), orphans.end());
}

/// Whether the words name other hosts, of which nothing is known here.
bool namesServers(const std::vector<std::string>& words) {
  return std::any_of(words.begin(), words.end(), [](const std::string& word) {
    return word == "--url" || word.starts_with("--url=") || word == "--hosts" || word.starts_with("--hosts=");
  });
}

/// The class that a path begins with: up to its keys. Empty: the text is not yet a whole name.
std::string classOfPath(const schema::ClassRepository& classes, const std::string& begun) {
  const std::string name = begun.substr(0, begun.find('.'));
  const schema::Class* found = classes.find(name);
  return found == nullptr ? std::string() : found->name();
}

/// Leaves out the keys that are equal in all of several paths: the others name the object.
void dropCommonKeys(std::vector<broker::ObjectPath>& paths) {
  if (paths.size() < 2) return;
  const std::vector<broker::NamedValue> keys = paths.front().keys;
  for (const broker::NamedValue& each : keys) {
    const auto isEqual = [&each](const broker::ObjectPath& path) {
      const broker::Value* value = path.key(each.name);
      return value != nullptr && *value == each.value;
    };
    if (!std::all_of(paths.begin(), paths.end(), isEqual)) continue;
    for (broker::ObjectPath& path : paths) {
      std::erase_if(path.keys, [&each](const broker::NamedValue& key) { return util::sameName(key.name, each.name); });
    }
  }
}

/// The objects of a class, by paths as one types them.
void addPaths(Session& session, const std::string& className, std::vector<std::string>& words) {
  const Session::Quiet quiet(session);
  std::vector<broker::ObjectPath> paths;
  session.cim().enumerateInstanceNames(kUsualNameSpace, className, [&paths](const broker::ObjectPath& path) {
    paths.push_back(path);
    return true;
  });
  dropCommonKeys(paths);
  for (const broker::ObjectPath& path : paths) words.push_back(shortPathText(path));
}

bool begins(const std::string& word, const std::string& begun) {
  return word.size() >= begun.size() && util::sameName(std::string_view(word).substr(0, begun.size()), begun);
}

/// What is known of the host and of its classes for this kind of word.
void addKnown(const Globals& globals, const std::vector<std::string>& before, const std::string& begun,
              Completion& completion) {
  const bool isHere = !namesServers(before);
  if (completion.kind == "INTERFACE") {
    if (isHere) addInterfaces(globals, completion.words);
  } else if (completion.kind == "OLD") {
    addOrphans(globals, completion.words);
  } else if (completion.kind == "FILE") {
    completion.words.emplace_back(":files");
  } else if (completion.kind == "DIR") {
    completion.words.emplace_back(":directories");
  } else if (!completion.kind.empty()) {
    Session session(globals);
    const std::string ofClass = completion.kind == "PATH" ? classOfPath(*session.classes(), begun) : std::string();
    if (!ofClass.empty() && isHere) addPaths(session, ofClass, completion.words);
    if (completion.kind == "CLASS" || completion.kind == "PATH") {
      for (const schema::Class* each : session.classes()->classes()) completion.words.push_back(each->name());
    } else {
      addNamesOf(*session.classes(), before, completion);
    }
  }
}

/// A word that is being typed.
struct Begun {
  std::string option;   ///< "--output" of "--output=j", whose value is completed; or empty
  std::string text;     ///< without the quote that opens it
  bool isKnown = true;  ///< whether there are lists for such words
};

/// bash takes words apart at "=", unless they are quoted; then only what is after it is completed.
Begun begunIn(const std::string& typed, bool isBash) {
  const bool isQuoted = typed.starts_with('\'') || typed.starts_with('"');
  Begun begun{{}, typed.substr(isQuoted ? 1 : 0)};
  const std::size_t equals = begun.text.find('=');
  if (equals == std::string::npos) return begun;
  if (begun.text.starts_with("--")) return {begun.text.substr(0, equals), begun.text.substr(equals + 1)};
  begun.isKnown = isQuoted || !isBash;
  return begun;
}

void completeWords(const CommandLine& line, const Globals& globals, const std::string& shell,
                   const std::vector<std::string>& typed) {
  const bool isBash = shell == "bash";
  std::vector<std::string> words = isBash ? joinedWords(typed) : typed;
  if (words.empty()) return;
  const Begun begun = begunIn(words.back(), isBash);
  words.pop_back();
  if (!begun.isKnown) return;
  if (!begun.option.empty()) words.push_back(begun.option);
  Completion completion = line.completionAfter(words);
  if (completion.kind == "COMMAND") {
    completion = line.completionAfter({});
    completion.words.emplace_back("agent.toml");
  }
  addKnown(globals, words, begun.text, completion);
  const std::string before = begun.option.empty() || isBash ? std::string() : begun.option + "=";
  for (const std::string& word : completion.words) {
    const bool isRequest = word.starts_with(":");
    // Options only if the word begins like one: there are more of them than of all else.
    const bool isWanted = word.starts_with("-") == begun.text.starts_with("-") && begins(word, begun.text);
    if (!isRequest && !isWanted) continue;
    const auto meaning = completion.meanings.find(word);
    const bool hasMeaning = !isBash && meaning != completion.meanings.end();
    write((isRequest ? word : before + printable(word)) + (hasMeaning ? "\t" + meaning->second : "") + "\n");
  }
}

}  // namespace

std::string completionScript(const std::string& shell) { return scriptFor(shell); }

void addCompletionCommands(CommandLine& line) {
  const auto shell = std::make_shared<std::string>();
  line.add("completion", "Print the completion script of a shell")
      .examples(
          "  source <(zorvactl completion bash)            in ~/.bashrc\n"
          "  source <(zorvactl completion zsh)             in ~/.zshrc, after compinit\n"
          "  zorvactl completion fish | source             in ~/.config/fish/config.fish")
      .choice("SHELL", "bash, zsh or fish", {"bash", "zsh", "fish"}, *shell)
      .runs([shell](const Globals&) { write(scriptFor(*shell)); });

  // For the completion scripts only.
  const auto asking = std::make_shared<std::string>();
  const auto words = std::make_shared<std::vector<std::string>>();
  line.add("complete", "")
      .hidden()
      .offers({OutputFormat::Table, OutputFormat::Json})
      .choice("SHELL", "", {"bash", "zsh", "fish"}, *asking)
      .words("WORD", "", Many::Any, *words)
      .runs([&line, asking, words](const Globals& globals) { completeWords(line, globals, *asking, *words); });
}

}  // namespace zorva::cli
