#pragma once

// Settings on trial: applied to the host, and taken back unless a person confirms them.

#include <chrono>
#include <string>

#include "cli/session/Globals.h"

namespace zorva::cli {

/// A process of its own that takes the trial back when this process ends, however it ends, or when the time is over. It
/// must be started before the settings are applied, so that no death of this process leaves them unwatched.
class TrialGuard {
 public:
  /// Throws Failure if it cannot be started; then nothing may be applied on trial.
  explicit TrialGuard(const Globals& globals);

  /// Ends the guard, which takes the trial back if there is one still.
  ~TrialGuard();
  TrialGuard(const TrialGuard&) = delete;
  TrialGuard& operator=(const TrialGuard&) = delete;

 private:
  int guarded_ = -1;  ///< the end of a pipe that closes with this process
};

/// How a trial ended.
enum class Verdict {
  Confirmed,       ///< a line was entered here
  EndedElsewhere,  ///< another process confirmed the trial or took it back
  TimeIsUp,
};

/// Waits until a person confirms the running trial by a line on standard input, it ends otherwise, or its time is over.
/// On a terminal the seconds that are left are shown.
Verdict waitForVerdict(std::chrono::seconds longest);

/// What the guard does: waits until standard input ends or the trial's time is over, and takes the trial back.
void guardTrial(const Globals& globals);

}  // namespace zorva::cli
