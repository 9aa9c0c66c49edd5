// The library in a foreign process: together with another that has all its names, loaded and unloaded repeatedly, used
// by two brokers, and with an agent that cannot work.

#include <dlfcn.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <malloc.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <memory>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "Library.h"
#include "broker/Broker.h"
#include "schema/Schema.h"
#include "tests/faults/LiveMemory.h"

namespace {

std::vector<std::string> syslogLines;

void takeSyslogLine(const char* format, va_list arguments) {
  char line[1024];
  std::vsnprintf(line, sizeof line, format, arguments);
  syslogLines.emplace_back(line);
}

}  // namespace

// Replace the C library's functions for every library in this process; a fortified build calls the second one.
extern "C" __attribute__((visibility("default"), format(printf, 2, 3))) void syslog(int, const char* format, ...) {
  va_list arguments;
  va_start(arguments, format);
  takeSyslogLine(format, arguments);
  va_end(arguments);
}
extern "C" __attribute__((visibility("default"), format(printf, 3, 4))) void __syslog_chk(int, int, const char* format,
                                                                                          ...) {
  va_list arguments;
  va_start(arguments, format);
  takeSyslogLine(format, arguments);
  va_end(arguments);
}

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;

std::string everythingAlone() {
  RecordingBroker broker;
  serveOthers(broker);
  const Library library(providerLibraryPath(), RTLD_LOCAL);
  return askEverything(library, broker);
}

// --- Names.

// Everything in this library aborts.
const std::string kSameNames = ZORVA_LIB_DIR "/libzorvasamenames.so";

TEST(SameNames, AreNotMixedUpWhicheverLibraryCameFirst) {
  const DocumentHost host;
  const std::string alone = everythingAlone();
  EXPECT_THAT(alone, HasSubstr("ZORVA_DNSProtocolEndPoint CMPI_RC_OK done"));
  for (const bool isFirst : {true, false}) {
    SCOPED_TRACE(isFirst);
    RecordingBroker broker;
    serveOthers(broker);
    const auto before = isFirst ? std::make_unique<Library>(kSameNames, RTLD_GLOBAL) : nullptr;
    const Library library(providerLibraryPath(), RTLD_GLOBAL);
    const auto after = isFirst ? nullptr : std::make_unique<Library>(kSameNames, RTLD_GLOBAL);
    EXPECT_EQ(alone, askEverything(library, broker));
    const Library& other = isFirst ? *before : *after;
    std::cout << *other.find<const int*>("zorvaSameNames") << " names\n";
    EXPECT_NE(other.find<void*>("DNSClientProvider_Create_InstanceMI"),
              library.find<void*>("DNSClientProvider_Create_InstanceMI"));
  }
}

TEST(SameNames, LoadedGlobalTheLibraryGivesNothingAwayButItsCreateFunctions) {
  // Not RTLD_DEFAULT: a library in which that finds a name is never unloaded.
  const std::unique_ptr<void, int (*)(void*)> global(::dlopen(nullptr, RTLD_NOW), ::dlclose);
  const Library library(providerLibraryPath(), RTLD_GLOBAL);
  EXPECT_NE(nullptr, ::dlsym(global.get(), "DNSClientProvider_Create_InstanceMI"));
  const Library same(kSameNames, RTLD_LOCAL);
  for (const char* name : {"_ZN2ZV19DNSClientObjFactoryC1Ev", "_ZN2ZV20loggerDNSSettingDataB5cxx11E"}) {
    EXPECT_NE(nullptr, same.find<void*>(name));
    EXPECT_EQ(nullptr, ::dlsym(global.get(), name)) << name;
  }
}

// --- Cycles.

struct Held {
  long blocks;  // of operator new, in all libraries
  std::size_t heapBytes;
  std::ptrdiff_t maps;  // of libraries
  std::size_t files;
};

Held heldNow() {
  std::ifstream maps("/proc/self/maps");
  std::ptrdiff_t ofLibraries = 0;
  for (std::string line; std::getline(maps, line);) ofLibraries += line.find(".so") != std::string::npos ? 1 : 0;
  return {liveBlocks(), ::mallinfo2().uordblks, ofLibraries, openFiles()};
}

TEST(LoadCycles, AHundredLeaveNothingOver) {
  constexpr int kUntilSettled = 10;
#ifdef ZORVA_SANITIZED
  constexpr int kCycles = 20;  // each takes ten times as long
#else
  constexpr int kCycles = 100;
#endif
  // Malloc and the loader keep a little for later use. The blocks of operator new are counted exactly.
  constexpr std::size_t kSlack = 64 << 10;
  const DocumentHost host;
  const std::string first = everythingAlone();
  for (int i = 0; i < kUntilSettled; ++i) EXPECT_EQ(first, everythingAlone());
  const Held before = heldNow();
  for (int i = 0; i < kCycles; ++i) ASSERT_EQ(first, everythingAlone()) << i;
  const Held after = heldNow();
  std::cout << after.blocks << " blocks, heap before " << before.heapBytes << ", after " << after.heapBytes << "\n";
  EXPECT_EQ(before.blocks, after.blocks);
  EXPECT_EQ(before.maps, after.maps);
  EXPECT_EQ(before.files, after.files);
  EXPECT_LT(after.heapBytes, before.heapBytes + kSlack);
  EXPECT_EQ(nullptr, ::dlopen(providerLibraryPath().c_str(), RTLD_NOW | RTLD_NOLOAD));
}

// --- An agent that cannot work.

// What a server's process sees of a host whose agent has those files, before it makes any request: the end of each
// enumeration of the setting data, the lines on standard error, and those for syslog.
struct Seen {
  std::vector<std::string> ends;
  std::vector<std::string> logged;
  std::vector<std::string> syslogged;
  std::vector<std::string> sysloggedByFork;
};

std::vector<std::string> linesOf(const std::string& path) {
  std::vector<std::string> lines;
  std::ifstream in(path);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

/// The lines for syslog of a process that is forked from a server's after it has asked.
std::vector<std::string> syslogOfFork(InstanceProvider& provider) {
  int ends[2];
  if (::pipe(ends) != 0) throw std::runtime_error("no pipe");
  const pid_t child = ::fork();
  if (child == 0) {
    syslogLines.clear();
    for (int i = 0; i < 2; ++i) provider.enumerateInstances(Path("ZORVA_DNSSettingData"));
    for (const std::string& line : syslogLines) (void)!::write(ends[1], (line + "\n").c_str(), line.size() + 1);
    ::_exit(0);
  }
  ::close(ends[1]);
  std::string text;
  char buffer[1024];
  for (ssize_t count = 0; (count = ::read(ends[0], buffer, sizeof buffer)) > 0;) {
    text.append(buffer, static_cast<std::size_t>(count));
  }
  ::close(ends[0]);
  ::waitpid(child, nullptr, 0);
  std::vector<std::string> lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

Seen enumerateTwice(const zorva::agent::testing::TemporaryDirectory& directory) {
  ::setenv("ZORVAGENT_CONFIG", (directory / "agent.toml").c_str(), 1);
  const int standardError = ::dup(STDERR_FILENO);
  const int file = ::open((directory / "stderr").c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
  ::dup2(file, STDERR_FILENO);
  ::close(file);
  syslogLines.clear();
  Seen seen;
  {
    RecordingBroker broker;
    const Library library(providerLibraryPath(), RTLD_LOCAL);
    const auto create = library.find<InstanceProvider::Create>("DNSSettingDataProvider_Create_InstanceMI");
    InstanceProvider provider(create, broker);
    try {  // caught here: the exception is the library's own, and ends with it
      for (int i = 0; i < 2; ++i) {
        const Outcome outcome = provider.enumerateInstances(Path("ZORVA_DNSSettingData"));
        seen.ends.push_back(std::string(nameOf(outcome.rc)) + (outcome.done() ? " done, " : " open, ") +
                            std::to_string(outcome.instances().size()));
      }
      askEverything(library, broker);
      seen.sysloggedByFork = syslogOfFork(provider);
    } catch (const std::exception& error) {
      seen.ends.push_back(std::string("an exception: ") + error.what());
    }
  }
  ::dup2(standardError, STDERR_FILENO);
  ::close(standardError);
  ::unsetenv("ZORVAGENT_CONFIG");
  seen.logged = linesOf(directory / "stderr");
  std::erase_if(seen.logged,
                [](const std::string& line) { return line.find(" Zorvagent.Agent ") == std::string::npos; });
  seen.syslogged = syslogLines;
  return seen;
}

TEST(PlainLoader, AWrongConfigurationIsAnEmptyEnumerationWithALineToTheLogAndToSyslog) {
  const zorva::agent::testing::TemporaryDirectory directory;
  directory.write("agent.toml", "[agent]\nlangauge = \"en\"\n");
  const Seen seen = enumerateTwice(directory);
  const std::string reason = directory / "agent.toml:2: agent.langauge: is not a known key; did you mean language?";
  EXPECT_THAT(seen.ends, ElementsAre("CMPI_RC_OK done, 0", "CMPI_RC_OK done, 0"));
  EXPECT_THAT(seen.logged, ElementsAre(HasSubstr("the tree cannot be read: " + reason), HasSubstr(reason)))
      << "one of this process, and one of that which was forked";
  EXPECT_THAT(seen.syslogged, ElementsAre("zorvagent: the tree cannot be read: " + reason));
  EXPECT_THAT(seen.sysloggedByFork, ElementsAre("zorvagent: the tree cannot be read: " + reason));
}

TEST(PlainLoader, TheReasonIsInSyslogOnceWhateverTheTargetOfTheLog) {
  for (const char* target : {"off", "syslog", "stderr"}) {
    SCOPED_TRACE(target);
    const zorva::agent::testing::TemporaryDirectory directory;
    directory.write("agent.toml", std::string("[tree]\nsource = \"file\"\nfile = \"none.json\"\n[log]\ntarget = \"") +
                                      target + "\"\n");
    const Seen seen = enumerateTwice(directory);
    EXPECT_THAT(seen.ends, ElementsAre("CMPI_RC_OK done, 0", "CMPI_RC_OK done, 0"));
    const auto isReason = HasSubstr(directory / "none.json: cannot be read");
    EXPECT_EQ(std::count_if(seen.syslogged.begin(), seen.syslogged.end(),
                            [&](const std::string& line) { return ::testing::Matches(isReason)(line); }),
              1);
  }
}

TEST(PlainLoader, ATargetOfTheLogThatCannotBeOpenedIsInSyslog) {
  const zorva::agent::testing::TemporaryDirectory directory;
  directory.write("agent.toml", "[tree]\nsource = \"file\"\nfile = \"tree.json\"\n[log]\ntarget = \"absent/log\"\n");
  directory.write("tree.json", "{}");
  const std::string problem = "cannot be opened as a log: No such file or directory; its lines are lost";
  EXPECT_THAT(enumerateTwice(directory).syslogged,
              ElementsAre("zorvagent: " + (directory / "absent/log") + ": " + problem));
}

TEST(PlainLoader, ATreeThatCannotBeReadIsAnEmptyEnumerationWithALineToTheLogAndToSyslog) {
  const zorva::agent::testing::TemporaryDirectory directory;
  directory.write("agent.toml", "[tree]\nsource = \"file\"\nfile = \"tree.json\"\n");
  directory.write("tree.json", "{\n\"system\": 1}");
  const Seen seen = enumerateTwice(directory);
  const std::string reason = directory / "tree.json:2: system: is not a known key";
  EXPECT_THAT(seen.ends, ElementsAre("CMPI_RC_OK done, 0", "CMPI_RC_OK done, 0"));
  EXPECT_THAT(seen.logged, ElementsAre(HasSubstr(reason), HasSubstr(reason)));
  EXPECT_THAT(seen.syslogged, ElementsAre(HasSubstr(reason)));
}

// --- Brokers.

TEST(TwoBrokers, TheLatestThatCalledACreateFunctionIsAsked) {
  const DocumentHost host;
  const Library library(providerLibraryPath(), RTLD_LOCAL);
  for (const auto& [prefix, className, isAssociation] : allProviderNames()) {
    SCOPED_TRACE(prefix);
    RecordingBroker first;
    RecordingBroker second;
    serveOthers(first);
    serveOthers(second);
    const auto create = library.find<InstanceProvider::Create>(std::string(prefix) + "_Create_InstanceMI");
    InstanceProvider provider(create, first);
    const Outcome alone = provider.enumerateInstances(Path(className));
    first.startOver();

    const InstanceProvider later(create, second);
    EXPECT_EQ(provider.mi(), later.mi()) << "the table is one for both";
    // With the first broker's objects: objects are made by the second, arguments and results belong to the first.
    const Outcome mixed = provider.enumerateInstances(Path(className));
    EXPECT_EQ(alone.rc, mixed.rc);
    EXPECT_EQ(alone.instances(), mixed.instances());
    EXPECT_EQ(0U, first.callsOf("newObjectPath") + first.callsOf("newInstance"));
    EXPECT_LT(0U, second.callsOf("newObjectPath"));
    EXPECT_EQ(mixed.instances().size(), first.callsOf("returnInstance"));
  }
}

TEST(TwoBrokers, AnAssociationsCreateFunctionCountsForItsInstancesToo) {
  const DocumentHost host;
  const Library library(providerLibraryPath(), RTLD_LOCAL);
  for (const auto& [prefix, className, isAssociation] : allProviderNames()) {
    if (!isAssociation) continue;
    SCOPED_TRACE(prefix);
    RecordingBroker first;
    RecordingBroker second;
    serveOthers(first);
    serveOthers(second);
    InstanceProvider instances(library.find<InstanceProvider::Create>(std::string(prefix) + "_Create_InstanceMI"),
                               first);
    const AssociationProvider later(
        library.find<AssociationProvider::Create>(std::string(prefix) + "_Create_AssociationMI"), second);
    instances.enumerateInstances(Path(className));
    EXPECT_EQ(0U, first.callsOf("newObjectPath"));
    EXPECT_LT(0U, second.callsOf("newObjectPath"));
  }
}

// Two of the project's own brokers share the library; each gets what it would get alone, alternately and after the
// other is gone.
TEST(TwoBrokers, EachGetsItsOwnAnswers) {
  const DocumentHost host;
  zorva::broker::BrokerOptions options;
  options.providerDirectory = ZORVA_LIB_DIR;
  const auto classes = zorva::schema::loadBuiltInClasses();
  const auto ask = [](zorva::broker::Broker& broker) {
    std::vector<zorva::broker::Instance> all;
    for (const auto& [prefix, className, isAssociation] : allProviderNames()) {
      const auto status = broker.enumerateInstances("root/cimv2", className, {}, [&](const auto& instance) {
        all.push_back(instance);
        return true;
      });
      EXPECT_TRUE(status.ok()) << className << ": " << status.message;
    }
    return all;
  };
  auto first = std::make_unique<zorva::broker::Broker>(classes, options);
  const auto alone = ask(*first);
  EXPECT_LT(10U, alone.size());
  zorva::broker::Broker second(classes, options);
  for (int i = 0; i < 3; ++i) {
    EXPECT_EQ(alone, ask(second));
    EXPECT_EQ(alone, ask(*first));
  }
  first.reset();
  EXPECT_EQ(alone, ask(second));
}

}  // namespace
}  // namespace ZV::Test
