#include "agent/interface/Locale.h"

#include <array>
#include <string_view>

#include "agent/config/CurrentConfig.h"
#include "agent/interface/StringConversion.h"

namespace ZV {
namespace {

// A library's name is this prefix, its number, "_" and the language.
constexpr std::wstring_view kPrefix = L"zorvatexts";

struct Text {
  std::wstring_view family;  // of libraries: the name without the language
  std::wstring_view language;
  std::wstring_view key;
  std::wstring_view text;
};

// Every library has English; it replaces a language that a library lacks.
constexpr std::wstring_view kEnglish = L"en";
constexpr std::wstring_view kProfile = L"zorvatexts2_";
static_assert(kProfile.starts_with(kPrefix));

constexpr std::array kTexts{
    Text{kProfile, kEnglish, L"MSGID_DNS_CLIENT_CAPTION", L"DNS Client"},
    Text{kProfile, kEnglish, L"MSGID_DNS_CLIENT_DESCRIPTION", L"DNS client of a network interface"},
    Text{kProfile, kEnglish, L"MSGID_DNS_SERVER_CAPTION", L"DNS Server"},
    Text{kProfile, kEnglish, L"MSGID_DNS_SERVER_DESCRIPTION", L"DNS server that the system is configured to use"},
};

// Null if there is none.
const Text* findText(std::wstring_view library, std::wstring_view key, std::wstring_view language) {
  for (const Text& text : kTexts) {
    if (text.key == key && text.language == language && library.starts_with(text.family)) return &text;
  }
  return nullptr;
}

}  // namespace

std::string Locale::getLanguageId() { return zorva::agent::CurrentConfig::instance().get().language; }

std::wstring Locale::getResourceLibrary(unsigned long number, std::string language) {
  std::wstring name(kPrefix);
  name += make_wstring(std::to_string(number));
  name += L'_';
  return name += make_wstring(language);
}

std::wstring ResourceString(const std::wstring& library, const std::wstring& key) {
  const std::size_t end = library.find(L'_');
  const Text* text =
      end == std::wstring::npos ? nullptr : findText(library, key, std::wstring_view(library).substr(end + 1));
  if (text == nullptr) text = findText(library, key, kEnglish);
  return text == nullptr ? std::wstring() : std::wstring(text->text);
}

}  // namespace ZV
