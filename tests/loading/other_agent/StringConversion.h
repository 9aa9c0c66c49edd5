#pragma once

#include <string>

namespace ZV {

std::wstring make_wstring(const std::string& text);
std::wstring make_wstring(const char* text);
std::string make_string(const std::wstring& text);
std::string stripSpaces(std::string text);

}  // namespace ZV
