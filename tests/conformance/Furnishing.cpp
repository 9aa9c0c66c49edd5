#include "Furnishing.h"

#include <array>
#include <utility>

#include "LineScanner.h"

namespace ZV::Test {

namespace {

void readNicClause(LineScanner& scanner, NicProperties& nic) {
  if (scanner.take("unnamed")) {
    nic.isUnnamed = true;
  } else if (scanner.take("name")) {
    nic.name = scanner.quoted("the name");
  } else if (scanner.take("host")) {
    nic.hostName = scanner.quoted("the host name");
  } else if (scanner.take("domain")) {
    nic.domain = scanner.quoted("the domain");
  } else if (scanner.take("suffixes")) {
    nic.suffixes = OptionalTexts(scanner.quotedList("a suffix"));
  } else if (scanner.take("servers")) {
    nic.servers = OptionalTexts(scanner.quotedList("an address"));
  } else if (scanner.take("type")) {
    nic.ifType = scanner.number("the type");
  } else if (scanner.take("state")) {
    nic.state = scanner.number("the state");
  } else {
    scanner.fail("an unknown property of an interface");
  }
}

void readNic(World& world, LineScanner& scanner) {
  const std::string name = scanner.word("the interface's name");
  NicProperties properties;
  if (scanner.take(":")) {
    do {
      readNicClause(scanner, properties);
    } while (scanner.take(","));
  }
  world.nic(name, properties);
}

// False if the tree must not be readable.
bool readWorldLine(World& world, LineScanner& scanner) {
  bool isReadable = true;
  if (scanner.take("host")) {
    const std::string name = scanner.wordOrQuoted("the host's name");
    world.host(name, scanner.take("described") ? scanner.quoted("the description") : "Computer");
  } else if (scanner.take("bmc")) {
    world.bmc();
  } else if (scanner.take("system")) {
    const std::string node = scanner.word("the node's name");
    scanner.expect("described");
    world.system(node, scanner.quoted("the description"));
  } else if (scanner.take("nic")) {
    readNic(world, scanner);
  } else if (scanner.take("file")) {
    const std::string nic = scanner.wordOrQuoted("the interface's name");
    world.file(nic, scanner.quoted("the content"));
  } else if (scanner.take("empty")) {
    // a host without nodes, written out for the reader
  } else if (scanner.take("unreadable")) {
    isReadable = false;
  } else {
    scanner.fail("an unknown part of a world");
  }
  scanner.expectEnd();
  return isReadable;
}

constexpr std::array kModes{Mode::RcAndNull, Mode::SetRc, Mode::NullHandle, Mode::ReturnNull, Mode::Throw};

Mode readMode(LineScanner& scanner) {
  for (const Mode mode : kModes) {
    if (scanner.take(nameOf(mode))) return mode;
  }
  scanner.fail("an unknown way to fail");
}

struct TreeCallWord {
  const char* word;
  zorva::agent::TreeCall call;
};

constexpr std::array kTreeCalls{
    TreeCallWord{"construction", zorva::agent::TreeCall::Construct},
    TreeCallWord{"selection by type", zorva::agent::TreeCall::SelectByType},
    TreeCallWord{"selection by path", zorva::agent::TreeCall::SelectByPath},
    TreeCallWord{"test", zorva::agent::TreeCall::Test},
    TreeCallWord{"step", zorva::agent::TreeCall::Advance},
    TreeCallWord{"read of a text", zorva::agent::TreeCall::GetText},
    TreeCallWord{"read of a list", zorva::agent::TreeCall::GetList},
    TreeCallWord{"write of a text", zorva::agent::TreeCall::SetText},
    TreeCallWord{"write of a list", zorva::agent::TreeCall::SetList},
    TreeCallWord{"read of a parent", zorva::agent::TreeCall::GetPathToParent},
    TreeCallWord{"read of a description", zorva::agent::TreeCall::GetDescription},
};

// "fails call 2 of newArray: null" and "fails each newArray: null"
Failure readFailure(LineScanner& scanner) {
  Failure failure;
  if (scanner.take("each")) {
    failure.call = scanner.word("the call's name");
  } else {
    scanner.expect("call");
    failure.n = scanner.number("the call's number");
    scanner.expect("of");
    failure.call = scanner.word("the call's name");
  }
  scanner.expect(":");
  failure.mode = readMode(scanner);
  return failure;
}

// "tree throws at 2 of selection by type", with ": int" for an exception that is no std::exception
Failure readTreeFailure(LineScanner& scanner) {
  Failure failure;
  failure.n = scanner.number("the call's number");
  scanner.expect("of");
  const TreeCallWord* found = nullptr;
  for (const TreeCallWord& word : kTreeCalls) {
    if (found == nullptr && scanner.take(word.word)) found = &word;
  }
  if (found == nullptr) scanner.fail("an unknown call of the tree");
  failure.treeCall = found->call;
  if (scanner.take(": an int")) failure.thrown = Thrown::Int;
  return failure;
}

// "serves CLASS", "serves CLASS failing with 6", "serves PATH" for one more object of the path's class
void readServed(RecordingBroker& broker, LineScanner& scanner, std::vector<std::pair<std::string, ServedClass>>& all) {
  const Path path = scanner.path();
  ServedClass* served = nullptr;
  for (auto& [name, one] : all) {
    if (name == path.className) served = &one;
  }
  if (served == nullptr) served = &all.emplace_back(path.className, ServedClass()).second;
  if (scanner.take("failing with")) {
    served->rc = static_cast<CMPIrc>(scanner.number("the rc"));
  } else if (scanner.take("as null")) {
    served->nullEnumeration = true;
  } else if (!path.keys.empty()) {
    Instance instance(path.className);
    instance.properties = path.keys;
    served->instances.push_back(instance);
  }
  broker.serve(path.className) = *served;
}

}  // namespace

void furnish(World& world, const std::vector<WrittenLine>& lines) {
  bool isReadable = true;
  for (const WrittenLine& line : lines) {
    LineScanner scanner(line);
    isReadable = readWorldLine(world, scanner) && isReadable;
  }
  if (isReadable) {
    world.install();
  } else {
    world.installUnreadable();
  }
}

std::vector<Failure> furnish(RecordingBroker& broker, const std::vector<WrittenLine>& lines) {
  std::vector<Failure> failures;
  std::vector<std::pair<std::string, ServedClass>> served;
  for (const WrittenLine& line : lines) {
    LineScanner scanner(line);
    if (scanner.take("serves")) {
      readServed(broker, scanner, served);
    } else if (scanner.take("fails")) {
      failures.push_back(readFailure(scanner));
      failures.back().line = line;
    } else if (scanner.take("tree throws at")) {
      failures.push_back(readTreeFailure(scanner));
      failures.back().line = line;
    } else if (scanner.take("gives a missing property as null with rc")) {
      broker.missingProperty = {static_cast<CMPIrc>(scanner.number("the rc")), CMPI_nullValue};
    } else if (scanner.take("marks keys")) {
      broker.stateOfKeys = CMPI_keyValue;
    } else if (scanner.take("loses paths of")) {
      const std::string victims = scanner.word("the class of the paths");
      scanner.expect("at one of");
      broker.loseHandles(victims, scanner.word("the class of the path"));
    } else {
      scanner.fail("an unknown part of a broker");
    }
    scanner.expectEnd();
  }
  return failures;
}

}  // namespace ZV::Test
