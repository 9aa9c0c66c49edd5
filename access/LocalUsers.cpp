#include "access/LocalUsers.h"

#include <grp.h>
#include <pwd.h>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <vector>

namespace zorva::access {

namespace {

constexpr std::size_t kFirstBuffer = 4096;
constexpr std::size_t kLargestBuffer = std::size_t{1} << 20;
constexpr int kMostGroups = 65536;

/// Calls a function of the C library with a buffer that is large enough for its result.
template <typename Call>
bool withBuffer(std::vector<char>& buffer, Call&& call) {
  for (buffer.resize(kFirstBuffer); buffer.size() <= kLargestBuffer; buffer.resize(buffer.size() * 4)) {
    if (const int error = call(buffer.data(), buffer.size()); error != ERANGE) return error == 0;
  }
  return false;
}

bool isMember(const passwd& user, gid_t group) {
  if (user.pw_gid == group) return true;
  int count = 64;
  std::vector<gid_t> groups(static_cast<std::size_t>(count));
  while (::getgrouplist(user.pw_name, user.pw_gid, groups.data(), &count) < 0) {
    if (count <= static_cast<int>(groups.size()) || count > kMostGroups) return false;
    groups.resize(static_cast<std::size_t>(count));
  }
  const auto end = groups.begin() + count;
  return std::find(groups.begin(), end, group) != end;
}

}  // namespace

std::optional<gid_t> groupNamed(const std::string& name) {
  std::vector<char> buffer;
  group entry{};
  group* found = nullptr;
  const bool isDone = withBuffer(
      buffer, [&](char* text, std::size_t size) { return ::getgrnam_r(name.c_str(), &entry, text, size, &found); });
  if (!isDone || found == nullptr) return std::nullopt;
  return found->gr_gid;
}

LocalUser lookUpUser(uid_t user, const std::string& groupName) {
  std::vector<char> buffer;
  passwd entry{};
  passwd* found = nullptr;
  const bool isDone =
      withBuffer(buffer, [&](char* text, std::size_t size) { return ::getpwuid_r(user, &entry, text, size, &found); });
  if (!isDone || found == nullptr) return {"uid " + std::to_string(user), false};
  const auto group = groupNamed(groupName);
  return {found->pw_name, group.has_value() && isMember(*found, *group)};
}

}  // namespace zorva::access
