#pragma once

// Reads a small regular file.

#include <cstddef>
#include <string>

namespace zorva::util {

struct FileText {
  std::string text;        ///< the content, at most the limit
  bool truncated = false;  ///< the file is longer
  int error = 0;           ///< errno of the failure, 0 if there was none; EINVAL if it is not a regular file
  unsigned int owner = 0;  ///< the user that the file belongs to
  unsigned int mode = 0;   ///< its rights, as in stat(2)
};

/// Reads a file up to limit bytes. Symbolic links are followed. A file that is not regular is not read, so this never
/// blocks. Throws only std::bad_alloc.
FileText readFile(const std::string& path, std::size_t limit);

/// Whether an error number of FileText is temporary: no descriptor or memory was left, or the disk failed. A later read
/// may succeed, and no event reports that.
bool mayPass(int error);

/// The text of an error number of FileText.
std::string fileErrorText(int error);

}  // namespace zorva::util
