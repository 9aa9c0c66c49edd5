#include "cli/registration/Placement.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <optional>
#include <stdexcept>
#include <system_error>

#include "util/FileError.h"
#include "util/ReadFile.h"
#include "util/ReplaceFile.h"

namespace zorva::cli {

namespace {

namespace fs = std::filesystem;

constexpr std::size_t kLargestFile = std::size_t{4} << 20;

/// What is at a path, to be put back.
struct Before {
  Placed placed;  ///< with the content that was there
  bool existed = false;
};

bool exists(const std::string& path, struct stat& status) {
  if (::lstat(path.c_str(), &status) == 0) return true;
  if (errno != ENOENT && errno != ENOTDIR) util::throwFileError(path, "cannot be read");
  return false;
}

std::string targetOf(const std::string& path) {
  std::error_code error;
  const fs::path target = fs::read_symlink(path, error);
  if (error) throw std::runtime_error(path + ": cannot be read: " + error.message());
  return target.string();
}

std::string textOf(const std::string& path) {
  const util::FileText file = util::readFile(path, kLargestFile);
  if (file.error != 0) throw std::runtime_error(path + ": cannot be read: " + util::fileErrorText(file.error));
  return file.text;
}

Found findLink(const Placed& wanted, const struct stat& status) {
  if (!S_ISLNK(status.st_mode)) return Found::Foreign;
  const fs::path target = targetOf(wanted.path);
  if (target == wanted.content) return Found::Same;
  std::error_code ignored;
  if (fs::equivalent(wanted.path, wanted.content, ignored)) return Found::Serves;
  const bool isOwn = target.is_absolute() && target.filename() == fs::path(wanted.content).filename();
  return isOwn ? Found::Another : Found::Foreign;
}

Found findFile(const Placed& wanted, const struct stat& status) {
  if (!S_ISREG(status.st_mode)) return Found::Foreign;
  const std::string text = textOf(wanted.path);
  if (text == wanted.content) return Found::Same;
  const bool isOwn = text.substr(0, text.find('\n')).ends_with(kOwnMark);
  return isOwn ? Found::Another : Found::Foreign;
}

bool isOwn(Found found) { return found == Found::Same || found == Found::Another; }

void put(const Placed& placed) {
  const fs::path path(placed.path);
  if (placed.kind == Placed::Kind::File) {
    const std::string warning =
        util::replaceFile(path.parent_path().string() + "/", path.filename().string(), placed.content);
    if (!warning.empty()) throw std::runtime_error(warning);
    return;
  }
  const std::string temporary = placed.path + ".new";
  ::unlink(temporary.c_str());
  if (::symlink(placed.content.c_str(), temporary.c_str()) != 0) util::throwFileError(temporary, "cannot be made");
  if (::rename(temporary.c_str(), placed.path.c_str()) == 0) return;
  const int error = errno;
  ::unlink(temporary.c_str());
  errno = error;
  util::throwFileError(placed.path, "cannot be replaced");
}

Before remember(const Placed& wanted) {
  struct stat status {};
  Before before{wanted, exists(wanted.path, status)};
  if (!before.existed) return before;
  before.placed.content = wanted.kind == Placed::Kind::Link ? targetOf(wanted.path) : textOf(wanted.path);
  return before;
}

/// Undoes steps, the last one first, unless they are kept.
class Undo {
 public:
  ~Undo() {
    for (auto each = steps_.rbegin(); each != steps_.rend(); ++each) takeBack(*each);
    for (auto each = directories_.rbegin(); each != directories_.rend(); ++each) ::rmdir(each->c_str());
  }

  void add(Before before) { steps_.push_back(std::move(before)); }
  void addDirectory(const std::string& path) { directories_.push_back(path); }
  void keep() {
    steps_.clear();
    directories_.clear();
  }

 private:
  static void takeBack(const Before& before) noexcept {
    if (!before.existed) {
      ::unlink(before.placed.path.c_str());
      return;
    }
    try {
      put(before.placed);
    } catch (const std::exception&) {
      // What failed is reported already; this is its consequence.
    }
  }

  std::vector<Before> steps_;
  std::vector<std::string> directories_;
};

void makeDirectories(const fs::path& directory, Undo& undo) {
  std::error_code error;
  if (directory.empty() || fs::is_directory(directory, error)) return;
  makeDirectories(directory.parent_path(), undo);
  constexpr mode_t kMode = 0755;
  if (::mkdir(directory.c_str(), kMode) != 0) util::throwFileError(directory.string(), "cannot be made");
  undo.addDirectory(directory.string());
}

}  // namespace

Found findPlaced(const Placed& wanted) {
  struct stat status {};
  if (!exists(wanted.path, status)) return Found::Nothing;
  return wanted.kind == Placed::Kind::Link ? findLink(wanted, status) : findFile(wanted, status);
}

void placeAll(const std::vector<Placed>& all) {
  for (const Placed& each : all) {
    if (findPlaced(each) != Found::Foreign) continue;
    throw std::runtime_error(each.path +
                             ": is there already and was not made by zorvactl register; nothing was changed");
  }
  Undo undo;
  for (const Placed& each : all) {
    const Found found = findPlaced(each);
    if (found == Found::Same || found == Found::Serves) continue;
    makeDirectories(fs::path(each.path).parent_path(), undo);
    undo.add(remember(each));
    put(each);
  }
  undo.keep();
}

std::vector<std::string> removeAll(const std::vector<Placed>& all) {
  std::vector<std::string> removed;
  Undo undo;
  for (const Placed& each : all) {
    if (!isOwn(findPlaced(each))) continue;
    const Before before = remember(each);
    if (::unlink(each.path.c_str()) != 0) util::throwFileError(each.path, "cannot be removed");
    undo.add(before);
    removed.push_back(each.path);
  }
  undo.keep();
  return removed;
}

}  // namespace zorva::cli
