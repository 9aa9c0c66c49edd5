// Part of the build: reads the MOF files and writes a source with their declarations in the compact form.
//
//   compile_classes OUTPUT PROFILE.mof INTEROP.mof
//
// INTEROP.mof begins with the declarations of PROFILE.mof, so only the others are written for it.

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "schema/CompiledClasses.h"
#include "schema/Mof.h"

namespace {

using namespace zorva::schema;

Declarations read(const char* path) {
  DeclarationsSink sink;
  if (const auto outcome = parseMofFile(path, sink); !outcome) throw std::runtime_error(outcome.error().text());
  return std::move(sink.declarations);
}

template <typename Declared>
void dropFirst(std::vector<Declared>& all, const std::vector<Declared>& first) {
  const auto same = [](const Declared& left, const Declared& right) { return left.name == right.name; };
  if (all.size() < first.size() || !std::equal(first.begin(), first.end(), all.begin(), same)) {
    throw std::runtime_error("the second file does not begin with the declarations of the first");
  }
  all.erase(all.begin(), all.begin() + std::ssize(first));
}

void writeText(std::ofstream& source, const char* name, const std::string& text) {
  constexpr std::size_t kOnALine = 30;
  source << "constexpr char " << name << "Bytes[] =";
  for (std::size_t i = 0; i < text.size(); ++i) {
    char octal[8];
    std::snprintf(octal, sizeof octal, "\\%03o", static_cast<unsigned>(static_cast<unsigned char>(text[i])));
    source << (i % kOnALine != 0 ? "" : i == 0 ? "\n    \"" : "\"\n    \"") << octal;
  }
  source << "\";\nconst std::string_view " << name << "(" << name << "Bytes, " << text.size() << ");\n\n";
}

void compile(const char* output, const char* profileFile, const char* interopFile) {
  const Declarations profile = read(profileFile);
  Declarations interop = read(interopFile);
  dropFirst(interop.qualifierTypes, profile.qualifierTypes);
  dropFirst(interop.classes, profile.classes);
  std::ofstream source(output);
  source << "#include \"schema/BuiltInClasses.h\"\n\nnamespace zorva::schema {\n\n";
  writeText(source, "kProfileClasses", compileDeclarations(profile));
  writeText(source, "kInteropClasses", compileDeclarations(interop));
  source << "}  // namespace zorva::schema\n";
  if (!source.flush()) throw std::runtime_error(std::string(output) + " cannot be written");
}

}  // namespace

int main(int argc, char** argv) {
  try {
    if (argc != 4) throw std::runtime_error("OUTPUT PROFILE.mof INTEROP.mof are needed");
    compile(argv[1], argv[2], argv[3]);
    return 0;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "compile_classes: %s\n", error.what());
    return 1;
  }
}
