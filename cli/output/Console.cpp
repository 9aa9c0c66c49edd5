#include "cli/output/Console.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <string>

#include "cli/output/Capture.h"
#include "cli/output/Failure.h"
#include "cli/output/Progress.h"

namespace zorva::cli {

namespace {

bool isQuiet = false;

}  // namespace

void writeOnlyErrors() {
  isQuiet = true;
  Progress::neverShow();
}

void tell(const char* kind, std::string_view what) {
  const std::string_view word(kind);
  if (isQuiet && (word == "warning: " || word == "note: ")) return;
  if (Capture* capture = Capture::current()) {
    capture->lines.emplace_back(word, what);
    return;
  }
  std::fflush(stdout);
  Progress::makeRoom();
  const std::string line = std::string("zorvactl: ").append(word).append(what) + "\n";
  std::fwrite(line.data(), 1, line.size(), stderr);
}

void tellError(std::string_view what, std::string_view hint) {
  tell("", what);
  if (!hint.empty()) tell("", hint);
}

void tellWarning(std::string_view what) { tell("warning: ", what); }

void tellNote(std::string_view what) { tell("note: ", what); }

void write(std::string_view text) {
  if (isQuiet) return;
  if (Capture* capture = Capture::current()) {
    capture->text += text;
    return;
  }
  if (std::fwrite(text.data(), 1, text.size(), stdout) != text.size()) flushOutput();
}

void writeTable(const Table& table, const Layout& layout) {
  if (Capture* capture = Capture::current()) {
    capture->tables.push_back(table);
  } else {
    write(table.text(layout));
  }
}

void flushOutput() {
  if (std::fflush(stdout) == 0 && std::ferror(stdout) == 0) return;
  throw Failure(ExitCode::Failed, std::string("cannot write to standard output: ") + std::strerror(errno));
}

}  // namespace zorva::cli
