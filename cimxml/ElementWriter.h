#pragma once

// CIM values, names and instances as elements of CIM-XML (DSP0201 2.4, DTD DSP0203 2.4.0).
//
// Each function appends to `out` one element, without blanks or line feeds around it. Output is well-formed UTF-8 for
// any input: characters that XML 1.0 cannot hold, and bytes that are no UTF-8, become U+FFFD. The functions keep no
// state and throw only std::bad_alloc; each may be called on any thread.

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "broker/objects/Value.h"

namespace zorva::cimxml {

/// VALUE, VALUE.ARRAY, VALUE.REFERENCE or VALUE.REFARRAY. Nothing at all for null.
void appendValue(std::string& out, const broker::Value& value);

/// INSTANCENAME with its KEYBINDINGs; host and namespace of the path are ignored.
void appendInstanceName(std::string& out, const broker::ObjectPath& path);

/// The text of a KEYBINDING around the value of a key that is no reference.
void appendKeyBegin(std::string& out, const broker::NamedValue& key);
void appendKeyEnd(std::string& out);

/// LOCALNAMESPACEPATH: a NAMESPACE for each part between slashes.
void appendLocalNamespacePath(std::string& out, std::string_view nameSpace);

/// INSTANCEPATH if the path has host and namespace, LOCALINSTANCEPATH if it has only a namespace, INSTANCENAME if it
/// has none.
void appendInstancePath(std::string& out, const broker::ObjectPath& path);

/// NAMESPACEPATH: HOST and LOCALNAMESPACEPATH.
void appendNamespacePath(std::string& out, std::string_view host, std::string_view nameSpace);

/// Always INSTANCEPATH: `host` is used if the path has no host.
void appendWholePath(std::string& out, const broker::ObjectPath& path, std::string_view host);

/// PARAMVALUE of a method's output.
void appendParameter(std::string& out, const broker::NamedValue& parameter);

/// RETURNVALUE of a method. `value` is not null.
void appendReturnValue(std::string& out, const broker::Value& value);

/// The parts of an instance that are written besides its properties' names, types and values.
struct InstanceDetail {
  bool classOrigin = false;  ///< CLASSORIGIN of each property whose declaration is known
  /// Not null: the qualifiers of class and properties are written, if the declaration is known. It has the qualifiers'
  /// types.
  const schema::ClassRepository* qualifiers = nullptr;
};

/// INSTANCE with a PROPERTY, PROPERTY.ARRAY or PROPERTY.REFERENCE for each of its properties, in their order.
void appendInstance(std::string& out, const broker::Instance& instance, const InstanceDetail& detail = {});

/// The same for many instances. The text around the values is made once and used again while the instances have the
/// same class and the same properties in the same order. Used by one thread at a time.
class InstanceWriter {
 public:
  explicit InstanceWriter(const InstanceDetail& detail) : detail_(detail) {}

  void append(std::string& out, const broker::Instance& instance);

  /// An instance without values.
  struct Form {
    /// The property is null if another instance could have another element there.
    struct ValuePlace {
      const schema::ClassProperty* declaration;
      std::size_t place;  ///< in text
    };
    std::string text;
    std::vector<ValuePlace> values;
  };

  /// That of `instance`; valid until the next instance.
  const Form& formOf(const broker::Instance& instance);

 private:
  bool fits(const broker::Instance& instance) const noexcept;
  void makeForm(const broker::Instance& instance);

  InstanceDetail detail_;
  const schema::Class* declaration_ = nullptr;
  Form form_;
};

}  // namespace zorva::cimxml
