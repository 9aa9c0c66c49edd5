#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

TEST_F(Changing, DnsCommandsChangeTheServers) {
  done(host_, {"dns", "set", "eth0", "192.0.2.1", "2001:db8::1"});
  EXPECT_EQ(file(), wholeFileWith("192.0.2.53 2001:db8::53 ", "192.0.2.1 2001:db8::1 "));
  done(host_, {"dns", "add", "eth0", "192.0.2.2", "192.0.2.1"});
  EXPECT_EQ(done(host_, {"dns", "show", "eth0"}), "192.0.2.1\n2001:db8::1\n192.0.2.2\n");
  done(host_, {"dns", "remove", "eth0", "2001:db8::1"});
  EXPECT_EQ(done(host_, {"dns", "show", "eth0", "-o", "json"}),
            "{\n  \"version\": 1,\n  \"results\": [\n    \"192.0.2.1\",\n    \"192.0.2.2\"\n  ]\n}\n");
  done(host_, {"dns", "set", "eth0"});
  EXPECT_EQ(file(), wholeFileWith("192.0.2.53 2001:db8::53 ", ""));
}

TEST_F(Changing, DnsCommandsRefuseWhatIsNoAddress) {
  for (const char* server : {"dns.example.org", "1.2.3", "1.2.3.4 5.6.7.8", "", "1.2.3.4%eth0", "fe80::1%", "::1\n"}) {
    expectFailed(host_, {"dns", "set", "eth0", server}, 2, "");
  }
  expectFailed(host_, {"dns", "remove", "eth0", "198.51.100.1"}, 1,
               "there is no server 198.51.100.1 to remove\nzorvactl: there are 192.0.2.53, 2001:db8::53");
  EXPECT_EQ(file(), kWholeFile);
  done(host_, {"dns", "add", "eth0", "fe80::1%eth0"});
}

TEST_F(Changing, DnsCommandsNameTheInterfacesThereAre) {
  expectFailed(host_, {"dns", "show", "eth7"}, 1, "interface eth7\nzorvactl: did you mean eth0?");
}

TEST(Dns, FailsIfThereIsNoFile) {
  const Outcome outcome = TestHost().run({"dns", "set", "eth0", "192.0.2.1"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("'zorvactl ifcfg init eth0' makes it"));
  EXPECT_THAT(TestHost().run({"dns", "set", "eth0", "192.0.2.1", "--dry-run"}).err, HasSubstr("would not be stored"));
}

TEST_F(Changing, DnsCommandsRefuseWhatNoServerHas) {
  for (const char* command : {"set", "add"}) {
    for (const char* server : {"0.0.0.0", "::", "::ffff:0.0.0.0"}) {
      expectFailed(host_, {"dns", command, "eth0", "192.0.2.1", server}, 2,
                   std::string("'") + server + "' is the unspecified address");
    }
    for (const char* server : {"224.0.0.1", "239.255.255.255", "ff02::fb", "::ffff:224.0.0.1"}) {
      expectFailed(host_, {"dns", command, "eth0", server}, 2, std::string("'") + server + "' is a multicast address");
    }
    for (const Words& pair : std::vector<Words>{{"192.0.2.1", "192.0.2.1"}, {"2001:db8::1", "2001:DB8:0::1"}}) {
      expectFailed(host_, {"dns", command, "eth0", pair[0], pair[1]}, 2, "'" + pair[1] + "' is given twice");
    }
  }
  EXPECT_EQ(file(), kWholeFile);
  done(host_, {"dns", "set", "eth0", "fe80::1%eth0", "fe80::1%eth1", "223.255.255.1"});
}

TEST_F(Changing, DnsAddKnowsAServerInAnySpelling) {
  done(host_, {"dns", "add", "eth0", "2001:DB8:0::53"});
  EXPECT_EQ(file(), kWholeFile);
}

}  // namespace
}  // namespace zorva::cli
