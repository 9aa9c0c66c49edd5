#pragma once

// The frame of a CIM-XML response (DSP0201 2.4): CIM, MESSAGE, SIMPLERSP or MULTIRSP, and in each of them one response
// or its ERROR. The content is appended to out() with ElementWriter.h and ClassWriter.h. Text is passed on in pieces
// while it grows, so that a response of any length needs little memory.
//
// Used by one thread at a time.

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

#include "util/NotCopied.h"

namespace zorva::cimxml {

class ResponseWriter : util::NotCopied {
 public:
  /// Takes the next piece of the text. Its exceptions leave drainIfFull() and the functions that end something.
  using Drain = std::function<void(std::string_view)>;

  /// Text is gathered in `buffer`, which is cleared first, until it has `most` bytes.
  ResponseWriter(std::string& buffer, std::size_t most, Drain drain);

  void beginMessage(std::string_view id, bool isMultiple);
  /// Passes on the rest.
  void endMessage();

  /// METHODRESPONSE or IMETHODRESPONSE within a SIMPLERSP.
  void beginResponse(std::string_view method, bool isExtrinsic);
  void endResponse();

  /// IRETURNVALUE.
  void beginReturnValue() { buffer_ += "<IRETURNVALUE>"; }
  void endReturnValue() { buffer_ += "</IRETURNVALUE>"; }

  /// Where elements are appended.
  std::string& out() noexcept { return buffer_; }

  /// Passes the gathered text on, if there is enough of it. Call it only between whole elements.
  void drainIfFull() {
    if (buffer_.size() >= most_) drain();
  }

  /// Replaces the content of the current response by an ERROR. False if a part of it has been passed on already; then
  /// nothing is changed.
  bool putError(std::uint32_t code, std::string_view description);

 private:
  void drain();

  std::string& buffer_;
  const std::size_t most_;
  const Drain drain_;
  bool isMultiple_ = false;
  bool isExtrinsic_ = false;
  std::size_t responseBegin_ = 0;  ///< where the current response's content begins in buffer_
  bool isPartlyGone_ = false;      ///< a part of it has been passed on
};

}  // namespace zorva::cimxml
