#pragma once

// The parameters of an intrinsic operation, taken one by one under the names and with the defaults of DSP0200. The
// first error is remembered; after the operation has taken all its parameters, it asks once with status().

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "broker/objects/Value.h"
#include "cimxml/RequestReader.h"

namespace zorva::cimom {

class Arguments {
 public:
  /// `call` outlives this.
  explicit Arguments(const cimxml::Call& call) : call_(call), taken_(call.parameters.size()) {}

  bool boolean(std::string_view name, bool otherwise);
  /// Nothing if it is left out or null.
  std::optional<std::uint64_t> number(std::string_view name);
  std::optional<std::string> text(std::string_view name);
  std::optional<std::vector<std::string>> names(std::string_view name);
  /// Empty if it is left out or null.
  std::string className(std::string_view name);

  /// Required parameters.
  std::string requiredText(std::string_view name);
  std::string requiredClassName(std::string_view name);
  broker::ObjectPath requiredPath(std::string_view name);
  broker::Instance requiredInstance(std::string_view name);
  /// The name of a class or of an instance; the name of a class is a path without keys.
  broker::ObjectPath requiredObject(std::string_view name, bool& isClass);
  /// VALUE, VALUE.ARRAY or VALUE.REFERENCE; null if it is left out.
  broker::Value value(std::string_view name);

  /// The first error: CIM_ERR_INVALID_PARAMETER, also for a parameter that the operation does not have.
  broker::Status status() const;

 private:
  const cimxml::ParameterValue* take(std::string_view name);
  void refuse(std::string_view name, std::string_view wanted);

  const cimxml::Call& call_;
  std::vector<bool> taken_;
  std::string problem_;
};

}  // namespace zorva::cimom
