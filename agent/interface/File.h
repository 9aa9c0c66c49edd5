#pragma once

// Files by path.

#include <string>

#include "AgentApi.h"

namespace ZV::File {

/// The path of a file: any bytes but NUL.
class ZORVA_AGENT_API Path {
 public:
  explicit Path(const std::string& path);
  const std::string& string() const;

 private:
  std::string path_;
};

/// True if a file of any kind exists at that path, symbolic links followed. Thread-safe.
ZORVA_AGENT_API bool exists(const std::wstring& path);

}  // namespace ZV::File
