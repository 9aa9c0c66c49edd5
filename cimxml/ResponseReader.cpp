#include "cimxml/ResponseReader.h"

#include <charconv>
#include <optional>
#include <pugixml.hpp>

#include "cimxml/XmlCheck.h"
#include "schema/Utf8.h"

namespace zorva::cimxml {

namespace {

using pugi::xml_node;

/// Whatever a server sends, reading it must not exhaust the stack.
constexpr std::size_t kDeepest = 128;
constexpr std::size_t kMostElements = 20'000'000;

/// Leaves the reading; readResponse gives it back.
ResponseError wrongResponse(std::string why) { return {std::move(why)}; }

std::string attribute(const xml_node& node, const char* name) { return node.attribute(name).value(); }

bool isElement(const xml_node& node, std::string_view name) noexcept { return node.name() == name; }

/// The text of an element, whatever pieces it is in.
std::string textOf(const xml_node& node) {
  std::string text;
  for (const xml_node& piece : node) {
    if (piece.type() == pugi::node_pcdata || piece.type() == pugi::node_cdata) text += piece.value();
  }
  return text;
}

std::string_view trimmed(std::string_view text) noexcept {
  const std::size_t from = text.find_first_not_of(" \t\r\n");
  if (from == std::string_view::npos) return {};
  return text.substr(from, text.find_last_not_of(" \t\r\n") - from + 1);
}

template <class Number>
broker::Scalar numberOf(std::string_view text, const std::string& element) {
  std::string digits(trimmed(text));
  const bool isNegative = digits.starts_with('-');
  if (isNegative || digits.starts_with('+')) digits.erase(0, 1);
  const bool isHex = digits.starts_with("0x") || digits.starts_with("0X");
  if (isHex) digits.erase(0, 2);
  if (isNegative) digits.insert(digits.begin(), '-');
  Number number = 0;
  const char* const end = digits.data() + digits.size();
  const auto read = std::from_chars(digits.data(), end, number, isHex ? 16 : 10);
  if (read.ec == std::errc() && read.ptr == end) return number;
  throw wrongResponse("'" + std::string(text.substr(0, 60)) + "' in " + element + " is no whole number");
}

broker::Scalar realOf(std::string_view text, const std::string& element) {
  const std::string_view digits = trimmed(text);
  double number = 0;
  const auto read = std::from_chars(digits.data(), digits.data() + digits.size(), number);
  if (read.ec == std::errc() && read.ptr == digits.data() + digits.size()) return number;
  throw wrongResponse("'" + std::string(text.substr(0, 60)) + "' in " + element + " is no number");
}

broker::Scalar scalarOf(const std::string& text, schema::Type type, const std::string& element) {
  if (schema::isUnsigned(type)) return numberOf<std::uint64_t>(text, element);
  if (schema::isSigned(type)) return numberOf<std::int64_t>(text, element);
  if (schema::isReal(type)) return realOf(text, element);
  if (type == schema::Type::Boolean) return schema::sameName(trimmed(text), "TRUE");
  if (type == schema::Type::Char16) {
    const std::size_t length = schema::utf8Length(text);
    return static_cast<char16_t>(length == 0 || length > 3 ? 0xFFFD : schema::utf8Decode(text));
  }
  return text;
}

/// The type that an attribute names; servers before DSP0201 2.1 leave it out of some elements.
schema::Type typeOf(const xml_node& node, const char* name) {
  const std::string word = attribute(node, name);
  if (word.empty()) return schema::Type::String;
  if (schema::sameName(word, "reference")) return schema::Type::Reference;
  if (const auto type = schema::typeFromName(word)) return *type;
  throw wrongResponse("'" + word + "' is no CIM type");
}

class Reader {
 public:
  explicit Reader(const schema::ClassRepository& classes) : classes_(classes) {}

  CimResponse read(const xml_node& document) {
    const xml_node message = document.child("CIM").child("MESSAGE");
    const xml_node simple = message.child("SIMPLERSP");
    if (!simple) throw wrongResponse("it has no element CIM/MESSAGE/SIMPLERSP");
    const xml_node intrinsic = simple.child("IMETHODRESPONSE");
    const xml_node extrinsic = simple.child("METHODRESPONSE");
    if (!intrinsic && !extrinsic) throw wrongResponse("it has neither an IMETHODRESPONSE nor a METHODRESPONSE");
    const xml_node response = intrinsic ? intrinsic : extrinsic;
    if (const xml_node error = response.child("ERROR")) readError(error);
    for (const xml_node& each : intrinsic.child("IRETURNVALUE")) readResult(each);
    if (extrinsic) readMethod(extrinsic);
    return std::move(response_);
  }

 private:
  void readError(const xml_node& error) {
    response_.status.rc = error.attribute("CODE").as_int(1);
    if (response_.status.rc == 0) response_.status.rc = 1;
    response_.status.message = attribute(error, "DESCRIPTION");
  }

  /// One element of IRETURNVALUE.
  void readResult(const xml_node& node) {
    if (isElement(node, "INSTANCENAME") || isElement(node, "INSTANCEPATH") || isElement(node, "LOCALINSTANCEPATH")) {
      response_.paths.push_back(pathOf(node));
    } else if (isElement(node, "OBJECTPATH")) {
      response_.paths.push_back(pathOf(node.first_child()));
    } else if (isElement(node, "INSTANCE")) {
      response_.instances.push_back(instanceOf(node));
    } else if (isElement(node, "CLASS")) {
      response_.classes.push_back(classOf(node));
    } else if (std::string_view(node.name()).starts_with("VALUE.")) {
      readNamedInstance(node);
    }
  }

  /// VALUE.NAMEDINSTANCE, VALUE.INSTANCEWITHPATH, VALUE.OBJECTWITHPATH and their like: a name, and what it names.
  void readNamedInstance(const xml_node& node) {
    const xml_node element = node.child("INSTANCE");
    if (!element) return;
    broker::Instance instance = instanceOf(element);
    const xml_node name = node.first_child();
    if (!isElement(name, "INSTANCE")) instance.path = pathOf(name);
    response_.instances.push_back(std::move(instance));
  }

  void readMethod(const xml_node& method) {
    for (const xml_node& each : method) {
      if (isElement(each, "RETURNVALUE")) {
        response_.method.returnValue = valueOf(each, typeOf(each, "PARAMTYPE"));
      } else if (isElement(each, "PARAMVALUE")) {
        response_.method.output.push_back({attribute(each, "NAME"), valueOf(each, typeOf(each, "PARAMTYPE"))});
      }
    }
  }

  /// INSTANCENAME, LOCALINSTANCEPATH or INSTANCEPATH.
  broker::ObjectPath pathOf(const xml_node& node) {
    broker::ObjectPath path;
    const xml_node whole = node.child("NAMESPACEPATH");
    path.host = std::string(trimmed(textOf(whole.child("HOST"))));
    const xml_node local = whole ? whole.child("LOCALNAMESPACEPATH") : node.child("LOCALNAMESPACEPATH");
    for (const xml_node& part : local.children("NAMESPACE")) {
      path.nameSpace += (path.nameSpace.empty() ? "" : "/") + attribute(part, "NAME");
    }
    const xml_node name = isElement(node, "INSTANCENAME") ? node : node.child("INSTANCENAME");
    path.className = name ? attribute(name, "CLASSNAME") : attribute(node.child("CLASSNAME"), "NAME");
    if (path.className.empty()) throw wrongResponse(std::string("an element ") + node.name() + " names no class");
    const schema::Class* declared = classes_.find(path.className);
    for (const xml_node& binding : name.children("KEYBINDING")) {
      path.keys.push_back({attribute(binding, "NAME"), keyOf(binding, attribute(binding, "NAME"), declared)});
    }
    // The only key of a class may come without its name.
    if (path.keys.empty() && declared != nullptr && declared->keys().size() == 1 && name.first_child()) {
      const std::string& key = declared->keys().front()->name;
      path.keys.push_back({key, keyOf(name, key, declared)});
    }
    return path;
  }

  broker::Value keyOf(const xml_node& binding, const std::string& name, const schema::Class* declared) {
    if (const xml_node reference = binding.child("VALUE.REFERENCE")) {
      return broker::Value::reference(pathOf(reference.first_child()));
    }
    const xml_node node = binding.child("KEYVALUE");
    const std::string text = textOf(node);
    schema::Type type = keyType(node, text);
    const schema::ClassProperty* property = declared == nullptr ? nullptr : declared->findProperty(name);
    if (property != nullptr && property->type != schema::Type::Reference) type = property->type;
    broker::Value value = broker::Value::null(type);
    value.isNull = false;
    value.scalar = scalarOf(text, type, "KEYVALUE");
    return value;
  }

  static schema::Type keyType(const xml_node& node, std::string_view text) {
    if (node.attribute("TYPE")) return typeOf(node, "TYPE");
    const std::string kind = attribute(node, "VALUETYPE");
    if (kind == "boolean") return schema::Type::Boolean;
    if (kind != "numeric") return schema::Type::String;
    if (text.find_first_of(".eE") != std::string_view::npos && !text.starts_with("0x")) return schema::Type::Real64;
    return trimmed(text).starts_with('-') ? schema::Type::Sint64 : schema::Type::Uint64;
  }

  broker::Instance instanceOf(const xml_node& node) {
    broker::Instance instance;
    instance.path.className = attribute(node, "CLASSNAME");
    instance.declaration = classes_.find(instance.path.className);
    for (const xml_node& each : node) {
      const bool isReference = isElement(each, "PROPERTY.REFERENCE");
      if (!isReference && !isElement(each, "PROPERTY") && !isElement(each, "PROPERTY.ARRAY")) continue;
      broker::Property property;
      property.name = attribute(each, "NAME");
      property.value = valueOf(each, isReference ? schema::Type::Reference : typeOf(each, "TYPE"));
      property.value.isArray = property.value.isArray || isElement(each, "PROPERTY.ARRAY");
      if (instance.declaration != nullptr) property.declaration = instance.declaration->findProperty(property.name);
      instance.properties.push_back(std::move(property));
    }
    return instance;
  }

  /// The value in an element that holds VALUE, VALUE.ARRAY, VALUE.REFERENCE, VALUE.REFARRAY, or nothing for null.
  broker::Value valueOf(const xml_node& holder, schema::Type type) {
    const std::string element = holder.name();
    for (const char* list : {"VALUE.ARRAY", "VALUE.REFARRAY"}) {
      const xml_node values = holder.child(list);
      if (!values) continue;
      std::vector<broker::Scalar> elements;
      for (const xml_node& each : values) elements.push_back(elementOf(each, type, element));
      return broker::Value::array(type, std::move(elements));
    }
    broker::Value value = broker::Value::null(type);
    const xml_node reference = holder.child("VALUE.REFERENCE");
    if (const xml_node one = reference ? reference : holder.child("VALUE")) {
      value.isNull = false;
      value.scalar = elementOf(one, type, element);
      if (reference) value.type = schema::Type::Reference;
    }
    return value;
  }

  broker::Scalar elementOf(const xml_node& node, schema::Type type, const std::string& element) {
    if (isElement(node, "VALUE.NULL")) return {};
    if (isElement(node, "VALUE.REFERENCE")) return broker::Boxed<broker::ObjectPath>(pathOf(node.first_child()));
    return scalarOf(textOf(node), type, element);
  }

  /// A class as far as a client needs it: names, types, keys, references, methods.
  static schema::ClassDeclaration classOf(const xml_node& node) {
    schema::ClassDeclaration declared;
    declared.name = attribute(node, "NAME");
    declared.superclass = attribute(node, "SUPERCLASS");
    declared.qualifiers = qualifiersOf(node);
    for (const xml_node& each : node) {
      const std::string_view element = each.name();
      if (element.starts_with("PROPERTY")) declared.properties.push_back(propertyOf(each));
      if (element == "METHOD") declared.methods.push_back(methodOf(each));
    }
    return declared;
  }

  static schema::Property propertyOf(const xml_node& node) {
    schema::Property property;
    property.name = attribute(node, "NAME");
    property.isArray = isElement(node, "PROPERTY.ARRAY");
    property.type = isElement(node, "PROPERTY.REFERENCE") ? schema::Type::Reference : typeOf(node, "TYPE");
    property.referenceClass = attribute(node, "REFERENCECLASS");
    property.qualifiers = qualifiersOf(node);
    return property;
  }

  static schema::Method methodOf(const xml_node& node) {
    schema::Method method;
    method.name = attribute(node, "NAME");
    method.returnType = typeOf(node, "TYPE");
    for (const xml_node& each : node) {
      const std::string_view element = each.name();
      if (!element.starts_with("PARAMETER")) continue;
      schema::Parameter& parameter = method.parameters.emplace_back();
      parameter.name = attribute(each, "NAME");
      parameter.isArray = element == "PARAMETER.ARRAY" || element == "PARAMETER.REFARRAY";
      const bool isReference = element == "PARAMETER.REFERENCE" || element == "PARAMETER.REFARRAY";
      parameter.type = isReference ? schema::Type::Reference : typeOf(each, "TYPE");
      parameter.referenceClass = attribute(each, "REFERENCECLASS");
    }
    return method;
  }

  /// Those that a client looks at.
  static schema::Qualifiers qualifiersOf(const xml_node& node) {
    schema::Qualifiers qualifiers;
    for (const xml_node& each : node.children("QUALIFIER")) {
      schema::Qualifier qualifier;
      qualifier.name = attribute(each, "NAME");
      if (qualifier.name == "Key" || qualifier.name == "Association") {
        qualifier.value = schema::Value::of(schema::sameName(trimmed(textOf(each.child("VALUE"))), "TRUE"));
      } else if (qualifier.name == "ValueMap" || qualifier.name == "Values") {
        std::vector<schema::Scalar> texts;
        for (const xml_node& value : each.child("VALUE.ARRAY")) texts.emplace_back(textOf(value));
        qualifier.value = schema::Value::array(std::move(texts));
      } else {
        continue;
      }
      qualifiers.push_back(std::move(qualifier));
    }
    return qualifiers;
  }

  const schema::ClassRepository& classes_;
  CimResponse response_;
};

}  // namespace

Expected<CimResponse, ResponseError> readResponse(std::string text, const schema::ClassRepository& classes) {
  if (const auto problem = checkXml(text, {kDeepest, kMostElements})) {
    return unexpected(ResponseError{placeText(text, problem->position) + ": " + problem->message});
  }
  pugi::xml_document document;
  const pugi::xml_parse_result parsed = document.load_buffer_inplace(
      text.data(), text.size(), pugi::parse_default | pugi::parse_ws_pcdata_single, pugi::encoding_utf8);
  if (!parsed) {
    return unexpected(ResponseError{"byte " + std::to_string(parsed.offset + 1) + ": " + parsed.description()});
  }
  try {
    return Reader(classes).read(document);
  } catch (ResponseError& error) {
    return unexpected(std::move(error));
  }
}

}  // namespace zorva::cimxml
