#pragma once

// The levels of log lines. A stream has a level too, and drops the lines that are below it.

namespace zorva::util {

inline constexpr int kLevelFlow = 3000;     ///< entry and exit lines with a parameter list
inline constexpr int kLevelDetail = 4000;   ///< banners, values, failures that a walk survives
inline constexpr int kLevelWarning = 5000;  ///< what a server refuses, or leaves out
inline constexpr int kLevelError = 6000;    ///< failures that end or empty an operation

}  // namespace zorva::util
