// Any bytes as a file of users, and as the header field Authorization. What was read must be written so that it is read
// again as the same, and no error may show a hash.

#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "access/BasicLogin.h"
#include "access/Users.h"

namespace {

using namespace zorva::access;  // NOLINT(google-build-using-namespace)

[[noreturn]] void fail(const char* what, const std::string& text) {
  std::fprintf(stderr, "%s:\n%s\n", what, text.c_str());
  std::abort();
}

void checkFile(const std::string& text) {
  try {
    const Users users(text, "users");
    const Users again(users.text(), "again");
    if (again.text() != users.text()) fail("the file changes when it is written again", text);
    const auto all = users.all();
    if (again.all().size() != all.size()) fail("users were lost or came", text);
    for (const User* user : all) {
      const User* other = again.find(user->name);
      if (other == nullptr || !(*other == *user)) fail("a user is not the same any more", text);
    }
  } catch (const UsersError& error) {
    const std::string what = error.what();
    if (!what.starts_with("users:")) fail("an error without its place", what);
    if (what.find("$y$") != std::string::npos) fail("an error with a hash", what);
  }
}

void checkLogin(const std::string& text) {
  const auto login = readBasicLogin(text);
  if (login && login->password.find('\0') != std::string::npos) fail("a password with NUL", text);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(reinterpret_cast<const char*>(data), size);
  checkFile(text);
  checkLogin(text);
  return 0;
}
