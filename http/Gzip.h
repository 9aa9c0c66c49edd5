#pragma once

// A response that is compressed while it is written (RFC 1952).

#include <zlib.h>

#include <string>
#include <string_view>

#include "util/NotCopied.h"

namespace zorva::http {

class Gzip : util::NotCopied {
 public:
  /// Throws std::bad_alloc.
  Gzip();
  ~Gzip();

  /// Appends to `out` the compressed text that is ready so far.
  void add(std::string_view text, std::string& out) { run(text, out, Z_NO_FLUSH); }

  /// Appends the rest. Add nothing afterwards.
  void finish(std::string& out) { run({}, out, Z_FINISH); }

 private:
  void run(std::string_view text, std::string& out, int flush);
  z_stream stream_{};
};

}  // namespace zorva::http
