#pragma once

// Converts between narrow text (bytes, UTF-8 by convention) and wide strings (UTF-32).

#include <string>

#include "AgentApi.h"

namespace ZV {

/// Bytes that are not UTF-8 survive the conversion in both directions: each becomes one wide character outside
/// Unicode's valid range, and turns into the same byte again. Independent of the process's locale. Thread-safe.
ZORVA_AGENT_API std::wstring make_wstring(const std::string& text);
ZORVA_AGENT_API std::wstring make_wstring(const char* text);  ///< null counts as empty
ZORVA_AGENT_API std::string make_string(const std::wstring& text);

/// The text without blanks and tabs at its ends. Thread-safe.
ZORVA_AGENT_API std::string stripSpaces(const std::string& text);

}  // namespace ZV
