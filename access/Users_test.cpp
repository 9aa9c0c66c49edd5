#include "access/Users.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace zorva::access {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

const std::string kHash = "$y$j9T$dj.lgdJjMVKBjFehnsxjB1$" + std::string(43, 'x');
const std::string kPrint(64, 'a');

std::string errorOf(const std::string& text) {
  try {
    const Users users(text, "users");
  } catch (const UsersError& error) {
    return error.what();
  }
  return "nothing";
}

TEST(Users, ALineHasNameHashAndRole) {
  const Users users("# the users\n\nalice:" + kHash + ":operate\nbob:*:read\n", "users");
  ASSERT_NE(users.find("alice"), nullptr);
  EXPECT_EQ(users.find("alice")->hash, kHash);
  EXPECT_EQ(users.find("alice")->grants.in("root/cimv2"), Role::Operate);
  EXPECT_EQ(users.find("bob")->grants.in("root/cimv2"), Role::Read);
  EXPECT_EQ(users.find("Alice"), nullptr);
  EXPECT_EQ(users.find("# the users"), nullptr);
}

TEST(Users, ARoleMayDifferInNamespaces) {
  const Users users("alice:*:none:root/cimv2=operate,interop=read\n", "users");
  const Grants& grants = users.find("alice")->grants;
  EXPECT_EQ(grants.in("ROOT/cimv2"), Role::Operate);
  EXPECT_EQ(grants.in("interop"), Role::Read);
  EXPECT_EQ(grants.in("root/other"), Role::None);
}

TEST(Users, ACertificateBelongsToAUser) {
  const Users users(
      "alice:*:read:fingerprint=" + kPrint + ":subject=cn=alice, o = Exa\\, mple:x\nbob:*:read:subject=CN=bob\n",
      "users");
  EXPECT_EQ(users.find("alice")->subject, "CN=alice,O=Exa\\, mple:x");
  EXPECT_EQ(users.ofCertificate({"CN=bob", kPrint})->name, "alice");
  EXPECT_EQ(users.ofCertificate({"CN=bob", std::string(64, 'b')})->name, "bob");
  EXPECT_EQ(users.ofCertificate({"CN=alice,O=Exa\\, mple:x", ""})->name, "alice");
  EXPECT_EQ(users.ofCertificate({"CN=carol", ""}), nullptr);
  EXPECT_EQ(users.ofCertificate({"", ""}), nullptr);
}

TEST(Users, SubjectsThatDifferStayDifferent) {
  EXPECT_EQ(canonicalSubject("CN=a\\ ,O=b"), "CN=a\\ ,O=b");
  EXPECT_EQ(canonicalSubject("CN=a ,O=b"), "CN=a,O=b");
  EXPECT_EQ(canonicalSubject("CN=a\\,O=b"), "CN=a\\,O=b");
  EXPECT_EQ(canonicalSubject("CN=a+UID=7"), "CN=a+UID=7");
  for (const char* wrong : {"", "alice", "CN=a,", ",CN=a", "=a", "CN=a\n"})
    EXPECT_EQ(canonicalSubject(wrong), "") << wrong;
}

TEST(Users, AFingerprintMayHaveColons) {
  std::string spaced;
  for (int i = 0; i < 32; ++i) spaced += i == 0 ? "AA" : ":AA";
  EXPECT_EQ(canonicalFingerprint(spaced), kPrint);
  EXPECT_EQ(canonicalFingerprint("aa"), "");
  EXPECT_EQ(canonicalFingerprint(std::string(64, 'g')), "");
  EXPECT_EQ(canonicalFingerprint(std::string(100'000, 'a')), "");
}

TEST(Users, AnErrorNamesTheLineAndNotTheHash) {
  EXPECT_EQ(errorOf("#\nalice:*:boss\n"), "users:2: the role must be read, operate or none");
  EXPECT_EQ(errorOf("a b:*:read\n"),
            "users:1: the name must be 1 to 64 of A-Z a-z 0-9 . _ @ - and begin with a letter or a digit");
  EXPECT_EQ(errorOf("alice:*:read\nalice:*:read\n"), "users:2: the user alice is there twice");
  EXPECT_EQ(errorOf("alice:*:read:root/x=boss\n"), "users:1: the role in a namespace must be read, operate or none");
  EXPECT_EQ(errorOf("alice:*:read:a=read,A=read\n"), "users:1: a namespace is there twice");
  EXPECT_EQ(errorOf("alice:*:read:what\n"), "users:1: the role in a namespace must be read, operate or none");
  EXPECT_EQ(errorOf("alice:*:read:/x=read\n"),
            "users:1: a field after the role is neither NAMESPACE=ROLE nor of a certificate");
  EXPECT_EQ(errorOf("alice:*:read:fingerprint=12\n"), "users:1: a fingerprint must be 64 hexadecimal digits");
  EXPECT_EQ(errorOf("alice:*:read:subject=me\n"),
            "users:1: the subject must be a distinguished name such as CN=alice,O=Example");
  EXPECT_EQ(errorOf("a:*:read:subject=CN=x\nb:*:read:subject=CN=x\n"),
            "users:2: the subject of b is also of the user a");
  EXPECT_EQ(errorOf("alice:*:read\r\n"), "users:1: the line has a control character");
  EXPECT_EQ(errorOf("alice:*\xff:read\n"), "users:1: the line is not UTF-8");
  for (const std::string& line : {"alice:read:" + kHash, "alice:" + kHash + "x:read", kHash + ":alice:read"}) {
    EXPECT_THAT(errorOf(line), HasSubstr("users:1: "));
    EXPECT_THAT(errorOf(line), Not(HasSubstr("$y$")));
  }
}

TEST(Users, OnlyHashesOfKnownCostAreTaken) {
  EXPECT_THAT(errorOf("alice:$y$jFT$Av5kGxhYxozXI8qYiftuO/$" + std::string(43, 'x') + ":read\n"),
              HasSubstr("yescrypt"));
  EXPECT_THAT(errorOf("alice:$1$abc$" + std::string(22, 'x') + ":read\n"), HasSubstr("yescrypt"));
  EXPECT_THAT(errorOf("alice::read\n"), HasSubstr("yescrypt"));
}

TEST(Users, TheSizeIsLimited) {
  std::string lines;
  for (int i = 0; i < 10'001; ++i) lines += "#\n";
  EXPECT_EQ(errorOf(lines), "users:10001: the file has more than 10,000 lines");
  EXPECT_EQ(errorOf(std::string((1 << 20) + 1, '\n')), "users:1: the file is larger than 1 MiB");
  EXPECT_EQ(errorOf("#" + std::string(4096, 'x')), "users:1: the line is longer than 4096 bytes");
}

TEST(Users, AChangeLeavesTheOtherLines) {
  Users users("# first\nalice:*:read\n\n  \n# last\nbob:*:read:interop=none", "users");
  User alice = *users.find("alice");
  alice.grants = Grants(Role::Operate);
  alice.grants.set("interop", Role::None);
  alice.fingerprints.push_back(kPrint);
  alice.subject = "CN=alice";
  users.put(alice);
  users.put({"carol"});
  const std::string line = "alice:*:operate:interop=none:fingerprint=" + kPrint + ":subject=CN=alice\n";
  EXPECT_EQ(users.text(), "# first\n" + line + "\n  \n# last\nbob:*:read:interop=none\ncarol:*:none\n");
  EXPECT_EQ(*Users(users.text(), "users").find("alice"), alice);
  EXPECT_TRUE(users.remove("alice"));
  EXPECT_FALSE(users.remove("alice"));
  EXPECT_EQ(users.ofCertificate({"CN=alice", kPrint}), nullptr);
  EXPECT_EQ(users.text(), "# first\n\n  \n# last\nbob:*:read:interop=none\ncarol:*:none\n");
}

TEST(Users, AChangeThatCannotBeReadAgainIsRefused) {
  Users users("bob:*:read:subject=CN=bob\n", "users");
  const std::string before = users.text();
  EXPECT_THROW(users.put({"a:b"}), std::invalid_argument);
  EXPECT_THROW(users.put({"alice", "plain"}), std::invalid_argument);
  EXPECT_THROW(users.put({"alice", "*", Grants(), {}, "CN=bob"}), std::invalid_argument);
  EXPECT_THROW(users.put({"alice", "*", Grants(), {"\nroot"}, ""}), std::invalid_argument);
  EXPECT_EQ(users.text(), before);
}

}  // namespace
}  // namespace zorva::access
