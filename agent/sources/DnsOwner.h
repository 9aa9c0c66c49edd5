#pragma once

// A daemon on the system's bus that owns DNS settings of interfaces.

#include <deque>
#include <functional>
#include <limits>
#include <list>
#include <string>
#include <vector>

#include "agent/files/DirectoryWatch.h"
#include "agent/files/FileWatch.h"
#include "agent/sources/DnsFacts.h"
#include "agent/sources/Netlink.h"
#include "agent/sources/SystemBus.h"
#include "agent/tree/TreeSource.h"

namespace zorva::agent {

/// Follows the daemon's coming and going, asks it again after it has reported a change, and keeps what it said last
/// until the new answer is whole. A subclass knows what to ask, and how to read it.
class DnsOwner {
 public:
  struct Identity {
    std::string name;                  ///< as persons know it
    std::string busName;               ///< as the bus knows it
    std::vector<std::string> signals;  ///< match rules, without the sender, of the signals that report a change
    std::string directory;             ///< a change of its entries reports one too; empty for none
  };

  explicit DnsOwner(Identity identity);
  virtual ~DnsOwner() = default;
  DnsOwner(const DnsOwner&) = delete;
  DnsOwner& operator=(const DnsOwner&) = delete;

  const std::string& name() const { return identity_.name; }

  /// Follows the daemon on a connection that was just opened.
  void connect(SystemBus& bus);

  /// Forgets the connection and all that was said over it. To be called before the connection is closed.
  void disconnect();

  /// Whether an answer or a report has come since acceptChanges(). Never blocks.
  bool changed();
  void acceptChanges() { changed_ = false; }

  /// Adds what wakes a thread when the daemon's directory changes.
  void addWakers(Wakers& wakers);

  /// Asks if there is something to ask for. links are those that the kernel has.
  void askWhereStale(const std::vector<Link>& links);

  /// Whether there is nothing to wait for: all that was asked for is known, or the daemon has been waited for before.
  bool isSettled() const { return late_ || hasSaidAll(); }

  /// Whether all that was asked for is known.
  bool hasSaidAll() const { return nameIsKnown_ && (owner_.empty() || (!stale_ && !asking_)); }

  /// It has been waited for: isSettled() is true from now on until it answers.
  void giveUpWaiting() { late_ = true; }

  /// Whether the bus has said whether the daemon runs.
  bool nameIsKnown() const { return nameIsKnown_; }

  /// Whether it is on the bus, as far as is known.
  bool runs() const { return !owner_.empty(); }

  /// What it says of a link, or null where it says nothing at all. Valid until the next look.
  virtual const DnsFacts* factsOf(const Link& link) const = 0;

 protected:
  /// The match rule of the signals that report changed properties of an object or of those below it.
  static std::string propertyChangesBelow(const char* path);

  /// Calls a method of the daemon. When every call is answered, takeAnswers is called. read is not called where the
  /// daemon refuses; where it throws BusError, this one answer counts as none. To be used by startAsking and by read.
  void ask(const std::string& path, const std::string& interface, const std::string& method,
           const std::vector<std::string>& arguments, std::function<void(BusReader&)> read);

  /// Writes a line to the log, once for each problem.
  void report(const std::string& problem);
  void reportWhatIsLeftOut(const std::string& interface, const DnsFactsBuilder& builder);

  /// Whether these links of the kernel's, other than those that it was asked with, are a reason to ask again.
  virtual bool isConcernedBy(const std::vector<Link>& links) const = 0;
  virtual void startAsking(const std::vector<Link>& links) = 0;
  virtual void takeAnswers() = 0;
  virtual void forget() = 0;  ///< the daemon is gone, or another one took its place

 private:
  struct Question {
    SystemBus::Method method;
    std::vector<std::string> arguments;
    std::function<void(BusReader&)> read;
  };

  void follow(const std::string& rule, SystemBus::Handler handler);
  void nameIsOwnedBy(const std::string& owner);
  void reset();
  void sendQuestions();
  void handleAnswer(const Question& question, sd_bus_message* message, const std::string& error);

  Identity identity_;
  FileWatch directory_{std::numeric_limits<int>::max()};  ///< by comparison: not everybody may read the directory
  DirectoryWatch directoryWaker_;                         ///< for a thread that sleeps
  SystemBus* bus_ = nullptr;
  std::list<SystemBus::Handle> subscriptions_;
  std::list<SystemBus::Handle> calls_;
  std::deque<Question> questions_;  ///< that are still to be sent

  bool nameIsKnown_ = true;
  std::string owner_;    ///< the unique name of the daemon's connection; empty while it does not run
  int life_ = 0;         ///< of the daemon: counts its starts and ends
  bool stale_ = false;   ///< what it says may have changed
  bool asking_ = false;  ///< an answer is being put together
  int unanswered_ = 0;   ///< of the questions that were sent
  bool late_ = false;
  bool changed_ = false;
  std::vector<std::string> reported_;
};

}  // namespace zorva::agent
