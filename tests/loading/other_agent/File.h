#pragma once

#include <string>

namespace ZV {

class File {
 public:
  class Path {
   public:
    Path(const std::string& path);
    ~Path();

   private:
    std::wstring path_;
  };

  static bool exists(const std::wstring& path);
};

}  // namespace ZV
