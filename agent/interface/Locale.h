#pragma once

// Localised texts.

#include <string>

#include "AgentApi.h"

namespace ZV {

namespace Locale {

/// The language of the agent's configuration, as "en". Thread-safe.
ZORVA_AGENT_API std::string getLanguageId();

/// The name of the resource library with a component's texts in a language; the library of the DNS client profile is
/// number 2. Thread-safe.
ZORVA_AGENT_API std::wstring getResourceLibrary(unsigned long number, std::string language);

}  // namespace Locale

/// The text of a message in a resource library. If the library lacks the language, the English text; if there is no
/// such message, empty text. Thread-safe.
ZORVA_AGENT_API std::wstring ResourceString(const std::wstring& library, const std::wstring& key);

}  // namespace ZV
