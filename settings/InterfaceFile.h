#pragma once

// The files ifcfg-<name> of key=value lines in the agent's data directory, one for each interface. While a file exists,
// it is the source of the interface's DNS settings; otherwise the instrumentation tree is.

#include <string>
#include <vector>

#include "trace/Trace.h"

namespace ZV {

extern const std::string loggerDNSSettingData;

/// The path of an interface's file: the data directory, "ifcfg-" and the name, without separators.
std::string interfaceFileName(const std::string& interfaceName);

bool interfaceFileExists(const std::string& fileName);

/// The value of a key in an existing file; a missing key gives the empty text.
///
/// readScalar removes the line feeds at the value's end, except from a value that has only line feeds. It logs the
/// value under the given name while the file is open. readList splits the value at blanks and appends to values.
std::string readScalar(const std::string& fileName, const char* key, const std::string& logger, const LogSite& site,
                       const char* name);
void readList(const std::string& fileName, const char* key, std::vector<std::string>& values);

/// Write a value under a key into an existing file. Every line that contains the key anywhere becomes "key=value", even
/// a line of a longer key or a comment; lines longer than 511 bytes count as several. If no line contains the key,
/// modifyValue appends a line for it and modifyDNSValue drops the value.
///
/// A file that is missing, is not a regular file or cannot be opened or read is not changed, and no error is reported.
/// The file is rewritten in place, neither locked nor atomically: of two concurrent rewrites one may be lost, and a
/// failure in the middle leaves a truncated file. modifyDNSValue always returns true.
void modifyValue(std::string fileName, std::string key, std::string value);
bool modifyDNSValue(std::string fileName, std::string key, std::string value);

}  // namespace ZV
