#pragma once

// The markup of help, manual pages and configuration keys: `bold` for what is typed or printed as it is, <italic> for
// placeholders such as <NAME>, and for files. Texts are ASCII.

#include <cstddef>
#include <string>
#include <string_view>

namespace zorva::manual {

/// Without the marks.
std::string plain(std::string_view marked);

/// As roff within a line. A "-" of bold text is one that can be copied and searched for.
std::string roff(std::string_view marked);

/// Literal text as roff, for bold or for a block without filling.
std::string roffLiteral(std::string_view text);

/// The words of `text` in lines of at most `width` columns, each with `prefix` before it. A longer word has a line of
/// its own.
std::string filled(std::string_view text, std::size_t width, std::string_view prefix);

/// With a full stop, if it ends without punctuation.
std::string sentence(std::string_view text);

}  // namespace zorva::manual
