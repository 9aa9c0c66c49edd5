// Reads a small regular file whole.
#pragma once

#include <cstddef>
#include <string>

namespace zorva::util {

struct FileText {
  std::string text;        // what was read, at most the limit
  bool truncated = false;  // there was more
  int error = 0;           // errno of what failed, 0 where nothing did; EINVAL for what is not a regular file
};

// Reads a file up to limit bytes. What is not a regular file (symbolic links are followed) is not read, and neither
// blocks nor is waited for. Throws std::bad_alloc alone.
FileText readFile(const std::string& path, std::size_t limit);

// Whether an error number of FileText tells of the moment and not of the file: no descriptor or memory was left, the
// disk failed. What is read again later may be there, and nothing reports that it is.
bool mayPass(int error);

// What an error number of FileText means, in words.
std::string fileErrorText(int error);

}  // namespace zorva::util
