#include "agent/config/Config.h"
#include "agent/log/Escape.h"

namespace zorva::agent {
namespace {

std::string oneLine(const std::string& file, int line, const std::string& key, const std::string& problem) {
  std::string text;
  if (!file.empty()) appendEscaped(text, file);
  if (line > 0) text += ':' + std::to_string(line);
  if (!text.empty()) text += ": ";
  if (!key.empty()) {
    appendEscaped(text, key);
    text += ": ";
  }
  appendEscaped(text, problem);
  return text;
}

}  // namespace

ConfigError::ConfigError(const std::string& file, int line, const std::string& key, const std::string& problem)
    : std::runtime_error(oneLine(file, line, key, problem)), file_(file), line_(line), key_(key), problem_(problem) {}

ConfigError::~ConfigError() = default;

}  // namespace zorva::agent
