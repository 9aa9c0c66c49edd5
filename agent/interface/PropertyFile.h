// Reads files of key=value lines.
#pragma once

#include <string>
#include <vector>

#include "AgentApi.h"
#include "File.h"

namespace ZV {

// A reader bound to one path. The first "=" of a line splits it into key and value; lines that start with "#" and blank
// lines are passed over; of a key that stands twice the first counts; the line end, LF or CRLF, is no part of the
// value; quotes and blanks stay. Belongs to one thread.
class ZORVA_AGENT_API PropertyFile {
 public:
  explicit PropertyFile(const File::Path& path);
  ~PropertyFile();
  PropertyFile(const PropertyFile&) = delete;
  PropertyFile& operator=(const PropertyFile&) = delete;

  // Reads the file. mode 1 means for reading, which is all there is. False where the file cannot be opened or read or
  // is not a regular file; the reader then has no keys. Never blocks on a FIFO or device.
  bool open(unsigned long mode);

  // The value of the key, or empty text where there is none or nothing is open.
  std::wstring getValue(const std::wstring& key) const;

  // Lets go of what open read.
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
