#include "cli/output/OutputFormat.h"

namespace zorva::cli {

const char* formatName(OutputFormat format) noexcept {
  constexpr const char* kNames[] = {"table", "json", "mof", "xml", "dot", "svg"};
  return kNames[static_cast<unsigned>(format)];
}

std::optional<OutputFormat> formatNamed(std::string_view word) noexcept {
  for (const OutputFormat each : kAllFormats) {
    if (word == formatName(each)) return each;
  }
  return std::nullopt;
}

}  // namespace zorva::cli
