#pragma once

// UTF-8 (RFC 3629), one character at a time, for bytes that need not be any.

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace zorva::util {

/// The number of bytes of the well-formed character at the beginning of the text; 0 if there is none. Overlong forms,
/// surrogates and characters above U+10FFFF are not well-formed.
std::size_t utf8Length(std::string_view text) noexcept;

/// The character at the begin of the text, which must be well-formed and not empty.
std::uint32_t utf8Decode(std::string_view text) noexcept;

/// Whether all of the text is well-formed.
bool isUtf8(std::string_view text) noexcept;

/// Appends a character up to U+10FFFF. A half of a surrogate pair comes out in three bytes, which are not well-formed.
void utf8Append(std::string& out, std::uint32_t code);

/// The largest length up to `most` at which well-formed text can be cut without breaking a character.
std::size_t utf8Cut(std::string_view text, std::size_t most) noexcept;

}  // namespace zorva::util
