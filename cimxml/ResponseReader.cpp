#include "cimxml/ResponseReader.h"

#include "cimxml/ElementReader.h"
#include "cimxml/XmlCheck.h"
#include "cimxml/XmlTree.h"

namespace zorva::cimxml {

namespace {

using pugi::xml_node;

/// A limit for any server, so that reading does not use up the stack.
constexpr std::size_t kDeepest = 128;
constexpr std::size_t kMostElements = 20'000'000;

std::string textAttribute(const xml_node& node, const char* name) { return node.attribute(name).value(); }

class Reader {
 public:
  explicit Reader(const schema::ClassRepository& classes) : elements_(classes) {}

  CimResponse read(const xml_node& document) {
    const xml_node message = document.child("CIM").child("MESSAGE");
    const xml_node simple = message.child("SIMPLERSP");
    if (!simple) refuse(simple, "it has no element CIM/MESSAGE/SIMPLERSP");
    const xml_node intrinsic = simple.child("IMETHODRESPONSE");
    const xml_node extrinsic = simple.child("METHODRESPONSE");
    if (!intrinsic && !extrinsic) refuse(simple, "it has neither an IMETHODRESPONSE nor a METHODRESPONSE");
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
    response_.status.message = textAttribute(error, "DESCRIPTION");
  }

  /// One element of IRETURNVALUE.
  void readResult(const xml_node& node) {
    if (is(node, "INSTANCENAME") || is(node, "INSTANCEPATH") || is(node, "LOCALINSTANCEPATH")) {
      response_.paths.push_back(elements_.path(node));
    } else if (is(node, "OBJECTPATH")) {
      response_.paths.push_back(elements_.path(node.first_child()));
    } else if (is(node, "INSTANCE")) {
      response_.instances.push_back(elements_.instance(node));
    } else if (is(node, "CLASS")) {
      response_.classes.push_back(classOf(node));
    } else if (std::string_view(node.name()).starts_with("VALUE.")) {
      readNamedInstance(node);
    }
  }

  /// VALUE.NAMEDINSTANCE, VALUE.INSTANCEWITHPATH, VALUE.OBJECTWITHPATH and the like: a name and its object.
  void readNamedInstance(const xml_node& node) {
    const xml_node element = node.child("INSTANCE");
    if (!element) return;
    broker::Instance instance = elements_.instance(element);
    const xml_node name = node.first_child();
    if (!is(name, "INSTANCE")) instance.path = elements_.path(name);
    response_.instances.push_back(std::move(instance));
  }

  void readMethod(const xml_node& method) {
    for (const xml_node& each : method) {
      if (is(each, "RETURNVALUE")) {
        response_.method.returnValue = elements_.valueIn(each, elements_.kindOf(each, "PARAMTYPE"));
      } else if (is(each, "PARAMVALUE")) {
        response_.method.output.push_back(
            {textAttribute(each, "NAME"), elements_.valueIn(each, elements_.kindOf(each, "PARAMTYPE"))});
      }
    }
  }

  /// The parts of a class that a client needs: names, types, keys, references, methods.
  schema::ClassDeclaration classOf(const xml_node& node) {
    schema::ClassDeclaration declared;
    declared.name = textAttribute(node, "NAME");
    declared.superclass = textAttribute(node, "SUPERCLASS");
    declared.qualifiers = qualifiersOf(node);
    for (const xml_node& each : node) {
      const std::string_view element = each.name();
      if (element.starts_with("PROPERTY")) declared.properties.push_back(propertyOf(each));
      if (element == "METHOD") declared.methods.push_back(methodOf(each));
    }
    return declared;
  }

  schema::Property propertyOf(const xml_node& node) {
    schema::Property property;
    property.name = textAttribute(node, "NAME");
    property.isArray = is(node, "PROPERTY.ARRAY");
    property.type = is(node, "PROPERTY.REFERENCE") ? schema::Type::Reference : elements_.typeOf(node, "TYPE");
    property.referenceClass = textAttribute(node, "REFERENCECLASS");
    property.qualifiers = qualifiersOf(node);
    return property;
  }

  schema::Method methodOf(const xml_node& node) {
    schema::Method method;
    method.name = textAttribute(node, "NAME");
    method.returnType = elements_.typeOf(node, "TYPE");
    for (const xml_node& each : node) {
      const std::string_view element = each.name();
      if (!element.starts_with("PARAMETER")) continue;
      schema::Parameter& parameter = method.parameters.emplace_back();
      parameter.name = textAttribute(each, "NAME");
      parameter.isArray = element == "PARAMETER.ARRAY" || element == "PARAMETER.REFARRAY";
      const bool isReference = element == "PARAMETER.REFERENCE" || element == "PARAMETER.REFARRAY";
      parameter.type = isReference ? schema::Type::Reference : elements_.typeOf(each, "TYPE");
      parameter.referenceClass = textAttribute(each, "REFERENCECLASS");
    }
    return method;
  }

  /// The qualifiers that a client needs.
  schema::Qualifiers qualifiersOf(const xml_node& node) {
    schema::Qualifiers qualifiers;
    for (const xml_node& each : node.children("QUALIFIER")) {
      schema::Qualifier qualifier;
      qualifier.name = textAttribute(each, "NAME");
      if (qualifier.name == "Key" || qualifier.name == "Association") {
        qualifier.value = schema::Value::of(util::sameName(trimmed(elements_.content(each.child("VALUE"))), "TRUE"));
      } else if (qualifier.name == "ValueMap" || qualifier.name == "Values") {
        std::vector<schema::Scalar> texts;
        for (const xml_node& value : each.child("VALUE.ARRAY")) texts.emplace_back(elements_.content(value));
        qualifier.value = schema::Value::array(std::move(texts));
      } else {
        continue;
      }
      qualifiers.push_back(std::move(qualifier));
    }
    return qualifiers;
  }

  ElementReader elements_;
  CimResponse response_;
};

}  // namespace

Expected<CimResponse, ResponseError> readResponse(std::string text, const schema::ClassRepository& classes) {
  if (const auto checked = checkXml(text, {kDeepest, kMostElements}); !checked) {
    return unexpected(ResponseError{placeText(text, checked.error().position) + ": " + checked.error().message});
  }
  pugi::xml_document document;
  const pugi::xml_parse_result parsed =
      document.load_buffer_inplace(text.data(), text.size(), kParseFlags, pugi::encoding_utf8);
  if (!parsed) {
    return unexpected(ResponseError{"byte " + std::to_string(parsed.offset + 1) + ": " + parsed.description()});
  }
  try {
    return Reader(classes).read(document);
  } catch (Refusal& refusal) {
    return unexpected(ResponseError{std::move(refusal.message)});
  }
}

}  // namespace zorva::cimxml
