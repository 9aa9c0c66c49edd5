#pragma once

#include <string>

namespace ZV {

class Locale {
 public:
  static std::string getLanguageId();
  static std::wstring getResourceLibrary(unsigned long number, std::string language);
};

std::wstring ResourceString(std::wstring library, std::wstring key);

}  // namespace ZV
