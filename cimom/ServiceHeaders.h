#pragma once

// The CIM header fields of HTTP (DSP0200 1.4, 6.3 and 7): reads them, and checks that they agree with the body.

#include <optional>
#include <string>
#include <string_view>

#include "broker/Broker.h"
#include "cimxml/RequestReader.h"
#include "http/Exchange.h"
#include "util/Expected.h"

namespace zorva::cimom {

/// A refusal at the level of HTTP.
struct HttpRefusal {
  int status = 400;
  std::string cimError;  ///< the value of the header CIMError; may be empty
  std::string message;   ///< for a person
};

/// The fields of one request, decoded.
struct CimHeaders {
  /// With M-POST, the number before the names of the fields, in the request and in the response ("73").
  std::string prefix;
  bool isExtended = false;  ///< the request came by M-POST
  bool isBatch = false;
  std::optional<std::string> method;
  std::optional<std::string> object;
  std::string host;  ///< the field Host
  std::string acceptLanguage;
  std::string contentLanguage;
};

/// Reads the fields. Refuses a request that is not of CIM, or of another version.
Expected<CimHeaders, HttpRefusal> readHeaders(const http::HttpRequest& request);

/// Compares the fields with the body.
Expected<void, HttpRefusal> checkHeaders(const CimHeaders& headers, const cimxml::CimRequest& request,
                                         const broker::Broker& broker);

/// The fields of a response with a CIM message as its body.
http::HeaderList responseHeaders(const CimHeaders& headers);

}  // namespace zorva::cimom
