#include "FaultTest.h"

#include <algorithm>
#include <iostream>
#include <sstream>

#include "agent/Agent.h"
#include "agent/log/LogOutput.h"

namespace ZV::Test {
namespace {

// After which failures the request is repeated without one. Under a sanitizer, which checks the failures themselves,
// repeating all would take too long.
#ifdef ZORVA_SANITIZED
constexpr std::size_t kLookAgainAfter = 6;
#else
constexpr std::size_t kLookAgainAfter = 1;
#endif

std::map<std::string, std::size_t>& faultCounts() {
  static std::map<std::string, std::size_t> counts;
  return counts;
}

class TellFigures : public ::testing::Environment {
 public:
  void TearDown() override {
    for (const auto& [kind, tried] : faultCounts()) std::cout << kind << " faults tried: " << tried << "\n";
  }
};
[[maybe_unused]] const ::testing::Environment* const kTellFigures =
    ::testing::AddGlobalTestEnvironment(new TellFigures);

std::vector<std::string> linesOf(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

// Whether the words of one text are in the other in the same order, with some left out.
bool isThinnedOut(const std::string& thin, const std::string& full) {
  std::istringstream thinWords(thin);
  std::istringstream fullWords(full);
  std::string wanted;
  std::string word;
  while (thinWords >> wanted) {
    do {
      if (!(fullWords >> word)) return false;
    } while (word != wanted);
  }
  return true;
}

// A line KEY=value that is the usual one, or has only a part of its value.
bool hasLessOf(const std::string& line, const std::string& usual) {
  const std::size_t split = usual.find('=');
  return split != std::string::npos && line.substr(0, split + 1) == usual.substr(0, split + 1) &&
         isThinnedOut(line.substr(split + 1), usual.substr(split + 1));
}

}  // namespace

void countFaults(const std::string& kind, std::size_t tried) { faultCounts()[kind] += tried; }

std::string nameOfFaultTest(const ::testing::TestParamInfo<std::tuple<Tree, std::size_t>>& info) {
  return std::string(nameOf(std::get<0>(info.param))) + "_" + allProviders().at(std::get<1>(info.param)).prefix;
}

std::ostream& operator<<(std::ostream& out, const Ending& ending) {
  if (!ending.returned()) out << "flown: " << ending.what << "\n";
  return out << ending.outcome;
}

bool isSame(const Ending& left, const Ending& right) {
  const Outcome& l = left.outcome;
  const Outcome& r = right.outcome;
  const auto isSameCall = [](const RecordedCall& a, const RecordedCall& b) { return a.line == b.line; };
  const auto isSameLine = [](const LogLine& a, const LogLine& b) {  // the texts contain addresses
    return a.line == b.line && a.level == b.level && a.file == b.file && a.category == b.category;
  };
  return left.flown == right.flown && left.what == right.what && l.rc == r.rc && l.message == r.message &&
         l.result.doneCount == r.result.doneCount && l.result.instances == r.result.instances &&
         l.result.paths == r.result.paths && l.result.data == r.result.data && l.out == r.out &&
         std::equal(l.calls.begin(), l.calls.end(), r.calls.begin(), r.calls.end(), isSameCall) &&
         std::equal(l.lines.begin(), l.lines.end(), r.lines.begin(), r.lines.end(), isSameLine);
}

FaultTest::FaultTest() : host_(tree()) {
  host_.serveOthers(broker_);
  ZORVAGENT_LOG_ERROR("a line of the agent's own");  // from the first line on the recorder keeps memory for them
}

Ending FaultTest::run(const Request& request) {
  const std::size_t mark = broker_.mark();
  logger_.clear();
  Ending ending;
  try {
    ending.outcome = request.run(broker_);
  } catch (const std::exception& error) {
    ending.flown = Ending::Flown::Failure;
    ending.what = error.what();
  } catch (...) {
    ending.flown = Ending::Flown::Other;
  }
  if (!ending.returned()) {
    ending.outcome.calls = broker_.calls();
    ending.outcome.lines = logger_.pairs();
  }
  broker_.freeSince(mark);
  logger_.clear();
  return ending;
}

FaultTest::Usual FaultTest::usual(const Request& request) {
  const bool changesFiles = request.kind == Kind::Modify;
  if (changesFiles) host_.restore();
  broker_.startOver();
  Usual usual;
  usual.ending = run(request);
  if (changesFiles) {
    usual.files = host_.files();
    host_.restore();
    zorva::agent::currentTree();  // so that the agent holds the same as before
  }
  broker_.startOver();
  return usual;
}

std::size_t FaultTest::failEachCall(const Request& request, const Fail& fail, const Check& check, const IsNew& isNew) {
  usual(request);  // objects that are made once for the process exist from now on
  const Usual asUsual = usual(request);
  expectWellFormed(asUsual.ending, asUsual);
  const long blocks = liveBlocks();
  const std::size_t files = openFiles();
  std::size_t tried = 0;
  for (std::size_t n = 1;; ++n) {
    SCOPED_TRACE("call " + std::to_string(n));
    const Calls& calls = asUsual.ending.outcome.calls;
    if (isNew && n <= calls.size() && !isNew(calls[n - 1])) continue;
    {
      Ending ending;
      const bool reached = fail(n, [&] { ending = run(request); });
      broker_.failNever();
      if (!reached) {
        EXPECT_TRUE(isSame(asUsual.ending, ending)) << ending;
        host_.restore();
        return tried;
      }
      ++tried;
      expectWellFormed(ending, asUsual);
      check(n, ending, asUsual);
    }
    if (n % kLookAgainAfter == 0) {
      expectAsEver(request, asUsual, blocks, files);
    } else {
      host_.restore();
    }
    if (HasFailure()) return tried;
  }
}

void FaultTest::expectAsEver(const Request& request, const Usual& asUsual, long blocks, std::size_t files) {
  {
    const Usual again = usual(request);
    EXPECT_TRUE(isSame(asUsual.ending, again.ending)) << "ends otherwise than before: " << again.ending;
    EXPECT_EQ(asUsual.files, again.files);
  }
  if (HasFailure()) return;  // a failure message takes memory itself
  EXPECT_EQ(blocks, liveBlocks()) << "memory is left over";
  EXPECT_EQ(files, openFiles()) << "files stay open";
}

// Two associations compare by substring; a name that could not be read is empty, and every text contains it.
std::size_t FaultTest::mostResults(const char* call, const Usual& asUsual) const {
  constexpr std::size_t kSystems = 2;
  const std::string_view name = provider().className;
  const bool pairsByPart = name == "ZORVA_DNSHostedAccessPoint" || name == "ZORVA_DNSGeneralElementSettingData";
  return asUsual.ending.outcome.calls.count(call) * (pairsByPart ? kSystems : 1);
}

void FaultTest::expectWellFormed(const Ending& ending, const Usual& asUsual) const {
  const Calls& calls = ending.outcome.calls;
  const auto isReturn = [](const RecordedCall& call) {
    return call.name == "returnInstance" || call.name == "returnObjectPath" || call.name == "returnData";
  };
  const auto done =
      std::find_if(calls.begin(), calls.end(), [](const RecordedCall& call) { return call.name == "returnDone"; });
  EXPECT_LE(calls.count("returnDone"), 1U);
  EXPECT_TRUE(std::none_of(done, calls.end(), isReturn)) << "returned after returnDone";
  EXPECT_EQ(0U, calls.count("release") + calls.count("free")) << "objects are the broker's to end";
  for (const char* call : {"returnInstance", "returnObjectPath", "returnData"}) {
    EXPECT_LE(calls.count(call), mostResults(call, asUsual)) << call;
  }
  if (ending.returned()) {
    EXPECT_EQ(asUsual.ending.outcome.markedEntry(), ending.outcome.markedEntry());
  } else if (ending.what.find("_M_range_check") != std::string::npos) {
    EXPECT_STREQ("ZORVA_DNSGenOrderedComponent", provider().className);
  }
}

void FaultTest::expectKnownFiles(const Request& request, const Usual& asUsual) const {
  const auto now = host_.files();
  if (request.kind != Kind::Modify) {
    EXPECT_EQ(host_.filesAtFirst(), now);
    return;
  }
  for (const auto& [name, content] : now) {
    SCOPED_TRACE(name);
    if (name == "overlay.json") continue;  // written by the agent
    ASSERT_TRUE(asUsual.files.contains(name) && host_.filesAtFirst().contains(name)) << "an unexpected file";
    const std::vector<std::string> lines = linesOf(content);
    const std::vector<std::string> usualLines = linesOf(asUsual.files.at(name));
    const std::vector<std::string> firstLines = linesOf(host_.filesAtFirst().at(name));
    ASSERT_EQ(firstLines.size(), lines.size());
    for (std::size_t i = 0; i < lines.size(); ++i) {
      EXPECT_TRUE(lines[i] == firstLines[i] || hasLessOf(lines[i], usualLines[i])) << lines[i];
    }
  }
  EXPECT_TRUE(std::includes(now.begin(), now.end(), host_.filesAtFirst().begin(), host_.filesAtFirst().end(),
                            [](const auto& left, const auto& right) { return left.first < right.first; }))
      << "a file is gone";
}

void FaultTest::report(const char* kind, std::size_t tried) const {
  countFaults(kind, tried);
  RecordProperty("faults", std::to_string(tried));
  std::cout << provider().prefix << ", " << nameOf(tree()) << ": " << tried << " " << kind << " faults in "
            << requests().size() << " requests\n";
}

}  // namespace ZV::Test
