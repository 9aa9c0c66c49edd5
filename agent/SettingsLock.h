// The one lock of a data directory, for programs of this project that read or change settings.
#pragma once

#include <memory>
#include <string>

#include "agent/interface/AgentApi.h"

namespace zorva::agent {

enum class Access { Read, Change };

// Many may read, or one may change. It is a flock on "settings.lock" in the data directory, which has to do with
// programs that take it alone: a provider in another CIM server does not. Who waits to change goes before who comes to
// read later ("settings.turn").
//
// The providers rewrite interface files in place. So that no failure in the middle loses a setting, who changes has the
// file kept aside ("settings.before", its interface named in the lock's file) until the rewrite is seen to be whole.
// Where the process ends before that, the next one that takes the lock puts the file back, and logs it.
//
// An object belongs to one thread at a time; each has its own open files, so two in one process exclude each other.
class ZORVA_AGENT_API SettingsLock {
 public:
  // Waits ten seconds at most. Throws std::runtime_error, with one line, where the lock cannot be had. Who reads
  // without the rights to open the lock's file, or from a directory that is not there, reads without a lock.
  SettingsLock(const std::string& directory, Access access);

  // Finishes what was begun.
  ~SettingsLock();
  SettingsLock(const SettingsLock&) = delete;
  SettingsLock& operator=(const SettingsLock&) = delete;

  // Keeps the interface's file aside, where it has one. Throws std::runtime_error, with one line, where that cannot be
  // done: nothing may be changed then. For Access::Change alone.
  void keepAside(const std::string& interface);

  // After the change: forgets the file that was kept aside, or puts it back where it was not rewritten whole. Returns
  // what went wrong, in one line; empty where nothing did.
  std::string finish();

 private:
  class Core;
  std::unique_ptr<Core> core_;  // null: reads without a lock
};

}  // namespace zorva::agent
