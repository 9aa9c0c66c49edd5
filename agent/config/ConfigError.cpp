#include "agent/config/Config.h"
#include "util/Escape.h"

namespace zorva::agent {
namespace {

std::string oneLine(const std::string& file, int line, const std::string& key, const std::string& problem) {
  std::string text;
  if (!file.empty()) util::appendEscaped(text, file);
  if (line > 0) text += ':' + std::to_string(line);
  if (!text.empty()) text += ": ";
  if (!key.empty()) {
    util::appendEscaped(text, key);
    text += ": ";
  }
  util::appendEscaped(text, problem);
  return text;
}

}  // namespace

ConfigError::ConfigError(const std::string& file, int line, const std::string& key, const std::string& problem)
    : std::runtime_error(oneLine(file, line, key, problem)), file_(file), line_(line), key_(key), problem_(problem) {}

ConfigError::~ConfigError() = default;

}  // namespace zorva::agent
