#pragma once

// Names, values and instances (DSP0201 2.4), which requests and responses both have, as plain values. Only for the
// readers of this folder; the functions throw Refusal.
//
// The form of a request is checked: every required part must be there, once, and within ReaderLimits. Its values stay
// texts if only the schema can decide their type; the broker converts them. Missing parts of a response are left empty.
// Its values get the types in its elements, and its keys the types that the classes declare.

#include <string>
#include <string_view>

#include "broker/objects/Value.h"
#include "cimxml/XmlTree.h"
#include "schema/ClassRepository.h"

namespace zorva::cimxml {

/// The attributes of the elements around a value.
struct ValueKind {
  schema::Type type = schema::Type::String;
  bool isEmbedded = false;
};

class ElementReader {
 public:
  /// Of a request. `limits` must outlive this.
  explicit ElementReader(const ReaderLimits& limits);
  /// Reads a response. If `classes`, which must outlive this object, has a class, instances and properties refer to it.
  explicit ElementReader(const schema::ClassRepository& classes);

  Reading& reading() noexcept { return reading_; }

  /// The value of an attribute; in a response, empty if it is missing.
  std::string_view attribute(pugi::xml_node node, const char* name) const;

  /// The text of an element, joined from its pieces.
  std::string content(pugi::xml_node node) const;

  /// LOCALNAMESPACEPATH.
  std::string nameSpace(pugi::xml_node node) const;

  /// INSTANCENAME, LOCALINSTANCEPATH, INSTANCEPATH, and the same of a class.
  broker::ObjectPath path(pugi::xml_node node);

  /// INSTANCENAME into a path that may have a namespace already. The only key of a class may come without its name:
  /// then its name is empty in a request, and the declared one in a response.
  void instanceName(pugi::xml_node node, broker::ObjectPath& path);

  /// The path in VALUE.REFERENCE.
  broker::ObjectPath reference(pugi::xml_node node);

  /// INSTANCE.
  broker::Instance instance(pugi::xml_node node) { return instance(node, 0); }

  /// The type in an attribute; string if it is missing.
  schema::Type typeOf(pugi::xml_node node, const char* attribute) const;
  ValueKind kindOf(pugi::xml_node node, const char* typeAttribute) const;

  /// VALUE, VALUE.ARRAY, VALUE.REFERENCE or VALUE.REFARRAY.
  broker::Value value(pugi::xml_node node, const ValueKind& kind) { return value(node, kind, 0); }

  /// The first of these elements in `holder`; null if it has none.
  broker::Value valueIn(pugi::xml_node holder, const ValueKind& kind);

 private:
  bool isRequest() const noexcept { return classes_ == nullptr; }
  pugi::xml_node child(pugi::xml_node node, std::initializer_list<const char*> names) const;
  const schema::Class* classOf(std::string_view name) const noexcept;

  broker::Value key(pugi::xml_node node, const schema::ClassProperty* declared);
  broker::Value keyValue(pugi::xml_node node, const schema::ClassProperty* declared);
  void unnamedKey(pugi::xml_node node, const schema::Class* declared, broker::ObjectPath& path);
  broker::Instance instance(pugi::xml_node node, int nesting);
  broker::Property property(pugi::xml_node node, const schema::Class* declared, int nesting);
  broker::Value value(pugi::xml_node node, const ValueKind& kind, int nesting);
  broker::Scalar scalar(pugi::xml_node place, std::string text, const ValueKind& kind, int nesting);
  broker::Scalar requestScalar(pugi::xml_node place, std::string text, const ValueKind& kind, int nesting);
  broker::Scalar embedded(pugi::xml_node place, const std::string& text, int nesting);

  Reading reading_;
  const schema::ClassRepository* const classes_;  ///< null: of a request
};

}  // namespace zorva::cimxml
