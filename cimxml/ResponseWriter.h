#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

// The frame of a CIM-XML response (DSP0201 2.4): CIM, MESSAGE, SIMPLERSP or MULTIRSP, and in each of them one response
// or its ERROR. What stands within is appended to out() with ElementWriter.h and ClassWriter.h. Text is handed on in
// pieces while it grows, so that a response of any length holds little memory.
//
// Used by one thread at a time.

namespace zorva::cimxml {

class ResponseWriter {
 public:
  /// Takes the next piece of the text. What it throws comes out of settle() and the functions that end something.
  using Drain = std::function<void(std::string_view)>;

  /// Text gathers in `buffer`, which is cleared first, until there are `most` bytes of it.
  ResponseWriter(std::string& buffer, std::size_t most, Drain drain);
  ResponseWriter(const ResponseWriter&) = delete;
  ResponseWriter& operator=(const ResponseWriter&) = delete;

  void beginMessage(std::string_view id, bool isMultiple);
  /// Hands on what is left.
  void endMessage();

  /// METHODRESPONSE or IMETHODRESPONSE within a SIMPLERSP.
  void beginResponse(std::string_view method, bool isExtrinsic);
  void endResponse();

  /// IRETURNVALUE.
  void beginReturnValue() { buffer_ += "<IRETURNVALUE>"; }
  void endReturnValue() { buffer_ += "</IRETURNVALUE>"; }

  /// Where elements are appended.
  std::string& out() noexcept { return buffer_; }

  /// Hands on what was gathered, if there is enough of it. Only between whole elements.
  void settle() {
    if (buffer_.size() >= most_) drain();
  }

  /// Puts an ERROR in the place of what the present response has so far. False where some of that has been handed on
  /// and cannot be taken back; then nothing was done.
  bool putError(std::uint32_t code, std::string_view description);

 private:
  void drain();

  std::string& buffer_;
  const std::size_t most_;
  const Drain drain_;
  bool isMultiple_ = false;
  bool isExtrinsic_ = false;
  std::size_t responseBegin_ = 0;  // where the present response's content begins in buffer_
  bool isPartlyGone_ = false;      // some of it has been handed on
};

}  // namespace zorva::cimxml
