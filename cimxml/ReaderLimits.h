#pragma once

#include <cstddef>

#include "cimxml/XmlCheck.h"

namespace zorva::cimxml {

/// The limits of a request. Requests for real classes are far below them. They keep the later cost of a request in
/// proportion to its size, also in code that takes its parts one by one.
struct ReaderLimits {
  XmlLimits xml;
  std::size_t calls = 100;        ///< SIMPLEREQs in one MULTIREQ
  std::size_t parameters = 256;   ///< IPARAMVALUEs or PARAMVALUEs in one call
  std::size_t keys = 256;         ///< KEYBINDINGs in one INSTANCENAME
  std::size_t properties = 1024;  ///< of each kind of PROPERTY, together, in one INSTANCE
  std::size_t values = 65'536;    ///< elements in one VALUE.ARRAY or VALUE.REFARRAY
  std::size_t namespaces = 64;    ///< NAMESPACEs in one LOCALNAMESPACEPATH
  std::size_t attributes = 32;    ///< of one element
  std::size_t nameBytes = 1024;   ///< of a name, an ID or a version
};

/// How DSP0200 6.3 classifies a refusal (the CIMError header).
enum class Fault {
  NotWellFormed,
  NotLooselyValid,
  UnsupportedCimVersion,
  UnsupportedDtdVersion,
  UnsupportedProtocolVersion,
  UnsupportedOperation,
  TimeIsOver,  ///< XmlLimits::isOver ended the reading
};

}  // namespace zorva::cimxml
