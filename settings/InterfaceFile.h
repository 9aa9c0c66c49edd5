// The files ifcfg-<name> of key=value lines in the agent's data directory, one for an interface. While one exists it is
// the source of the interface's DNS settings; otherwise the instrumentation tree is.
#pragma once

#include <string>
#include <vector>

#include "trace/Trace.h"

namespace ZV {

extern const std::string loggerDNSSettingData;

// The path of an interface's file: the data directory, "ifcfg-" and the name, with nothing between.
std::string interfaceFileName(const std::string& interfaceName);

bool interfaceFileExists(const std::string& fileName);

// The value of a key in a file that exists; a missing key gives the empty text.
//
// readScalar takes away the line feeds at the value's end, but leaves a value of line feeds alone as it is. It logs the
// value under that name while the file is open. readList splits the value at blanks and appends to values.
std::string readScalar(const std::string& fileName, const char* key, const std::string& logger, const LogSite& site,
                       const char* name);
void readList(const std::string& fileName, const char* key, std::vector<std::string>& values);

// Write a value under a key into an existing file. Every line in which the key occurs anywhere becomes "key=value", a
// line of a longer key and a comment included; lines longer than 511 bytes count as several. Where the key stands
// nowhere, modifyValue appends a line for it and modifyDNSValue drops the value.
//
// A file that is missing, is not a regular file or cannot be opened or read stays as it is, without a sign. The file is
// rewritten in place, neither locked nor atomically: of two rewrites at once one may lose, and a failure in the middle
// leaves a shortened file. modifyDNSValue returns true on every path.
void modifyValue(std::string fileName, std::string key, std::string value);
bool modifyDNSValue(std::string fileName, std::string key, std::string value);

}  // namespace ZV
