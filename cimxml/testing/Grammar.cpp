#include "cimxml/testing/Grammar.h"

#include <stdlib.h>
#include <unistd.h>

#include <cstdio>
#include <string_view>

namespace zorva::cimxml::testing {

namespace {

std::string command(const std::string& file) {
  std::string words = ZORVA_XMLLINT " --noout --nonet --relaxng '" ZORVA_SOURCE_DIR "/cimxml/cim-xml.rng'";
  if (!std::string_view(ZORVA_CIM_DTD).empty()) words += " --dtdvalid '" ZORVA_CIM_DTD "'";
  return words + " " + file + " 2>&1";
}

}  // namespace

std::string grammarProblem(const std::string& document) {
  char name[] = "/tmp/zorva-document-XXXXXX";
  const int file = mkstemp(name);
  if (file < 0) return "cannot make a file for xmllint";
  const bool isWritten = write(file, document.data(), document.size()) == static_cast<ssize_t>(document.size());
  close(file);
  std::string said;
  FILE* const pipe = isWritten ? popen(command(name).c_str(), "r") : nullptr;
  if (pipe == nullptr) {
    said = "cannot hand the document to xmllint";
  } else {
    char piece[4096];
    for (std::size_t got = fread(piece, 1, sizeof piece, pipe); got > 0; got = fread(piece, 1, sizeof piece, pipe)) {
      said.append(piece, got);
    }
    if (pclose(pipe) == 0) {
      said.clear();
    } else if (said.empty()) {
      said = "xmllint failed without a word";
    }
  }
  unlink(name);
  return said;
}

}  // namespace zorva::cimxml::testing
