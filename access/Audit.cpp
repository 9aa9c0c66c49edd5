#include "access/Audit.h"

#include <string_view>

#include "util/Escape.h"
#include "util/Utf8.h"

namespace zorva::access {

namespace {

constexpr std::size_t kLongestValue = 1000;

const char* word(Proof proof) noexcept {
  switch (proof) {
    case Proof::Kernel:
      return "kernel";
    case Proof::Password:
      return "password";
    case Proof::Certificate:
      return "certificate";
    case Proof::None:
      break;
  }
  return "none";
}

std::string cut(const std::string& text) {
  if (text.size() <= kLongestValue) return text;
  return text.substr(0, util::utf8Cut(text, kLongestValue)) + "…";
}

/// The text in quotes; quotes and backslashes in it are escaped.
void appendQuoted(std::string& line, std::string_view text) {
  std::string escaped;
  for (const char c : text) {
    if (c == '"' || c == '\\') escaped += '\\';
    escaped += c;
  }
  line += '"';
  util::appendEscaped(line, escaped);
  line += '"';
}

void appendPair(std::string& line, std::string_view name, const std::string& value) {
  if (!line.empty()) line += ' ';
  line += name;
  line += '=';
  appendQuoted(line, cut(value));
}

/// Names of operations come from clients, too.
bool isWord(std::string_view text) {
  constexpr std::string_view kLetters = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_-";
  return !text.empty() && text.size() <= 100 && text.find_first_not_of(kLetters) == std::string_view::npos;
}

}  // namespace

std::string auditLine(const AuditRecord& record) {
  std::string line;
  appendPair(line, "user", record.user);
  line += std::string(" login=") + word(record.proof);
  appendPair(line, "from", record.from);
  if (isWord(record.operation)) {
    line += " operation=" + record.operation;
  } else {
    appendPair(line, "operation", record.operation);
  }
  appendPair(line, "object", record.object);
  for (const AuditChange& change : record.changes) {
    const std::string before = change.before.empty() ? std::string() : cut(change.before) + " -> ";
    appendPair(line, "change", change.property + ": " + before + cut(change.after));
  }
  appendPair(line, "result", record.result);
  return line;
}

}  // namespace zorva::access
