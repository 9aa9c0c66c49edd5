// Each call on a file fails: on the interfaces' files, and on those of the values that are set through the agent.

#include <algorithm>
#include <array>
#include <sstream>

#include "FaultTest.h"
#include "FileCalls.h"
#include "agent/Agent.h"
#include "tests/support/Matchers.h"

namespace ZV::Test {
namespace {

class FileFaults : public FaultTest {
 protected:
  // Only the files make a difference: the same objects are returned, complete, with the usual code.
  static void expectSameObjects(const Request& request, const Ending& ending, const Usual& usual) {
    ASSERT_EQ(usual.ending.flown, ending.flown) << ending;
    const Outcome& now = ending.outcome;
    const Outcome& asUsual = usual.ending.outcome;
    if (request.name != "GetInstance of a name without keys" || now.rc != CMPI_RC_ERR_NOT_FOUND) {
      EXPECT_EQ(asUsual.rc, now.rc) << now;  // there the broker reports the key, and no later call replaces its code
    }
    EXPECT_EQ(asUsual.result.doneCount, now.result.doneCount);
    EXPECT_EQ(asUsual.markedExit(), now.markedExit());
    EXPECT_EQ(asUsual.result.data, now.result.data);
    EXPECT_EQ(asUsual.paths(), now.paths());
    ASSERT_EQ(asUsual.instances().size(), now.instances().size());
    for (std::size_t i = 0; i < now.instances().size(); ++i) {
      EXPECT_EQ(asUsual.instances()[i].path, now.instances()[i].path);
    }
  }

  // A signal, or a partial read or write, is no failure if the program can continue.
  static bool makesNoDifference(FileFault fault, FileCall failed) {
    const bool goesOn = failed == FileCall::Read || failed == FileCall::Write || failed == FileCall::Flock;
    return fault == FileFault::Interrupted || (fault == FileFault::HalfDone && goesOn);
  }
  void expectNoDifference(const Request& request, const Ending& ending, const Usual& usual) const {
    EXPECT_TRUE(isSame(usual.ending, ending)) << ending;
    EXPECT_EQ(request.kind == Kind::Modify ? usual.files : host_.filesAtFirst(), host_.files());
  }

  // A value that could not be read is that of the tree, or empty, or missing.
  static void expectOtherValuesOfFilesOnly(const Ending& ending, const Usual& usual) {
    for (std::size_t i = 0; i < ending.outcome.instances().size(); ++i) {
      const Instance& now = ending.outcome.instances()[i];
      for (const auto& [name, value] : usual.ending.outcome.instances()[i].properties) {
        if (now[name] == value) continue;
        EXPECT_THAT(name, AnyOf("DomainName", "RequestedHostname", "ConfigurationName", "DNSServerAddresses",
                                "DNSSuffixesToAppend"))
            << now;
        EXPECT_TRUE(!now.has(name) || now[name].text().empty() || now[name].text() == "example.org" ||
                    now[name].text() == "host1" || now[name].text() == "bmc")
            << name << ": " << now[name];
      }
    }
  }

  // The file was rewritten without some pieces or the end: it has the beginnings of old and new lines, and one may
  // continue with the next.
  static void expectCutShort(const std::string& content, const std::string& first, const std::string& usually) {
    const std::string known = "\n" + first + "\n" + usually;
    const auto isBeginning = [&](const std::string& text) { return known.find("\n" + text) != std::string::npos; };
    std::istringstream in(content);
    for (std::string line; std::getline(in, line);) {
      bool isKnown = false;
      for (std::size_t i = 0; i <= line.size(); ++i) {
        isKnown = isKnown || (isBeginning(line.substr(0, i)) && isBeginning(line.substr(i)));
      }
      EXPECT_TRUE(isKnown) << line;
    }
    EXPECT_LE(content.size(), std::max(first.size(), usually.size()));
  }

  void expectFiles(const Request& request, FileCall failed, const Usual& usual) const {
    const auto now = host_.files();
    for (const auto& [name, content] : now) {
      SCOPED_TRACE(name);
      const auto first = host_.filesAtFirst().find(name);
      const bool isFirst = first != host_.filesAtFirst().end() && first->second == content;
      if (isFirst) continue;
      ASSERT_EQ(Kind::Modify, request.kind) << content;
      if (name == "overlay.json") {
        EXPECT_NO_THROW(zorva::agent::overlayEntries()) << content;  // complete, with or without each of the values
        continue;
      }
      ASSERT_TRUE(first != host_.filesAtFirst().end()) << "a file is left over";
      if (failed == FileCall::Fputs || failed == FileCall::Fclose) {
        expectCutShort(content, first->second, usual.files.at(name));
      } else {
        expectLinesOldOrNew(content, first->second, usual.files.at(name));
      }
    }
    EXPECT_GE(now.size(), host_.filesAtFirst().size()) << "a file is gone";
  }

  static void expectLinesOldOrNew(const std::string& content, const std::string& first, const std::string& usually) {
    std::istringstream now(content);
    std::istringstream before(first);
    std::istringstream after(usually);
    std::string line;
    std::string oldLine;
    std::string newLine;
    while (std::getline(before, oldLine) && std::getline(after, newLine)) {
      ASSERT_TRUE(std::getline(now, line)) << "the file is shorter: " << content;
      EXPECT_THAT(line, AnyOf(oldLine, newLine));
    }
    EXPECT_FALSE(std::getline(now, line)) << "the file is longer: " << content;
  }
};

TEST_P(FileFaults, CostNoMoreThanTheValuesOfTheFile) {
  std::size_t tried = 0;
  std::array<std::size_t, kFileCalls> triedOfCall{};
  for (const Request& request : requests()) {
    for (const FileFault fault : kAllFileFaults) {
      SCOPED_TRACE(request.name + ", " + nameOf(fault));
      FileCall failed{};
      tried += failEachCall(
          request,
          [&](std::size_t n, const std::function<void()>& run) {
            host_.touch();
            const FailingFiles failing(n, fault);
            run();
            if (!failing.wasReached()) return false;
            failed = failing.failed();
            ++triedOfCall.at(static_cast<std::size_t>(failed));
            return true;
          },
          [&](std::size_t, const Ending& ending, const Usual& usual) {
            SCOPED_TRACE(nameOf(failed));
            if (makesNoDifference(fault, failed)) {
              expectNoDifference(request, ending, usual);
            } else {
              expectSameObjects(request, ending, usual);
              expectOtherValuesOfFilesOnly(ending, usual);
              expectFiles(request, failed, usual);
            }
          });
    }
  }
  report("file", tried);
  for (std::size_t i = 0; i < kFileCalls; ++i) countFaults(nameOf(static_cast<FileCall>(i)), triedOfCall.at(i));
}

ZV_ON_ALL_HOSTS(FileFaults);

}  // namespace
}  // namespace ZV::Test
