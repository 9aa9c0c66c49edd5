#pragma once

// Reads files of key=value lines.

#include <string>
#include <vector>

#include "AgentApi.h"
#include "File.h"

namespace ZV {

/// A reader for the file at one path. The first "=" of a line splits it into key and value. Lines that start with "#"
/// and blank lines are skipped. If a key occurs twice, the first one counts. The line end, LF or CRLF, is not part of
/// the value; quotes and blanks are. Belongs to one thread.
class ZORVA_AGENT_API PropertyFile {
 public:
  explicit PropertyFile(const File::Path& path);
  ~PropertyFile();
  PropertyFile(const PropertyFile&) = delete;
  PropertyFile& operator=(const PropertyFile&) = delete;

  /// Reads the file. mode 1 means reading; there is no other mode. False if the file cannot be opened or read or is not
  /// a regular file; the reader then has no keys. Never blocks on a FIFO or device.
  bool open(unsigned long mode);

  /// The value of the key, or empty text if there is none or nothing is open.
  std::wstring getValue(const std::wstring& key) const;

  /// Drops what open() read.
  void close();

 private:
  struct Entry {
    std::string key;
    std::string value;
  };
  std::string path_;
  std::vector<Entry> entries_;
};

}  // namespace ZV
