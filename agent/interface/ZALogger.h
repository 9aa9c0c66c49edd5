#pragma once

// The agent's logger and the buffer in which a line is composed.

#include <ostream>
#include <string>

#include "AgentApi.h"

namespace ZALog {

/// Two streams of lines, the log and the trace, each with its own threshold and target in the agent's configuration. A
/// line below the threshold is dropped. Safe to call from several threads at once; each line is written in one piece.
/// Nothing here fails or throws: a line that cannot be written is lost.
class ZORVA_AGENT_API ZALogger {
 public:
  /// function, file, line: the origin of the line; null counts as empty text.
  /// category: the source's name in the log, as "Zorvagent.DNSClient".
  /// level: 3000 flow, 4000 detail, 6000 error; any number may be given and is compared with the threshold.
  /// reserved1 to reserved3: null, 0 and 0; they are ignored.
  /// message: the text, in any bytes; control characters in it are written escaped.
  static void logLevelMessage(const char* function, const char* file, int line, const std::string& category, int level,
                              char* reserved1, int reserved2, int reserved3, const std::string& message);
  static void traceLevelMessage(const char* function, const char* file, int line, const std::string& category,
                                int level, char* reserved1, int reserved2, int reserved3, const std::string& message);
};

/// Gathers the text of one line. Belongs to one thread.
class ZORVA_AGENT_API ZAMessageBuffer {
 public:
  ZAMessageBuffer();
  ~ZAMessageBuffer();
  ZAMessageBuffer(const ZAMessageBuffer&) = delete;
  ZAMessageBuffer& operator=(const ZAMessageBuffer&) = delete;

  /// Appends text; null appends nothing. Returns this buffer.
  ZAMessageBuffer& operator<<(const char* text);

  /// Appends an address as the stream's const void* inserter does: "0x7ffd5c10", null as "0".
  ZAMessageBuffer& appendAddress(const void* address);

  /// The stream that appends to this buffer, for values other than text and addresses.
  operator std::ostream&();

  /// The text gathered so far. The argument, this buffer or its stream, only makes it possible to compose and take a
  /// line in one expression: buffer.str(buffer << "text"). Valid until more is appended or the buffer is destroyed.
  const std::string& str(ZAMessageBuffer& buffer);
  const std::string& str(std::ostream& stream);

 private:
  struct Thread;
  class Room;
  class Shelf;
  static Shelf shelf_;

  Room* const room_;  ///< what the text lies in; others use it afterwards
};

/// Appends the address in the pointer; never the object that it points at.
template <typename T>
ZAMessageBuffer& operator<<(ZAMessageBuffer& buffer, T* pointer) {
  return buffer.appendAddress(pointer);
}

}  // namespace ZALog
