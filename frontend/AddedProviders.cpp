#include "frontend/AddedProviders.h"

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <sstream>
#include <system_error>
#include <vector>

#include "agent/config/Config.h"
#include "schema/Mof.h"
#include "util/InstalledPlaces.h"
#include "util/ReadFile.h"
#include "util/Text.h"

namespace zorva::frontend {

namespace {

using agent::ConfigError;
using broker::ProviderEntry;
using std::filesystem::path;

constexpr std::size_t kLargestFile = std::size_t{1} << 20;
constexpr std::size_t kMostFiles = 1000;

std::vector<std::string> wordsOf(std::string_view text) {
  std::istringstream words{std::string(text)};
  return {std::istream_iterator<std::string>(words), {}};
}

/// A registration: sections [CLASS] of lines "key: value". '#' begins a comment.
class Registration {
 public:
  Registration(const path& file, broker::ProviderRegistry& registry, const schema::ClassRepository& classes)
      : file_(file), registry_(registry), classes_(classes) {}

  void read() {
    const util::FileText text = util::readFile(file_, kLargestFile);
    if (text.error != 0) fail("cannot be read: " + util::fileErrorText(text.error));
    if (text.truncated) fail("is larger than 1 MiB");
    std::istringstream lines(text.text);
    for (std::string line; std::getline(lines, line);) {
      ++line_;
      takeLine(util::trimmed(std::string_view(line).substr(0, line.find('#')), util::kWhiteSpace));
    }
    endSection();
  }

 private:
  [[noreturn]] void fail(const std::string& problem) const {
    throw ConfigError(file_, line_, entry_.className, problem);
  }

  void takeLine(std::string_view line) {
    if (line.empty()) return;
    if (line.starts_with('[')) {
      if (!line.ends_with(']')) fail("expected \"]\" at the end of the line");
      endSection();
      entry_.className = util::trimmed(line.substr(1, line.size() - 2));
      if (classes_.find(entry_.className) == nullptr)
        fail("there is no such class: a file .mof beside this must declare it");
      return;
    }
    const std::size_t colon = line.find(':');
    if (colon == std::string_view::npos) fail("expected \"key: value\"");
    if (entry_.className.empty()) fail("expected the name of a class in brackets first");
    takeValue(util::trimmed(line.substr(0, colon)), util::trimmed(line.substr(colon + 1)));
  }

  void takeValue(std::string_view key, std::string_view value) {
    if (value.empty()) fail(std::string(key) + " has no value");
    if (key == "provider") {
      entry_.prefix = value;
    } else if (key == "location") {
      entry_.library = libraryOf(std::string(value));
    } else if (key == "type") {
      for (const std::string& word : wordsOf(value)) entry_.kinds |= kindOf(word);
    } else if (key == "namespace") {
      nameSpaces_ = wordsOf(value);
    } else if (key != "unload") {  // nothing is unloaded here while it is used
      fail("there is no key \"" + std::string(key) + "\"; there are provider, location, type, namespace, unload");
    }
  }

  broker::MiKind kindOf(const std::string& word) const {
    if (word == "instance") return broker::InstanceMi;
    if (word == "association") return broker::AssociationMi;
    if (word == "method") return broker::MethodMi;
    fail("type \"" + word + "\" is not known here; there are instance, association, method");
  }

  std::string libraryOf(const std::string& name) const {
    if (name.find('/') != std::string::npos) return name;
    const path beside = std::filesystem::absolute(file_).parent_path() / ("lib" + name + ".so");
    return ::access(beside.c_str(), F_OK) == 0 ? beside.string() : name;
  }

  void endSection() {
    if (entry_.className.empty()) return;
    if (entry_.prefix.empty() || entry_.library.empty() || entry_.kinds == 0) {
      fail("needs provider, location and type");
    }
    for (const std::string& nameSpace : nameSpaces_) {
      if (registry_.find(nameSpace, entry_.className) != nullptr) fail("has a provider already");
      entry_.nameSpace = nameSpace;
      registry_.add(entry_);
    }
    entry_ = {};
    nameSpaces_ = {ProviderEntry().nameSpace};
  }

  std::string file_;
  broker::ProviderRegistry& registry_;
  const schema::ClassRepository& classes_;
  int line_ = 0;
  ProviderEntry entry_;
  std::vector<std::string> nameSpaces_{ProviderEntry().nameSpace};
};

std::vector<path> filesIn(const std::string& directory) {
  std::error_code error;
  std::vector<path> files;
  std::filesystem::directory_iterator each(directory, error);
  for (; !error && each != std::filesystem::directory_iterator(); each.increment(error)) {
    files.push_back(each->path());
    if (files.size() > kMostFiles) throw ConfigError(directory, 0, {}, "has more than 1,000 files");
  }
  const bool isUsual = directory == usualProviders();
  if (error && !(isUsual && error == std::errc::no_such_file_or_directory)) {
    throw ConfigError(directory, 0, {}, "cannot be read: " + error.message());
  }
  std::sort(files.begin(), files.end());
  return files;
}

void addClasses(const path& file, schema::ClassRepository& classes) {
  schema::RepositorySink sink(classes);
  if (const auto outcome = schema::parseMofFile(file, sink); !outcome) {
    const schema::SchemaError& error = outcome.error();
    throw ConfigError(error.file.empty() ? file.string() : error.file, static_cast<int>(error.line), {}, error.message);
  }
}

}  // namespace

std::string usualProviders() { return util::installedPlaces().config + "providers.d"; }

void addProviders(const std::string& directory, broker::ProviderRegistry& registry, schema::ClassRepository& classes) {
  const std::vector<path> files = filesIn(directory);
  for (const path& file : files) {
    if (file.extension() == ".mof") addClasses(file, classes);
  }
  for (const path& file : files) {
    if (file.extension() == ".reg") Registration(file, registry, classes).read();
  }
}

}  // namespace zorva::frontend
