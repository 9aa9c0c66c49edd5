#include "agent/files/KeyValues.h"

#include <cerrno>

#include "agent/files/Lines.h"
#include "util/ReadFile.h"

namespace zorva::agent {
namespace {

// Far more than any interface file has.
constexpr std::size_t kLargestFile = std::size_t{4} << 20;

}  // namespace

int readKeyValues(const std::string& path,
                  const std::function<void(std::string_view key, std::string_view value)>& take) {
  const util::FileText file = util::readFile(path, kLargestFile);
  if (file.error != 0) return file.error;
  if (file.truncated) return EFBIG;
  for (std::string_view rest = file.text; !rest.empty();) {
    const std::string_view line = takeLine(rest);
    const std::size_t split = line.find('=');
    if (line.starts_with('#') || split == std::string_view::npos) continue;
    take(line.substr(0, split), line.substr(split + 1));
  }
  return 0;
}

}  // namespace zorva::agent
