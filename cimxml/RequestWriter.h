#pragma once

// CIM-XML requests (DSP0201, operations of DSP0200) to a server.

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "broker/Broker.h"

namespace zorva::cimxml {

/// The text of an intrinsic operation, built parameter by parameter. Empty names are left out.
class IntrinsicCall {
 public:
  IntrinsicCall(std::string_view operation, std::string_view nameSpace);

  IntrinsicCall& className(std::string_view parameter, std::string_view name);
  IntrinsicCall& instanceName(std::string_view parameter, const broker::ObjectPath& path);
  IntrinsicCall& text(std::string_view parameter, std::string_view value);
  IntrinsicCall& boolean(std::string_view parameter, bool value);
  IntrinsicCall& propertyList(const std::optional<std::vector<std::string>>& names);
  IntrinsicCall& modifiedInstance(const broker::Instance& instance);

  /// The whole message. The call must not be used afterwards.
  std::string message();

 private:
  void begin(std::string_view parameter);
  void end();

  std::string text_;
};

/// The whole message of a call of an extrinsic method.
std::string methodCall(const broker::ObjectPath& path, std::string_view method,
                       const std::vector<broker::NamedValue>& input);

}  // namespace zorva::cimxml
