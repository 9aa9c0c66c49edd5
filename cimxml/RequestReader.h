#pragma once

// CIM-XML requests (DSP0201 2.4, operations of DSP0200 1.4) as plain values.
//
// The reader accepts any bytes. It is as lenient as DSP0200 requires: elements and attributes that the DTD does not
// have are skipped. If only the schema can decide the type of a value, `broker::Value` has it as a text, and the broker
// converts it to the declared type. Time and memory grow with the text only, within the limits. The function keeps no
// state and may be called on any thread.

#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "broker/objects/Value.h"
#include "cimxml/ReaderLimits.h"
#include "util/Expected.h"

namespace zorva::cimxml {

struct RequestError {
  Fault fault = Fault::NotWellFormed;
  std::string message;  ///< the error and its place: "line 3, column 9: …"
};

/// The name of a class as the value of a parameter.
struct ClassName {
  std::string name;
};

/// A class or a qualifier type as the value of a parameter. It is not read: the server offers no operation that takes
/// one.
struct Declaration {};

/// An array of texts; a null element has no text.
using TextList = std::vector<std::optional<std::string>>;

/// The value of an IPARAMVALUE: none (null), VALUE, VALUE.ARRAY, CLASSNAME, INSTANCENAME or VALUE.REFERENCE, INSTANCE
/// or VALUE.NAMEDINSTANCE, CLASS or QUALIFIER.DECLARATION. An array of texts has a text for each of its values.
using ParameterValue =
    std::variant<std::monostate, std::string, TextList, ClassName, broker::ObjectPath, broker::Instance, Declaration>;

struct Parameter {
  std::string name;
  ParameterValue value;
};

/// An IMETHODCALL or a METHODCALL.
struct Call {
  bool isExtrinsic = false;
  std::string name;
  /// The namespace; for a METHODCALL also the class and, unless `onClass`, the keys of the object. A key with an empty
  /// name is the only key (INSTANCENAME with a bare KEYVALUE).
  broker::ObjectPath target;
  bool onClass = false;
  /// A name may occur twice: the operation refuses it, with its own status.
  std::vector<Parameter> parameters;      ///< of an IMETHODCALL
  std::vector<broker::NamedValue> input;  ///< of a METHODCALL
  /// The types that the client gave the elements of `input`; without one, the class alone decides the type.
  std::vector<std::optional<schema::Type>> saidTypes;
};

struct CimRequest {
  std::string id;
  bool isMultiple = false;
  std::vector<Call> calls;  ///< one, or with `isMultiple` two or more
};

/// Reads a request.
Expected<CimRequest, RequestError> readRequest(std::string_view text, const ReaderLimits& limits);

}  // namespace zorva::cimxml
