#pragma once

// For tests: requests in two lines, and their responses.

#include <mutex>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "cimom/Service.h"

namespace zorva::cimom::testing {

/// Collects a response.
class CollectingSink : public http::ResponseSink {
 public:
  void begin(int code, const http::HeaderList& fields) override;
  void write(std::string_view text) override;
  void fail(std::uint32_t cimStatus, std::string_view description) override;
  bool begun() const override { return status != 0; }

  /// The value of a header; empty if there is none.
  std::string header(std::string_view name) const;

  int status = 0;
  http::HeaderList headers;
  std::string body;
  std::size_t pieces = 0;
  std::size_t largestPiece = 0;
  std::optional<std::pair<std::uint32_t, std::string>> failure;
  std::size_t goneAfter = 0;  ///< not 0: the client leaves after so many pieces
};

/// <IPARAMVALUE NAME="name">value</IPARAMVALUE>
std::string parameter(const std::string& name, const std::string& value);
std::string text(const std::string& name, const std::string& value);
std::string className(const std::string& name, const std::string& value);
std::string instanceName(const std::string& className, const std::vector<std::pair<std::string, std::string>>& keys);
std::string names(const std::string& name, const std::vector<std::string>& values);

std::string localNamespace(const std::string& nameSpace);
/// A SIMPLEREQ.
std::string intrinsic(const std::string& operation, const std::string& parameters,
                      const std::string& nameSpace = "root/cimv2");
std::string extrinsic(const std::string& method, const std::string& instance, const std::string& parameters,
                      const std::string& nameSpace = "root/cimv2");
/// The whole message.
std::string message(const std::string& content);

/// A request as a client sends it.
http::HttpRequest post(const std::string& body, http::HeaderList headers);
http::HttpRequest request(const std::string& operation, const std::string& parameters,
                          const std::string& nameSpace = "root/cimv2");

/// A broker over the test provider, and a service over it.
class TestService {
 public:
  explicit TestService(ServiceOptions options = {});

  /// A response with status 200 must be a valid document of CIM-XML.
  CollectingSink ask(const http::HttpRequest& asked);
  /// Requests an intrinsic operation; the status must be 200.
  std::string ask(const std::string& operation, const std::string& parameters,
                  const std::string& nameSpace = "root/cimv2");

  std::vector<std::string> lines();
  /// The audit's lines.
  std::vector<std::string> changes();
  broker::Broker& broker() { return *broker_; }
  Service& service() { return *service_; }

 private:
  broker::LogHook log();

  std::mutex mutex_;
  std::vector<std::string> lines_;
  std::vector<std::string> changes_;
  std::optional<broker::Broker> broker_;
  std::optional<Service> service_;
};

}  // namespace zorva::cimom::testing
