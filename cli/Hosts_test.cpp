// zorvactl with several hosts, as a process.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <list>

#include "cli/output/Failure.h"
#include "cli/session/Servers.h"
#include "cli/testing/Forwarder.h"
#include "cli/testing/Running.h"
#include "cli/testing/TestServer.h"

namespace zorva::cli {
namespace {

std::vector<std::string> linesOf(const std::string& text) {
  std::vector<std::string> lines;
  for (std::size_t from = 0; from < text.size();) {
    const std::size_t end = text.find('\n', from);
    lines.push_back(text.substr(from, end - from));
    from = end + 1;
  }
  return lines;
}

// --- which hosts

class HostsFile : public testing::Test {
 protected:
  std::vector<Server> read(const std::string& text, ServerOptions options = {}) const {
    options.hostsFile = directory_.write("hosts", text);
    return serversOf(options);
  }

  void expectWrong(const std::string& text, const std::string& told, const ServerOptions& options = {}) const {
    try {
      read(text, options);
      FAIL() << text;
    } catch (const Failure& failure) {
      EXPECT_EQ(failure.exitCode(), ExitCode::WrongUsage);
      EXPECT_THAT(failure.what(), HasSubstr(told));
    }
  }

  zorva::agent::testing::TemporaryDirectory directory_;
};

TEST_F(HostsFile, NamesServersWithTheirUsersAndFingerprints) {
  ServerOptions options;
  options.user = "admin";
  options.caFile = "ca.pem";
  const auto servers = read("# all\n\nhost1 # the first\r\n  [2001:db8::1]:15989\t" + std::string(64, 'A') +
                                "\nhttps://other@host2/interop\nunix:/run/s#interop\nhost1:5989",
                            options);
  ASSERT_EQ(servers.size(), 4U) << "a host that is named twice is asked once";
  EXPECT_EQ(servers[0].url.endpoint(), "https://host1:5989/cimom");
  EXPECT_EQ(servers[0].url.user, "admin");
  EXPECT_EQ(servers[0].trust.caFile, "ca.pem");
  EXPECT_EQ(servers[1].url.shown(), "https://[2001:db8::1]:15989");
  EXPECT_EQ(servers[1].trust.fingerprint, std::string(64, 'a'));
  EXPECT_EQ(servers[1].trust.caFile, "");
  EXPECT_EQ(servers[2].url.user, "other");
  EXPECT_EQ(servers[2].url.nameSpace, "interop");
  EXPECT_EQ(servers[3].url.socket, "/run/s");
  EXPECT_EQ(servers[3].url.nameSpace, "interop");
  EXPECT_EQ(servers[3].url.user, "");
}

TEST_F(HostsFile, IsRefusedWithTheLineThatIsWrong) {
  expectWrong("host1\nho st2\n", "hosts, line 2: 'st2' is no SHA-256 fingerprint");
  expectWrong("host1\n\nho/%st\n", "hosts, line 3: --url: ");
  expectWrong("https://a:secret@h\n", "hosts, line 1: --url: a password in a URL is not taken");
  expectWrong("http://h " + std::string(64, 'a'), "line 1: a fingerprint is about the certificate of an https server");
  expectWrong("# none\n", "names no host");
  expectWrong(std::string((std::size_t{1} << 20U) + 1, '\n'), "larger than 1 MiB");
  std::string many;
  for (int i = 0; i <= 10000; ++i) many += "h" + std::to_string(i) + "\n";
  expectWrong(many, "there are more than 10000 hosts");
  ServerOptions pinned;
  pinned.fingerprint = std::string(64, 'a');
  expectWrong("host1\n", "--fingerprint fits one server, and several are named", pinned);
}

TEST_F(HostsFile, ThatIsMissingIsReported) {
  ServerOptions options;
  options.hostsFile = "/nowhere/hosts";
  EXPECT_THROW(serversOf(options), Failure);
}

TEST_F(HostsFile, GivesEachServerAShortNameOfItsOwn) {
  const auto labels = [&](const std::string& text) { return labelsOf(read(text)); };
  using testing::ElementsAre;
  EXPECT_THAT(labels("a\nhttps://b:1/interop\nunix:/s"), ElementsAre("a", "b", "unix:/s"));
  EXPECT_THAT(labels("a\na:1"), ElementsAre("a:5989", "a:1"));
  EXPECT_THAT(labels("a:1\nhttp://a:1"), ElementsAre("https://a:1", "http://a:1"));
  EXPECT_THAT(
      labels("a\nhttps://a/interop\nunix:/s\nunix:/s#interop"),
      ElementsAre("https://a:5989/root/cimv2", "https://a:5989/interop", "unix:/s#root/cimv2", "unix:/s#interop"));
}

// --- their results

/// Two hosts with servers of their own.
class Hosts : public testing::Test {
 protected:
  void SetUp() override {
    ASSERT_NE(one_.url(), "");
    ASSERT_NE(two_.url(), "");
    for (const TestHost* each : {&first_, &second_}) each->directory().write("data/ifcfg-eth0", kWholeFile);
    first_.directory().write("hosts", one_.url() + "\n" + two_.url() + "\n");
  }

  std::string file() const { return first_.directory() / "hosts"; }
  Outcome run(Words words) const {
    words.insert(words.end(), {"--hosts", file()});
    return first_.run(words);
  }
  static std::string labelOf(const TestServer& server) { return server.url().substr(7); }

  static std::string domainOf(const TestHost& host) {
    const std::string text = contentsOf(host.dataFile("ifcfg-eth0"));
    const std::size_t from = text.find("DOMAINNAME=") + 11;
    return text.substr(from, text.find('\n', from) - from);
  }

  TestHost first_;
  TestHost second_{{TestHost::port("eth0"), TestHost::port("eth7")}};
  TestServer one_{first_};
  TestServer two_{second_};
};

/// Every command that puts results together, with a dry run for those that change.
TEST_F(Hosts, AreInTheFirstColumnOfEachTable) {
  const std::string setting = kSetting;
  for (const Words& words :
       std::vector<Words>{{"show"},
                          {"show", "eth0"},
                          {"classes"},
                          {"ei", kGeneral},
                          {"names", "ZORVA_DNSSettingData"},
                          {"get", setting},
                          {"ai", kEndpoint},
                          {"ain", kEndpoint},
                          {"ri", kEndpoint},
                          {"rin", kEndpoint},
                          {"dns", "show", "eth0"},
                          {"suffixes", "show"},
                          {"dns", "add", "eth0", "192.0.2.7", "--dry-run"},
                          {"domain", "eth0", "x.example", "--dry-run"},
                          {"suffixes", "set", "x.example", "--dry-run"},
                          {"modify", setting, "DomainName=x.example", "--dry-run"},
                          {"invoke", kEndpoint, "SetDNSDomain", "DNSDomain=x.example", "--dry-run"}}) {
    const Outcome outcome = run(words);
    EXPECT_EQ(outcome.exitCode, 0) << words[0] << outcome.err;
    EXPECT_EQ(outcome.err, "") << words[0];
    std::size_t ofOne = 0;
    std::size_t ofTwo = 0;
    for (const std::string& line : linesOf(outcome.out)) {
      ofOne += line.starts_with(labelOf(one_) + "  ") ? 1 : 0;
      ofTwo += line.starts_with(labelOf(two_) + "  ") ? 1 : 0;
      EXPECT_TRUE(line.empty() || line.starts_with("HOST ") || line.starts_with("127.0.0.1:")) << words[0] << line;
    }
    EXPECT_GT(ofOne, 0U) << words[0];
    EXPECT_GT(ofTwo, 0U) << words[0];
  }
}

TEST_F(Hosts, AreInEachRowOfTheJson) {
  const auto resultsOf = [&](const Words& words) {
    Words all = words;
    all.insert(all.end(), {"-o", "json"});
    const Outcome outcome = run(all);
    EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
    return contentOf(outcome.out);
  };
  const auto aloneOf = [&](Words words) {
    words.insert(words.end(), {"-o", "json", "--url", two_.url()});
    return contentOf(first_.run(words).out);
  };
  json rows = resultsOf({"names", "ZORVA_DNSSettingData"});
  ASSERT_EQ(rows.size(), 4U);
  EXPECT_EQ(rows[0]["host"], labelOf(one_));
  EXPECT_EQ(rows[3]["host"], labelOf(two_));
  EXPECT_EQ(rows[3]["result"], aloneOf({"names", "ZORVA_DNSSettingData"})[1]);
  rows = resultsOf({"show"});
  ASSERT_EQ(rows.size(), 2U);
  EXPECT_EQ(rows[1]["result"], aloneOf({"show"}));
  rows = resultsOf({"dns", "show", "eth0"});
  EXPECT_EQ(rows[0], json::parse(R"({"host": ")" + labelOf(one_) + R"(", "result": "192.0.2.53"})"));
}

TEST_F(Hosts, MayBeNamedByUrls) {
  const Outcome outcome = first_.run({"names", kGeneral, "--url", one_.url(), "--url", two_.url()});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_THAT(outcome.out, AllOf(HasSubstr("\n" + labelOf(one_) + "  "), HasSubstr("\n" + labelOf(two_) + "  ")));
}

TEST_F(Hosts, AreRefusedWhereResultsCannotBePutTogether) {
  for (const auto& [words, told] : std::vector<std::pair<Words, std::string>>{
           {{"graph"}, "zorvactl graph asks one host, and several are named"},
           {{"check"}, "zorvactl check asks one host"},
           {{"tree"}, "is about files of this host"},
           {{"ei", "ZORVA_DNSSettingData", "-o", "mof"}, "the results of several hosts cannot be written as mof"},
           {{"ei", "ZORVA_DNSSettingData", "-o", "xml"}, "the results of several hosts cannot be written as xml"}}) {
    const Outcome outcome = run(words);
    EXPECT_EQ(outcome.exitCode, 2) << words[0];
    EXPECT_THAT(outcome.err, HasSubstr(told));
  }
}

TEST_F(Hosts, EachReportItsFailure) {
  const Outcome outcome = run({"dns", "show", "eth1"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.out, AllOf(HasSubstr(labelOf(one_)), Not(HasSubstr(labelOf(two_)))));
  EXPECT_THAT(outcome.err,
              AllOf(HasSubstr("zorvactl: " + labelOf(two_) + ": there are no DNS settings of an interface"),
                    HasSubstr("did you mean eth0?\n"), EndsWith("zorvactl: 1 of 2 hosts failed\n")));
  EXPECT_EQ(run({"ei", "ZORVA_DNSProtocol"}).exitCode, 2) << "wrong usage on each";
}

TEST_F(Hosts, AreChangedAfterAYes) {
  const Words words{"domain", "eth0", "lab.example.org"};
  Outcome outcome = run(words);
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.out, AllOf(HasSubstr(labelOf(one_)), HasSubstr(labelOf(two_)), HasSubstr("lab.example.org")));
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("nothing was changed: this is what would change on 2 hosts\n"),
                                 HasSubstr("--yes changes it")));
  EXPECT_EQ(domainOf(first_) + domainOf(second_), "example.orgexample.org");

  outcome = run({"domain", "eth0", "lab.example.org", "--yes", "--dry-run"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(domainOf(first_) + domainOf(second_), "example.orgexample.org");

  outcome = run({"domain", "eth0", "lab.example.org", "--yes"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(domainOf(first_), "lab.example.org");
  EXPECT_EQ(domainOf(second_), "lab.example.org");
}

TEST_F(Hosts, AreChangedIfThePersonAtTheTerminalAgrees) {
  const Words words{"domain", "eth0", "lab.example.org", "--hosts", file()};
  const Words question{"change this on 2 hosts? [y/N]: "};
  EXPECT_EQ(first_.runAtTerminal(words, question, {"n"}).exitCode, 1);
  EXPECT_EQ(domainOf(first_), "example.org");
  const Outcome outcome = first_.runAtTerminal(words, question, {"y"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.out;
  EXPECT_EQ(domainOf(first_), "lab.example.org");
}

TEST_F(Hosts, AreNotChangedWhereOneCannotBe) {
  Outcome outcome = run({"domain", "eth1", "lab.example.org"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("1 of 2 hosts failed; nothing was changed\n"),
                                 HasSubstr("--yes changes it on the others")));
}

// --- many

TEST(ManyHosts, AnswerWhileThreeFail) {
  constexpr int kGood = 37;
  const TestHost host;
  const TestServer server(host);
  ASSERT_NE(server.url(), "");
  const http::testing::TestAuthority authority(host.directory(), "ca");
  const SilentServer silent("127.0.0.101");
  const Forwarder wrong(authority.issue("wrong", {.names = {"192.0.2.1"}}), server.url(), "127.0.0.102");
  std::list<Forwarder> good;
  std::string text = "127.0.0.100:1\n" + silent.address() + "\n" + wrong.url() + "\n";
  for (int i = 1; i <= kGood; ++i) {
    const std::string address = "127.0.0." + std::to_string(i);
    good.emplace_back(authority.issue(address, {.names = {address}}), server.url(), address);
    text += good.back().url().substr(8) + "\n";
  }
  const std::string file = host.directory().write("hosts", text);
  const Outcome outcome = host.run({"names", kGeneral, "--hosts", file, "--ca", authority.file(), "--timeout", "4"});
  EXPECT_EQ(outcome.exitCode, 1);
  const std::vector<std::string> lines = linesOf(outcome.out);
  ASSERT_EQ(lines.size(), 1U + kGood) << outcome.err;
  for (int i = 1; i <= kGood; ++i) {
    EXPECT_THAT(lines[static_cast<std::size_t>(i)], StartsWith("127.0.0." + std::to_string(i) + " "));
  }
  EXPECT_THAT(outcome.err,
              AllOf(HasSubstr("127.0.0.100: no answer from https://127.0.0.100:1: "),
                    HasSubstr("127.0.0.101: no whole answer from https://" + silent.address() + " within 4 s\n"),
                    HasSubstr("127.0.0.102: the certificate of " + wrong.url() + " is not trusted"),
                    EndsWith("zorvactl: 3 of 40 hosts failed\n")));
  EXPECT_EQ(wrong.received(), "");
}

TEST(ManyHosts, ShowTheirProgressAtATerminal) {
  const TestHost host;
  const SilentServer silent;
  const Outcome outcome = host.run(
      {"names", kGeneral, "--url", "https://" + silent.address(), "--url", "https://127.0.0.1:1", "--timeout", "1"},
      OutputTo::ErrorTerminal);
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("asking 2 hosts, 1 answered ..."));
}

TEST(OneHost, HasALimitOfTimeIfOneIsGiven) {
  const SilentServer silent;
  const Outcome outcome =
      TestHost().run({"names", kGeneral, "--url", "http://" + silent.address(), "--timeout", "0.2"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("no whole answer from http://" + silent.address() + " within 0.2 s\n"),
                                 HasSubstr("--timeout SECONDS waits longer")));
}

}  // namespace
}  // namespace zorva::cli
