#pragma once

// Files of key=value lines.

#include <functional>
#include <string>
#include <string_view>

namespace zorva::agent {

/// Calls take for each line "key=value" of a file, in order. The first "=" splits a line; lines that start with "#" and
/// those without "=" are skipped. Returns errno, 0 if the file was read; EFBIG for more than 4 MiB, which is no file of
/// settings.
int readKeyValues(const std::string& path,
                  const std::function<void(std::string_view key, std::string_view value)>& take);

}  // namespace zorva::agent
