#pragma once

// CIM-XML responses (DSP0201 2.x) as plain values.
//
// A server is not trusted: the depth of the text is limited, unknown elements are skipped, and a text that is no
// CIM-XML, or is incomplete, is an error that names the place.

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
  std::string message;  ///< why the text is no CIM-XML response; contains text from the server, unescaped
};

/// Reads a whole response; `text` is modified. If `classes` has a class, keys get the declared types, and instances and
/// properties refer to their declarations. Parts that the response leaves out of a path are left empty.
Expected<CimResponse, ResponseError> readResponse(std::string text, const schema::ClassRepository& classes);

}  // namespace zorva::cimxml
