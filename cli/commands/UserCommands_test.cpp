// zorvactl user, as a process on a file of its own.

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>

#include "access/UsersFile.h"
#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

using access::Role;

const std::string kPrint(64, 'a');

class UserCommands : public ::testing::Test {
 protected:
  std::string file() const { return host_.directory() / "users"; }

  Words with(Words words) const {
    words.insert(words.begin(), "user");
    words.insert(words.end(), {"--file", file()});
    return words;
  }

  /// Runs it with that password on standard input; it must succeed.
  std::string done(const Words& words, const std::string& password = {}) const {
    const Outcome outcome = host_.runWithInput(password, with(words));
    EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
    EXPECT_EQ(outcome.err, "");
    return outcome.out;
  }

  void expectFailed(const Words& words, int exitCode, const std::string& told, const std::string& password = {}) const {
    const Outcome outcome = host_.runWithInput(password, with(words));
    EXPECT_EQ(outcome.exitCode, exitCode);
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(outcome.err, HasSubstr(told));
  }

  access::User user(const std::string& name) const {
    const access::Users users = access::readUsersFile(file());
    const access::User* found = users.find(name);
    EXPECT_NE(found, nullptr) << name;
    return found == nullptr ? access::User{} : *found;
  }

  TestHost host_;
};

TEST_F(UserCommands, AddMakesAUserWhoCanLogIn) {
  EXPECT_EQ(done({"add", "alice", "--role", "operate"}, "correct horse\n"), "added alice: operate\n");
  EXPECT_TRUE(access::isPasswordOf("correct horse", user("alice").hash));
  EXPECT_EQ(user("alice").grants, access::Grants(Role::Operate));
  EXPECT_EQ(std::filesystem::status(file()).permissions(), std::filesystem::perms(0640));
}

TEST_F(UserCommands, AUserReadsUnlessAnotherRoleIsGiven) {
  EXPECT_EQ(done({"add", "bob", "--namespace", "root/cimv2=operate", "--namespace", "interop=none"}, "correct horse"),
            "added bob: read, interop=none, root/cimv2=operate\n");
  EXPECT_EQ(user("bob").grants.in("root/cimv2"), Role::Operate);
  EXPECT_EQ(user("bob").grants.in("interop"), Role::None);
  EXPECT_EQ(user("bob").grants.in("root/other"), Role::Read);
}

TEST_F(UserCommands, AddRefusesAUserThatExists) {
  done({"add", "alice", "--no-password", "--subject", "CN=alice"});
  expectFailed({"add", "alice"}, 1,
               "the user alice exists already\nzorvactl: zorvactl user passwd, role and certificate change it",
               "correct horse\n");
}

TEST_F(UserCommands, BadPasswordsAreRefused) {
  expectFailed({"add", "alice"}, 1, "the password is empty\nzorvactl: nothing was changed", "\n");
  expectFailed({"add", "alice"}, 1, "the password is empty", "");
  expectFailed({"add", "alice"}, 1, "the password is shorter than 8 characters", "1234567\n");
  expectFailed({"add", "alice-the-user"}, 1, "the password is the user's name", "alice-the-user\n");
  expectFailed({"add", "alice"}, 1, "has control characters", "correct\thorse\n");
  expectFailed({"add", "alice"}, 1, "is longer than 256 bytes", std::string(257, 'x') + "\n");
  EXPECT_FALSE(std::filesystem::exists(file()));
}

TEST_F(UserCommands, WrongWordsAreWrongUsage) {
  expectFailed({"add", "-x"}, 2, "--help");
  expectFailed({"add", "a:b"}, 2, "'a:b' cannot be the name of a user");
  expectFailed({"add", "alice", "--role", "boss"}, 2,
               "'boss' is no role\nzorvactl: the roles are read, operate and none");
  expectFailed({"add", "alice", "--namespace", "root"}, 2, "'root' is not NAMESPACE=ROLE");
  expectFailed({"add", "alice", "--fingerprint", "12"}, 2, "'12' is no fingerprint of SHA-256");
  expectFailed({"add", "alice", "--subject", "alice"}, 2, "'alice' is no distinguished name");
  expectFailed({"add", "alice", "--no-password"}, 2, "without a password, the user needs a certificate");
  expectFailed({"certificate", "alice"}, 2, "needs either --fingerprint or --subject, or --none");
}

TEST_F(UserCommands, PasswdChangesThePasswordAlone) {
  done({"add", "alice", "--role", "operate", "--subject", "CN=alice"}, "correct horse");
  EXPECT_EQ(done({"passwd", "alice", "--password-stdin"}, "battery staple"), "changed alice: operate\n");
  EXPECT_TRUE(access::isPasswordOf("battery staple", user("alice").hash));
  EXPECT_EQ(user("alice").subject, "CN=alice");
  expectFailed({"passwd", "bob"}, 1, "there is no user bob\nzorvactl: zorvactl user list shows", "correct horse");
}

TEST_F(UserCommands, RoleReplacesAllRoles) {
  done({"add", "alice", "--no-password", "--subject", "CN=alice", "--namespace", "interop=none"});
  EXPECT_EQ(done({"role", "alice", "none", "--namespace", "root/cimv2=operate"}),
            "changed alice: none, root/cimv2=operate\n");
  EXPECT_EQ(user("alice").grants.in("interop"), Role::None);
  EXPECT_EQ(user("alice").grants.byNameSpace().size(), 1U);
}

TEST_F(UserCommands, CertificateReplacesAllCertificates) {
  done({"add", "alice", "--no-password", "--subject", "CN=alice"});
  done({"certificate", "alice", "--fingerprint", kPrint});
  EXPECT_EQ(user("alice").subject, "");
  EXPECT_THAT(user("alice").fingerprints, testing::ElementsAre(kPrint));
  done({"certificate", "alice", "--none"});
  EXPECT_THAT(user("alice").fingerprints, IsEmpty());
  done({"add", "bob", "--no-password", "--subject", "CN=bob"});
  expectFailed({"certificate", "alice", "--subject", "cn=bob"}, 1, "the subject of alice is also of the user bob");
}

TEST_F(UserCommands, RemoveLeavesTheRest) {
  host_.directory().write("users", "# ours\nalice:*:read\nbob:*:read\n");
  EXPECT_EQ(done({"remove", "alice"}), "removed alice: read\n");
  EXPECT_EQ(contentsOf(file()), "# ours\nbob:*:read\n");
  expectFailed({"remove", "alice"}, 1, "there is no user alice");
}

TEST_F(UserCommands, ListShowsNoHashes) {
  done({"add", "alice", "--role", "operate", "--namespace", "interop=none", "--fingerprint", kPrint}, "correct horse");
  host_.directory().write("users", contentsOf(file()) + "bob:*:read:subject=CN=bob\n");
  const std::string table = done({"list"});
  EXPECT_THAT(table, HasSubstr("alice  operate  interop=none   password, 1 fingerprint\n"));
  EXPECT_THAT(table, HasSubstr("bob    read     -              CN=bob\n"));
  const std::string text = done({"list", "--output", "json"});
  EXPECT_EQ(contentOf(text), json::parse(R"([{"name": "alice", "role": "operate", "namespaces": {"interop": "none"},
    "has_password": true, "fingerprints": [")" +
                                         kPrint + R"("], "subject": null},
    {"name": "bob", "role": "read", "namespaces": {}, "has_password": false, "fingerprints": [], "subject": "CN=bob"}])"));
  for (const std::string& each : {table, text}) EXPECT_THAT(each, Not(HasSubstr("$y$")));
}

TEST_F(UserCommands, AFileThatIsBrokenIsNotTouched) {
  host_.directory().write("users", "alice:*:read\nbob\n");
  for (const Words& words : {Words{"list"}, {"remove", "alice"}, {"role", "alice", "operate"}}) {
    expectFailed(words, 1, file() + ":2: the hash of bob must be");
  }
  EXPECT_EQ(contentsOf(file()), "alice:*:read\nbob\n");
}

TEST_F(UserCommands, WithoutTheRightsItSaysWhatToDo) {
  host_.directory().write("users", "alice:*:read\n");
  ::chmod(file().c_str(), 0600);
  const Outcome outcome = host_.runUnprivileged(with({"role", "alice", "operate"}));
  if (outcome.exitCode == 127) GTEST_SKIP() << "no other user can run the program here";
  if (::geteuid() != 0) GTEST_SKIP() << "this user owns the file";
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("Permission denied\nzorvactl: run it as root, who owns this file"));
}

TEST_F(UserCommands, ItIsAboutThisHost) { expectFailed({"list", "--url", "http://127.0.0.1:1"}, 2, "leave out --url"); }

TEST_F(UserCommands, AtATerminalThePasswordIsAskedForTwiceAndNotShown) {
  const Words questions{"Password of alice: ", "The same again: "};
  const std::string shown =
      host_.runAtTerminal(with({"add", "alice"}), questions, {"correct horse", "correct horse"}).out;
  EXPECT_THAT(shown, AllOf(HasSubstr("added alice: read"), Not(HasSubstr("correct"))));
  EXPECT_TRUE(access::isPasswordOf("correct horse", user("alice").hash));
  const Outcome outcome = host_.runAtTerminal(with({"add", "bob"}), {"Password of bob: ", "The same again: "},
                                              {"correct horse", "correct"});
  EXPECT_THAT(outcome.out, HasSubstr("the two passwords differ"));
  EXPECT_EQ(access::readUsersFile(file()).find("bob"), nullptr);
}

}  // namespace
}  // namespace zorva::cli
