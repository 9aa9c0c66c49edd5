#pragma once

// The file of users on the disk.

#include <sys/stat.h>

#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "access/Users.h"
#include "util/NotCopied.h"

namespace zorva::access {

inline constexpr const char* kDefaultGroup = "zorva";

/// The file of users of this installation: /etc/zorvagent/users.
std::string defaultUsersFile();

/// Reads the file; a file that does not exist has no users. Throws UsersError.
Users readUsersFile(const std::string& path);

/// Writes the whole file, or leaves the old one. A new file has the rights 0640 and, if this process may, the group
/// `group`; one that was there keeps owner and rights. One writer at a time: the caller holds a lock. Returns a warning
/// or an empty text; throws std::runtime_error, with one line.
[[nodiscard]] std::string writeUsersFile(const std::string& path, const Users& users, const std::string& group);

/// The users of a file that others may change while this process uses them. Thread-safe.
class WatchedUsers : util::NotCopied {
 public:
  using Snapshot = std::shared_ptr<const Users>;

  /// Reads the file. Throws UsersError, except for a file that this process may not read: that has no users, and is
  /// reported to `log`.
  WatchedUsers(std::string path, std::function<void(const std::string& line)> log);

  Snapshot users() const;

  /// Reads the file again if it has changed. If it is not valid, that is reported once and the users stay as they are.
  /// Returns the users that were replaced, or null.
  Snapshot refresh();

 private:
  struct Mark;
  static Mark markOf(const std::string& path);
  std::optional<Users> read();
  void warnOfRights() const;

  const std::string path_;
  const std::function<void(const std::string&)> log_;
  mutable std::mutex mutex_;  ///< of users_
  Snapshot users_;
  std::mutex refreshing_;  ///< of mark_
  struct Mark {
    bool operator==(const Mark&) const = default;
    ino_t inode = 0;
    off_t size = 0;
    time_t seconds = 0;
    long nanoseconds = 0;
    mode_t mode = 0;  ///< a file that was unreadable may now be readable
    uid_t owner = 0;
    gid_t group = 0;
  } mark_;
};

}  // namespace zorva::access
