#include "CaseRun.h"

#include "tests/support/Matchers.h"

namespace ZV::Test {

namespace {

const std::string kMarks =
    "phrase: enters\n"
    "  log 4000 Zorvagent.DNSClientProvider markProviderEntry: banner\n"
    "  log 4000 Zorvagent.DNSClientProvider markProviderEntry: ENTERING DNSClient_GetInstance\n"
    "phrase: leaves\n"
    "  log 4000 Zorvagent.DNSClientProvider markProviderExit: EXITING DNSClient_GetInstance\n"
    "  log 4000 Zorvagent.DNSClientProvider markProviderExit: banner\n"
    "phrase: complains\n"
    "  log 6000 Zorvagent.DNSClientProvider DNSClient_GetInstance: MESSAGE \"At least one key should be passed\"\n";

// The only case of a file, whose provider's lines come first.
CaseFile fileOf(const std::string& rest, const std::string& provider = "DNSClientProvider") {
  return readCases("provider: " + provider + "\ncase: It\n" + rest + kMarks, "It.cases", {});
}

std::string resultOf(const std::string& rest, const std::string& provider = "DNSClientProvider") {
  const CaseFile file = fileOf(rest, provider);
  try {
    return differenceOf(file, file.cases.front());
  } catch (const CaseError& error) {
    return std::string("error ") + error.what();
  }
}

const std::string kRequest = "request: GetInstance of ZORVA_DNSProtocolEndPoint\n";
const std::string kHappens = "happens:\n  enters\n  complains\n  returnDone()\n  leaves\n";
const std::string kEnds = "ends: CMPI_RC_OK, done, marked\n";

const std::string kModification =
    "world:\n  nic eth0: host \"old\"\n  file eth0 \"A=b\\n\"\n"
    "request: ModifyInstance of ZORVA_DNSProtocolEndPoint.Name=\"eth0\"\n  Hostname = string \"new\"\n";

}  // namespace

TEST(CaseRuns, PassIfAllIsAsTheCaseSays) { EXPECT_EQ("", resultOf(kRequest + kHappens + kEnds)); }

TEST(CaseRuns, ReportTheFirstStepThatDiffersWithItsPlaceAndItsPhrase) {
  EXPECT_THAT(
      resultOf(kRequest + "happens:\n  enters\n  returnDone()\n  complains\n  leaves\n" + kEnds),
      AllOf(StartsWith("It.cases:6: what happens\n"), HasSubstr("expected:  returnDone()\n"),
            HasSubstr("actual:    log 6000 Zorvagent.DNSClientProvider DNSClient_GetInstance: MESSAGE \"At least")));
  EXPECT_THAT(resultOf(kRequest + "happens:\n  leaves\n  enters\n  complains\n  returnDone()\n" + kEnds),
              StartsWith("It.cases:5 (by It.cases:14): what happens\n"));
}

TEST(CaseRuns, ReportStepsThatAreMissingAndStepsTooMany) {
  EXPECT_THAT(resultOf(kRequest + "happens:\n  enters\n  complains\n  returnDone()\n" + kEnds),
              AllOf(StartsWith("It.cases:7, after this line: what happens"), HasSubstr("expected:  nothing more")));
  EXPECT_THAT(resultOf(kRequest + kHappens + "  returnDone()\n" + kEnds),
              AllOf(StartsWith("It.cases:9: what happens"), HasSubstr("actual:    nothing more")));
  EXPECT_THAT(resultOf(kRequest + "happens: nothing\n" + kEnds), StartsWith("It.cases:2: what happens"));
}

TEST(CaseRuns, ReportAnotherEnd) {
  EXPECT_THAT(resultOf(kRequest + kHappens + "ends: CMPI_RC_OK, left open\n"),
              AllOf(StartsWith("It.cases:9: how it ends"), HasSubstr("actual:    CMPI_RC_OK, done, marked")));
}

TEST(CaseRuns, ReportAChangeThatTheCaseDoesNotName) {
  const std::string result = resultOf(kModification + "happens: nothing\nends: CMPI_RC_OK, done, not marked\n");

  EXPECT_THAT(result, HasSubstr("what changes\n"));
  EXPECT_THAT(result, HasSubstr("actual:    node 1 host = \"new\""));
}

TEST(CaseRuns, ReportWhatTheClientGetsIfTheCaseSaysSo) {
  EXPECT_THAT(resultOf(kRequest + kHappens + kEnds + "gives:\n  value uint32 0\n"),
              StartsWith("It.cases:11: what the client gets"));
}

TEST(CaseRuns, CanBeRecorded) {
  const CaseFile file = fileOf(kModification + "happens: nothing\nends: x\n");

  const std::string record = recordOf(file, file.cases.front());

  EXPECT_THAT(record, StartsWith("happens:\n  log 4000 Zorvagent.DNSClientProvider markProviderEntry: banner\n"));
  EXPECT_THAT(record, HasSubstr("changes:\n  node 1 host = \"new\"\nends: CMPI_RC_OK, done, not marked\n"));
}

TEST(CaseRuns, RefuseAStepThatIsNeitherAPhraseNorACallNorALineOfTheLog) {
  EXPECT_THAT(resultOf(kRequest + "happens:\n  enters\n  complain\n" + kEnds),
              StartsWith("error It.cases:6: neither a phrase nor a call"));
}

TEST(CaseRuns, RefuseWordsThatTheyDoNotKnow) {
  const std::string rest = kHappens + kEnds;

  EXPECT_THAT(resultOf("request: GetInstances of X\n" + rest), StartsWith("error It.cases:3: an unknown operation"));
  EXPECT_THAT(resultOf("request: GetInstance X\n" + rest), StartsWith("error It.cases:3: 'of' is missing"));
  EXPECT_THAT(resultOf("request: GetInstance of X, propertys {}\n" + rest), HasSubstr("an unknown clause"));
  EXPECT_THAT(resultOf("request: GetInstance of X.Name=\"a\n" + rest), HasSubstr("no closing quote"));
  EXPECT_THAT(resultOf("request: GetInstance of X.Name\n" + rest), HasSubstr("a key has no '='"));
  EXPECT_THAT(resultOf("request:\n  GetInstance of X\n  A = string \"b\"\n" + rest), HasSubstr("takes no values"));
  EXPECT_THAT(resultOf("request:\n  ModifyInstance of X\n  A = strin \"b\"\n" + rest), HasSubstr("a value is missing"));
  EXPECT_THAT(resultOf("request:\n  ModifyInstance of X\n  A = uint16 b\n" + rest), HasSubstr("is no number"));
  EXPECT_THAT(resultOf("world: nick eth0\n" + kRequest + rest), StartsWith("error It.cases:3: an unknown part of a w"));
  EXPECT_THAT(resultOf("world: nic eth0: hots \"x\"\n" + kRequest + rest),
              HasSubstr("an unknown property of an inter"));
  EXPECT_THAT(resultOf("world: nic eth0 more\n" + kRequest + rest), HasSubstr("nothing more is understood"));
  EXPECT_THAT(resultOf("broker: serve X\n" + kRequest + rest), HasSubstr("an unknown part of a broker"));
  EXPECT_THAT(resultOf("broker: fails each newArray: nil\n" + kRequest + rest), HasSubstr("an unknown way to fail"));
  EXPECT_THAT(resultOf("broker: tree throws at 1 of reading\n" + kRequest + rest), HasSubstr("an unknown call of the"));
}

TEST(CaseRuns, RefuseAFailureThatIsNeverReached) {
  EXPECT_THAT(resultOf("broker: fails call 2 of returnDone: null\n" + kRequest + kHappens + kEnds),
              StartsWith("error It.cases:3: the request makes only 1 such calls"));
  EXPECT_THAT(resultOf("broker: fails each newArray: null\n" + kRequest + kHappens + kEnds),
              StartsWith("error It.cases:3: the request makes no such call"));
  EXPECT_THAT(resultOf("broker: tree throws at 1 of step\n" + kRequest + kHappens + kEnds),
              StartsWith("error It.cases:3: the request makes only 0 such calls"));
}

TEST(CaseRuns, LetOneCallAloneFailByItsNumber) {
  EXPECT_THAT(resultOf("broker:\n  fails call 1 of returnDone: rc set\n  fails call 1 of getKeyCount: null\n" +
                       kRequest + kHappens + kEnds),
              StartsWith("error It.cases:5: only one call can fail by its number"));
}

TEST(CaseRuns, RefuseAProviderOrATableThatIsNotThere) {
  EXPECT_THAT(resultOf(kRequest + kHappens + kEnds, "DNSProvider"), HasSubstr("no provider is called 'DNSProvider'"));
  EXPECT_THAT(resultOf("request: References of X\n" + kHappens + kEnds), HasSubstr("has no table for this operation"));
}

}  // namespace ZV::Test
