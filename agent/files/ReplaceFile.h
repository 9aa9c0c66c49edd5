// Changes a file so that nobody ever sees half of it.
#pragma once

#include <string>

namespace zorvagent {

// Puts a file with that text in the place of directory + name, by way of a synced temporary file beside it. One writer
// at a time: the caller holds a lock. Throws std::runtime_error, with one line; the old file then stays as it was.
void replaceFile(const std::string& directory, const std::string& name, const std::string& text);

}  // namespace zorvagent
