#pragma once

// The lock of a data directory, for programs of this project that read or change settings.

#include <memory>
#include <string>

#include "agent/interface/AgentApi.h"

namespace zorva::agent {

enum class Access { Read, Change };

/// Many may read, or one may change. The lock is a flock on "settings.lock" in the data directory. It only works
/// between programs that take it: a provider in another CIM server does not. A waiting change goes before later reads
/// ("settings.turn").
///
/// The providers rewrite interface files in place. So that no failure in the middle loses a setting, the file is saved
/// before a change ("settings.before"; the lock's file names the interface) until the rewrite has been checked. If the
/// process ends before that, the next process that takes the lock restores the file, and logs it.
///
/// An object belongs to one thread at a time. Each object has its own open files, so two in one process exclude each
/// other.
class ZORVA_AGENT_API SettingsLock {
 public:
  /// Waits ten seconds at most. Throws std::runtime_error, with one line, if the lock cannot be taken. A reader that
  /// has no right to open the lock's file, or whose directory does not exist, reads without a lock.
  SettingsLock(const std::string& directory, Access access);

  /// Finishes an unfinished change.
  ~SettingsLock();
  SettingsLock(const SettingsLock&) = delete;
  SettingsLock& operator=(const SettingsLock&) = delete;

  /// Saves the interface's file, if it exists. Throws std::runtime_error, with one line, if that fails: then nothing
  /// may be changed. Only for Access::Change.
  void keepAside(const std::string& interface);

  /// After the change: drops the saved file, or restores it if the rewrite is incomplete. Returns the error, in one
  /// line; empty if there was none.
  std::string finish();

 private:
  class Core;
  std::unique_ptr<Core> core_;  ///< null: reads without a lock
};

}  // namespace zorva::agent
