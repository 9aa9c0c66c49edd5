#include "FileCalls.h"

#include <fcntl.h>
#include <stdio_ext.h>
#include <sys/file.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <cstdint>
#include <cstdio>
#include <cstring>

namespace ZV::Test {
namespace {

FailingFiles* active = nullptr;

}  // namespace

const char* nameOf(FileCall call) {
  static constexpr const char* kNames[] = {"fopen", "fgets",    "fputs",         "fclose",           "open",  "read",
                                           "write", "close",    "fsync",         "rename",           "flock", "fstat",
                                           "stat",  "readlink", "inotify_init1", "inotify_add_watch"};
  return kNames[static_cast<std::size_t>(call)];
}

const char* nameOf(FileFault fault) {
  static constexpr const char* kNames[] = {"refused", "half done", "interrupted"};
  return kNames[static_cast<std::size_t>(fault)];
}

FailingFiles::FailingFiles(std::size_t n, FileFault fault) : n_(n), fault_(fault) { active = this; }
FailingFiles::~FailingFiles() { active = nullptr; }

bool FailingFiles::fails(FileCall call) {
  if (active == nullptr) return false;
  active->calls_.push_back(call);
  return active->calls_.size() == active->n_;
}
FileFault FailingFiles::fault() { return active->fault_; }
bool FailingFiles::hasFailedStream(const void* stream) {
  return active != nullptr && stream != nullptr && active->failedStream_ == stream;
}
void FailingFiles::failStream(const void* stream) { active->failedStream_ = stream; }

namespace {

// Whether the call fails outright, with that error.
bool refuses(FileCall call, int error) {
  if (!FailingFiles::fails(call) || FailingFiles::fault() == FileFault::Interrupted) return false;
  errno = error;
  return true;
}

// The same for calls that may be interrupted or half done: 0 for neither, -1 for a failure, 1 for half.
int disturbs(FileCall call, int error) {
  if (!FailingFiles::fails(call)) return 0;
  if (FailingFiles::fault() == FileFault::HalfDone) return 1;
  errno = FailingFiles::fault() == FileFault::Interrupted ? EINTR : error;
  return -1;
}

}  // namespace
}  // namespace ZV::Test

using ZV::Test::disturbs;
using ZV::Test::FailingFiles;
using ZV::Test::FileCall;
using ZV::Test::FileFault;
using ZV::Test::refuses;

extern "C" {

// The C library's own, by the linker's names.
std::FILE* __real_fopen(const char*, const char*);
char* __real_fgets(char*, int, std::FILE*);
int __real_fputs(const char*, std::FILE*);
int __real_fclose(std::FILE*);
int __real_ferror(std::FILE*);
int __real_open(const char*, int, ...);
ssize_t __real_read(int, void*, size_t);
ssize_t __real_write(int, const void*, size_t);
int __real_close(int);
int __real_rename(const char*, const char*);
int __real_flock(int, int);
int __real_fstat(int, struct stat*);
int __real_stat(const char*, struct stat*);
ssize_t __real_readlink(const char*, char*, size_t);
int __real_inotify_init1(int);
int __real_inotify_add_watch(int, const char*, std::uint32_t);

std::FILE* __wrap_fopen(const char* path, const char* mode) {
  return refuses(FileCall::Fopen, EACCES) ? nullptr : __real_fopen(path, mode);
}

char* __wrap_fgets(char* buffer, int size, std::FILE* stream) {
  if (!refuses(FileCall::Fgets, EIO)) return __real_fgets(buffer, size, stream);
  FailingFiles::failStream(stream);
  return nullptr;
}

int __wrap_ferror(std::FILE* stream) { return FailingFiles::hasFailedStream(stream) ? 1 : __real_ferror(stream); }

int __wrap_fputs(const char* text, std::FILE* stream) {
  if (!refuses(FileCall::Fputs, ENOSPC)) return __real_fputs(text, stream);
  if (FailingFiles::fault() == FileFault::HalfDone) std::fwrite(text, 1, std::strlen(text) / 2, stream);
  return EOF;
}

int __wrap_fclose(std::FILE* stream) {
  if (!refuses(FileCall::Fclose, ENOSPC)) return __real_fclose(stream);
  if (FailingFiles::fault() == FileFault::HalfDone) __fpurge(stream);
  __real_fclose(stream);
  errno = ENOSPC;
  return EOF;
}

int __wrap_open(const char* path, int flags, ...) {
  std::va_list rest;
  va_start(rest, flags);
  const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(rest, mode_t) : 0;
  va_end(rest);
  return refuses(FileCall::Open, EMFILE) ? -1 : __real_open(path, flags, mode);
}

ssize_t __wrap_read(int file, void* buffer, size_t size) {
  const int disturbed = disturbs(FileCall::Read, EIO);
  return disturbed < 0 ? -1 : __real_read(file, buffer, disturbed > 0 ? std::min<size_t>(size, 1) : size);
}

ssize_t __wrap_write(int file, const void* buffer, size_t size) {
  const int disturbed = disturbs(FileCall::Write, ENOSPC);
  return disturbed < 0 ? -1 : __real_write(file, buffer, disturbed > 0 ? (size + 1) / 2 : size);
}

int __wrap_close(int file) {
  const bool fails = refuses(FileCall::Close, EIO);
  const int closed = __real_close(file);  // the descriptor is closed even then
  if (fails) errno = EIO;
  return fails ? -1 : closed;
}

// A test's files need not survive a power failure, and syncing takes most of the time.
int __wrap_fsync(int) { return refuses(FileCall::Fsync, EIO) ? -1 : 0; }

int __wrap_rename(const char* from, const char* to) {
  return refuses(FileCall::Rename, EACCES) ? -1 : __real_rename(from, to);
}

int __wrap_flock(int file, int operation) {
  return disturbs(FileCall::Flock, ENOLCK) < 0 ? -1 : __real_flock(file, operation);
}

int __wrap_fstat(int file, struct stat* status) {
  return refuses(FileCall::Fstat, EIO) ? -1 : __real_fstat(file, status);
}

int __wrap_stat(const char* path, struct stat* status) {
  return refuses(FileCall::Stat, EACCES) ? -1 : __real_stat(path, status);
}

ssize_t __wrap_readlink(const char* path, char* buffer, size_t size) {
  return refuses(FileCall::Readlink, EACCES) ? -1 : __real_readlink(path, buffer, size);
}

int __wrap_inotify_init1(int flags) {
  return refuses(FileCall::InotifyInit, EMFILE) ? -1 : __real_inotify_init1(flags);
}

int __wrap_inotify_add_watch(int file, const char* path, std::uint32_t mask) {
  return refuses(FileCall::InotifyAddWatch, ENOSPC) ? -1 : __real_inotify_add_watch(file, path, mask);
}

}  // extern "C"
