#include "agent/interface/Locale.h"

#include <array>

#include "agent/config/CurrentConfig.h"
#include "agent/interface/StringConversion.h"

namespace ZV {
namespace {

struct Text {
  unsigned long library;
  const char* language;
  const char* key;
  const char* text;
};

// Every library has English; it replaces a language that a library lacks.
constexpr const char* kEnglish = "en";

constexpr std::array kTexts{
    Text{2, kEnglish, "MSGID_DNS_CLIENT_CAPTION", "DNS Client"},
    Text{2, kEnglish, "MSGID_DNS_CLIENT_DESCRIPTION", "DNS client of a network interface"},
    Text{2, kEnglish, "MSGID_DNS_SERVER_CAPTION", "DNS Server"},
    Text{2, kEnglish, "MSGID_DNS_SERVER_DESCRIPTION", "DNS server that the system is configured to use"},
};

// A library's name is the prefix, its number, "_" and the language.
constexpr const char* kPrefix = "zorvatexts";

std::string libraryName(unsigned long number, const std::string& language) {
  return kPrefix + std::to_string(number) + '_' + language;
}

std::wstring findText(const std::string& library, const std::string& key, bool inEnglish) {
  for (const Text& text : kTexts) {
    const std::string family = libraryName(text.library, {});
    const bool found = inEnglish ? library.starts_with(family) && std::string_view(text.language) == kEnglish
                                 : library == family + text.language;
    if (found && key == text.key) return make_wstring(text.text);
  }
  return {};
}

}  // namespace

std::string Locale::getLanguageId() { return zorva::agent::CurrentConfig::instance().get().language; }

std::wstring Locale::getResourceLibrary(unsigned long number, std::string language) {
  return make_wstring(libraryName(number, language));
}

std::wstring ResourceString(const std::wstring& library, const std::wstring& key) {
  const std::string name = make_string(library);
  const std::string wanted = make_string(key);
  std::wstring text = findText(name, wanted, false);
  return text.empty() ? findText(name, wanted, true) : text;
}

}  // namespace ZV
