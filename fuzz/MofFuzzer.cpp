// Any bytes as MOF. If they are accepted, the result can be written and read back unchanged.

#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "schema/Mof.h"

namespace {

using namespace zorva::schema;  // NOLINT(google-build-using-namespace)

std::string written(const ClassRepository& classes) {
  std::string text;
  for (const QualifierType* type : classes.qualifierTypes()) text += writeMof(*type);
  for (const Class* one : classes.classes()) text += writeMof(one->declaration());
  return text;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  ClassRepository classes;
  RepositorySink sink(classes);
  if (const auto outcome = parseMof(text, "fuzz.mof", sink); !outcome) {
    if (outcome.error().message.empty()) std::abort();
    return 0;
  }
  const std::string first = written(classes);
  ClassRepository again;
  RepositorySink secondSink(again);
  if (const auto outcome = parseMof(first, "written.mof", secondSink); !outcome) {
    std::fprintf(stderr, "%s\n%s\n", outcome.error().text().c_str(), first.c_str());
    std::abort();
  }
  if (written(again) != first) {
    std::fprintf(stderr, "%s\n---\n%s\n", first.c_str(), written(again).c_str());
    std::abort();
  }
  return 0;
}
