#pragma once

// CIM-XML responses (DSP0201 2.x) as plain values.
//
// A server is not trusted: the text is read within bounds of depth, elements that are not known are passed over, and
// what is no CIM-XML, or breaks off, is an error that names the place.

#include <string>
#include <string_view>
#include <vector>

#include "broker/Broker.h"
#include "util/Expected.h"

namespace zorva::cimxml {

/// The result of an operation. The operation decides which of the lists is filled.
struct CimResponse {
  broker::Status status;                    ///< from an ERROR element
  std::vector<broker::Instance> instances;  ///< with their paths, if the response has them
  std::vector<broker::ObjectPath> paths;
  std::vector<schema::ClassDeclaration> classes;
  broker::MethodResult method;
};

struct ResponseError {
  std::string message;  ///< why the text is no CIM-XML response; has what the server sent in it, as it came
};

/// Reads a whole response; `text` is used up. Where `classes` knows a class, keys get the types that it declares,
/// and instances and properties refer to their declarations. What the response leaves out of a path is left empty.
Expected<CimResponse, ResponseError> readResponse(std::string text, const schema::ClassRepository& classes);

}  // namespace zorva::cimxml
