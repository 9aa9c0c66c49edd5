#include "access/UsersFile.h"

#include <grp.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <utility>
#include <vector>

#include "access/LocalUsers.h"
#include "util/InstalledPlaces.h"
#include "util/ReadFile.h"
#include "util/ReplaceFile.h"

namespace zorva::access {

namespace {

constexpr mode_t kRights = S_IRUSR | S_IWUSR | S_IRGRP;

/// The owner and the rights that a new file gets.
struct stat rightsOfNewFile(const std::string& group) {
  struct stat like {};
  like.st_mode = kRights;
  like.st_uid = ::geteuid();
  like.st_gid = ::geteuid() == 0 ? groupNamed(group).value_or(::getegid()) : ::getegid();
  return like;
}

}  // namespace

std::string defaultUsersFile() { return util::installedPlaces().config + "users"; }

Users readUsersFile(const std::string& path) {
  const util::FileText file = util::readFile(path, Users::kLargest);
  if (file.error == ENOENT) return {};
  if (file.error != 0) throw UsersError(path + ": cannot be read: " + util::fileErrorText(file.error));
  if (file.truncated) throw UsersError(path + ": the file is larger than 1 MiB");
  return {file.text, path};
}

std::string writeUsersFile(const std::string& path, const Users& users, const std::string& group) {
  // The target of a symbolic link is replaced, not the link.
  std::error_code error;
  std::filesystem::path file = std::filesystem::canonical(path, error);
  if (error) file = std::filesystem::absolute(path);
  struct stat like {};
  if (::stat(file.c_str(), &like) != 0) like = rightsOfNewFile(group);
  const std::string directory = file.parent_path().string() + "/";
  std::string warning = util::replaceFile(directory, file.filename().string(), users.text(), &like);
  struct stat now {};
  if (warning.empty() && ::stat(file.c_str(), &now) == 0 && (now.st_uid != like.st_uid || now.st_gid != like.st_gid)) {
    warning = path + ": its owner could not be kept; the server may not be able to read it";
  }
  return warning;
}

WatchedUsers::WatchedUsers(std::string path, std::function<void(const std::string& line)> log)
    : path_(std::move(path)), log_(std::move(log)), users_(std::make_shared<const Users>()), mark_(markOf(path_)) {
  if (::access(path_.c_str(), R_OK) != 0 && errno == EACCES) {
    log_(path_ + ": this process may not read it, so there are no users");
    return;
  }
  users_ = std::make_shared<const Users>(readUsersFile(path_));
  warnOfRights();
}

void WatchedUsers::warnOfRights() const {
  if ((mark_.mode & S_IRWXO) != 0) log_(path_ + ": all users of this host may read it; its rights should be 0640");
}

WatchedUsers::Mark WatchedUsers::markOf(const std::string& path) {
  struct stat now {};
  if (::stat(path.c_str(), &now) != 0) return {};
  return {now.st_ino, now.st_size, now.st_mtim.tv_sec, now.st_mtim.tv_nsec, now.st_mode, now.st_uid, now.st_gid};
}

WatchedUsers::Snapshot WatchedUsers::users() const {
  const std::lock_guard lock(mutex_);
  return users_;
}

WatchedUsers::Snapshot WatchedUsers::refresh() {
  const std::lock_guard alone(refreshing_);
  // The mark is taken first: a change during the reading is seen the next time.
  const Mark now = markOf(path_);
  if (now == mark_) return nullptr;
  mark_ = now;
  std::optional<Users> read = this->read();
  if (!read) return nullptr;
  warnOfRights();
  auto fresh = std::make_shared<const Users>(std::move(*read));
  const std::lock_guard lock(mutex_);
  return std::exchange(users_, std::move(fresh));
}

std::optional<Users> WatchedUsers::read() try { return readUsersFile(path_); } catch (const UsersError& error) {
  log_(std::string("the users stay as they were: ") + error.what());
  return std::nullopt;
}

}  // namespace zorva::access
