#pragma once

#include <ostream>
#include <string>

namespace ZALog {

class ZALogger {
 public:
  static void logLevelMessage(const char* function, const char* file, int line, const std::string& category, int level,
                              char* reserved1, int reserved2, int reserved3, const std::string& message);
  static void traceLevelMessage(const char* function, const char* file, int line, const std::string& category,
                                int level, char* reserved1, int reserved2, int reserved3, const std::string& message);
};

class ZAMessageBuffer {
 public:
  ZAMessageBuffer();
  ~ZAMessageBuffer();

  ZAMessageBuffer& operator<<(const char* text);
  operator std::ostream&();
  const std::string& str(ZAMessageBuffer& buffer);
  const std::string& str(std::ostream& stream);

 private:
  void* stream_;
};

template <typename T>
ZAMessageBuffer& operator<<(ZAMessageBuffer& buffer, T* pointer) {
  static_cast<std::ostream&>(buffer) << static_cast<const void*>(pointer);
  return buffer;
}

}  // namespace ZALog
