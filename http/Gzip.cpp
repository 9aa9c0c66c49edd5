#include "http/Gzip.h"

#include <new>

namespace zorva::http {

namespace {

constexpr int kGzipWindow = 15 + 16;  // the largest window, in a gzip wrapping
constexpr int kMemory = 8;            // zlib's default
constexpr std::size_t kStep = 16384;

}  // namespace

// The lowest level reduces CIM-XML to a tenth of its size; higher levels cost several times as much and gain little.
Gzip::Gzip() {
  const int rc = deflateInit2(&stream_, Z_BEST_SPEED, Z_DEFLATED, kGzipWindow, kMemory, Z_DEFAULT_STRATEGY);
  if (rc != Z_OK) throw std::bad_alloc();
}

Gzip::~Gzip() { deflateEnd(&stream_); }

void Gzip::run(std::string_view text, std::string& out, int flush) {
  // zlib reads through this pointer and does not write.
  stream_.next_in = reinterpret_cast<Bytef*>(const_cast<char*>(text.data()));
  stream_.avail_in = static_cast<uInt>(text.size());
  do {
    const std::size_t before = out.size();
    out.resize(before + kStep);
    stream_.next_out = reinterpret_cast<Bytef*>(out.data() + before);
    stream_.avail_out = static_cast<uInt>(kStep);
    deflate(&stream_, flush);
    out.resize(before + kStep - stream_.avail_out);
  } while (stream_.avail_out == 0);
}

}  // namespace zorva::http
