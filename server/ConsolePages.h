#pragma once

// The console: the page that a browser gets. Its files are those of the folder console/, embedded in the program.

#include <cstddef>
#include <string_view>

#include "http/Pages.h"

namespace zorva::server {

struct ConsoleFile {
  std::string_view name;  ///< without a folder
  std::string_view tag;   ///< another one for another text
  std::string_view text;
};

extern const ConsoleFile kConsoleFiles[];
extern const std::size_t kConsoleFileCount;

/// Adds the console's files under /console/, and lets the page of "/" give index.html to clients that ask for HTML,
/// which are browsers. All others get what that page was. Public: the files hold nothing of the host.
void addConsole(http::Pages& pages);

}  // namespace zorva::server
