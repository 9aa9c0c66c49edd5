#pragma once

// Files and links that are put into the directories of another program: all of them or none, and never in the place of
// what somebody else put there.

#include <string>
#include <vector>

namespace zorva::cli {

/// One file or symbolic link.
struct Placed {
  enum class Kind { File, Link };

  Kind kind = Kind::File;
  std::string path;     ///< absolute
  std::string content;  ///< the text of a file, whose first line is kOwnMark in a comment; the target of a link
};

/// Ends the first line of each file that is placed, so that a later version knows it again.
inline constexpr const char* kOwnMark = "Made by zorvactl register from its table of providers.";

/// What is at the path.
enum class Found {
  Nothing,
  Same,     ///< what is to be placed
  Another,  ///< placed by another version, which had another text or target
  Serves,   ///< a link of somebody else to the same library: as good, and not ours to remove
  Foreign,
};

/// What is at the path of a file or link. Throws std::runtime_error if that cannot be read.
Found findPlaced(const Placed& wanted);

/// Puts all in place, with the directories that are missing. Throws std::runtime_error, with one line, if that is not
/// possible, or if something foreign is in the way; then everything is as it was.
void placeAll(const std::vector<Placed>& all);

/// Removes those that findPlaced knows as ours, and returns their paths. Throws std::runtime_error, with one line; then
/// those that were removed are back.
std::vector<std::string> removeAll(const std::vector<Placed>& all);

}  // namespace zorva::cli
