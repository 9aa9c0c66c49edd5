#pragma once

#include <string>

#include "File.h"

namespace ZV {

class PropertyFile {
 public:
  PropertyFile(const File::Path& path);
  ~PropertyFile();

  unsigned long open(unsigned long mode);
  std::wstring getValue(const std::wstring& key);
  void close();

 private:
  void* reader_;
};

}  // namespace ZV
