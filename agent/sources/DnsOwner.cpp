#include "agent/sources/DnsOwner.h"

#include <algorithm>
#include <memory>
#include <utility>

#include "agent/log/LogOutput.h"
#include "agent/sources/BusNames.h"

namespace zorva::agent {
namespace {

constexpr const char* kBus = "org.freedesktop.DBus";
constexpr const char* kBusPath = "/org/freedesktop/DBus";

// The bus lets a connection have 128 calls without an answer.
constexpr int kMostUnanswered = 64;
constexpr std::size_t kMostReported = 64;

}  // namespace

DnsOwner::DnsOwner(Identity identity) : identity_(std::move(identity)) {}

std::string DnsOwner::propertyChangesBelow(const char* path) {
  return std::string("path_namespace='") + path + "',interface='" + kBusProperties + "',member='PropertiesChanged'";
}

void DnsOwner::follow(const std::string& rule, SystemBus::Handler handler) {
  subscriptions_.push_back(bus_->listen(rule, std::move(handler)));
}

void DnsOwner::connect(SystemBus& bus) {
  bus_ = &bus;
  nameIsKnown_ = false;
  follow(std::string("type='signal',sender='") + kBus + "',path='" + kBusPath + "',interface='" + kBus +
             "',member='NameOwnerChanged',arg0='" + identity_.busName + "'",
         [this](sd_bus_message* message, const std::string&) {
           if (message == nullptr || senderOf(message) != kBus) return;
           BusReader reader(message);
           reader.text();
           reader.text();
           nameIsOwnedBy(reader.text());
         });
  for (const std::string& rule : identity_.signals) {
    follow("type='signal',sender='" + identity_.busName + "'," + rule,
           [this](sd_bus_message* message, const std::string&) {
             // Everybody on the bus may send signals of any form.
             if (message != nullptr && !owner_.empty() && senderOf(message) == owner_) stale_ = changed_ = true;
           });
  }
  calls_.push_back(bus.call({kBus, kBusPath, kBus, "GetNameOwner"}, {identity_.busName},
                            [this](sd_bus_message* message, const std::string&) {
                              nameIsOwnedBy(message == nullptr ? "" : BusReader(message).text());
                            }));
}

void DnsOwner::disconnect() {
  subscriptions_.clear();
  calls_.clear();
  bus_ = nullptr;
  nameIsKnown_ = true;
  owner_.clear();
  reset();
}

void DnsOwner::nameIsOwnedBy(const std::string& owner) {
  if (nameIsKnown_ && owner == owner_) return;
  nameIsKnown_ = true;
  if (owner == owner_) return;
  owner_ = owner;
  reset();
  stale_ = !owner.empty();
  changed_ = true;
}

// What a daemon that is gone has not answered is not waited for.
void DnsOwner::reset() {
  ++life_;
  questions_.clear();
  unanswered_ = 0;
  stale_ = asking_ = late_ = false;
  forget();
}

bool DnsOwner::changed() {
  const bool watches = !owner_.empty() && !identity_.directory.empty() && !stale_;
  if (watches && directory_.changed()) stale_ = changed_ = true;
  return changed_;
}

// While the directory cannot be watched, the daemon's signals are all that reports a change.
void DnsOwner::addWakers(Wakers& wakers) {
  if (owner_.empty() || identity_.directory.empty()) return;
  directoryWaker_.watch(identity_.directory);
  directoryWaker_.changed();
  wakers.add(directoryWaker_.descriptor());
  // It may have changed before it was watched.
  if (directory_.changed()) wakers.addDeadline(std::chrono::milliseconds(0));
}

void DnsOwner::askWhereStale(const std::vector<Link>& links) {
  if (owner_.empty() || asking_ || (!stale_ && !isConcernedBy(links))) return;
  // Before it is asked, so that what changes meanwhile is noticed afterwards.
  if (!identity_.directory.empty()) directory_.watch({identity_.directory});
  calls_.clear();
  stale_ = false;
  asking_ = true;
  startAsking(links);
  sendQuestions();
}

void DnsOwner::ask(const std::string& path, const std::string& interface, const std::string& method,
                   const std::vector<std::string>& arguments, std::function<void(BusReader&)> read) {
  questions_.push_back({{owner_, path, interface, method}, arguments, std::move(read)});
}

void DnsOwner::sendQuestions() {
  while (!questions_.empty() && unanswered_ < kMostUnanswered) {
    auto question = std::make_shared<Question>(std::move(questions_.front()));
    questions_.pop_front();
    const auto handler = [this, question, life = life_](sd_bus_message* message, const std::string& error) {
      if (life == life_) handleAnswer(*question, message, error);
    };
    calls_.push_back(bus_->call(question->method, question->arguments, handler));
    ++unanswered_;
  }
  if (unanswered_ != 0) return;
  asking_ = late_ = false;
  changed_ = true;
  takeAnswers();
}

void DnsOwner::handleAnswer(const Question& question, sd_bus_message* message, const std::string& error) {
  --unanswered_;
  const std::string& member = question.method.member;
  if (message == nullptr) {
    // An interface may go while it is asked for.
    if (error != "org.freedesktop.DBus.Error.UnknownObject") report(member + " is refused: " + error);
  } else {
    try {
      BusReader reader(message);
      question.read(reader);
    } catch (const BusError& problem) {
      report("the answer to " + member + " has an unknown form: " + problem.what());
    }
  }
  sendQuestions();
}

void DnsOwner::report(const std::string& problem) {
  if (std::find(reported_.begin(), reported_.end(), problem) != reported_.end()) return;
  if (reported_.size() >= kMostReported) return;
  reported_.push_back(problem);
  ZORVAGENT_LOG_ERROR(name() + ": " + problem);
}

void DnsOwner::reportWhatIsLeftOut(const std::string& interface, const DnsFactsBuilder& builder) {
  if (!builder.problem().empty()) report(interface + ": " + builder.problem());
}

}  // namespace zorva::agent
