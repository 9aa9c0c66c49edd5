#pragma once

// Changes a file so that no reader ever sees half of it.

#include <sys/stat.h>

#include <string>
#include <string_view>

#include "util/FileDescriptor.h"

namespace zorva::util {

/// Replaces directory + name by a file with that text, with a synced temporary file beside it. One writer at a time:
/// the caller holds a lock. The file gets the owner and the rights of `like` and the SELinux label of the old file, or
/// the owner and the rights that suit its directory (see rightsIn and giveToOwnerOfDirectory), as far as possible.
/// Throws std::runtime_error, with one line; the old file is then unchanged.
[[nodiscard]] std::string replaceFile(const std::string& directory, const std::string& name, const std::string& text,
                                      const struct stat* like = nullptr);

/// Writes that text into an existing file, in place, and syncs it. Throws std::runtime_error, with one line; the file
/// may then be truncated.
void overwriteFile(const std::string& path, const std::string& text);

/// The rights of a new file in that directory: its owner writes it, and whoever may enter the directory reads it. So
/// 0644 in a directory of mode 0755, and 0640 in one of mode 0750.
mode_t rightsIn(const std::string& directory);

/// Gives a new file to the owner and the group of its directory, as far as this process may: what root puts into the
/// data directory of a service must belong to that service.
void giveToOwnerOfDirectory(const FileDescriptor& file, const std::string& path);

/// Writes all of it. False, with errno, if that fails.
bool writeAll(const FileDescriptor& file, std::string_view text);

/// A name is on the disk once its directory is synced. False, with errno, if that fails.
bool syncDirectory(const std::string& directory);

/// Syncs a file. False, with errno, if that fails.
bool syncFile(const std::string& path);

}  // namespace zorva::util
