#pragma once

// Changes a file so that no reader ever sees half of it.

#include <sys/stat.h>

#include <string>
#include <string_view>

#include "util/FileDescriptor.h"

namespace zorva::util {

/// Puts a file with that text in the place of directory + name, by way of a synced temporary file beside it. One writer
/// at a time: the caller holds a lock. The file is for all to read, or has the owner and the rights of `like`, as far
/// as they can be given. Throws std::runtime_error, with one line; the old file then stays as it was. Returns one line
/// where the new file is in its place but its directory could not be synced, so that a crash may bring the old one
/// back; else the empty text.
[[nodiscard]] std::string replaceFile(const std::string& directory, const std::string& name, const std::string& text,
                                      const struct stat* like = nullptr);

/// Writes that text into an existing file, in place, and syncs it. Throws std::runtime_error, with one line; the file
/// may then be truncated.
void overwriteFile(const std::string& path, const std::string& text);

/// Writes all of it. False, with errno, where that fails.
bool writeAll(const FileDescriptor& file, std::string_view text);

/// A name is on the disk when its directory is. False, with errno, where that cannot be synced.
bool syncDirectory(const std::string& directory);

/// Syncs a file. False, with errno, if that fails.
bool syncFile(const std::string& path);

}  // namespace zorva::util
