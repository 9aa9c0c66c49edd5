#pragma once

// Replaces the C library's functions that read and write files, and makes one call fail.
//
// The linker replaces the functions (--wrap) in the objects that are linked into the program: the providers and the
// agent. Calls inside the shared C++ library are not replaced.

#include <cstddef>
#include <string>
#include <vector>

#include "util/NotCopied.h"

namespace ZV::Test {

enum class FileCall {
  Fopen,
  Fgets,
  Fputs,
  Fclose,
  Open,
  Read,
  Write,
  Close,
  Fsync,
  Rename,
  Flock,
  Fstat,
  Stat,
  Readlink,
  InotifyInit,
  InotifyAddWatch
};
inline constexpr std::size_t kFileCalls = 16;
const char* nameOf(FileCall call);

enum class FileFault {
  Refused,      ///< the call fails and does nothing: no permission, no descriptor left, no space, a bad disk
  HalfDone,     ///< fputs, read and write handle a part; fclose loses unwritten data; others as Refused
  Interrupted,  ///< read, write and flock by a signal, which is no failure; others are not changed
};
inline constexpr FileFault kAllFileFaults[] = {FileFault::Refused, FileFault::HalfDone, FileFault::Interrupted};
const char* nameOf(FileFault fault);

/// Makes the n-th call from now on fail, counted from 1, or only counts calls if n is 0. One at a time, on one thread.
class FailingFiles : zorva::util::NotCopied {
 public:
  explicit FailingFiles(std::size_t n = 0, FileFault fault = FileFault::Refused);
  ~FailingFiles();

  const std::vector<FileCall>& calls() const { return calls_; }
  bool wasReached() const { return n_ != 0 && calls_.size() >= n_; }
  /// The call that failed, if one was reached.
  FileCall failed() const { return calls_.at(n_ - 1); }

  /// For the replacement functions: whether this call must fail.
  static bool fails(FileCall call);
  static FileFault fault();
  static bool hasFailedStream(const void* stream);
  static void failStream(const void* stream);

 private:
  std::size_t n_;
  FileFault fault_;
  std::vector<FileCall> calls_;
  const void* failedStream_ = nullptr;  ///< whose error indicator is set
};

}  // namespace ZV::Test
