#include "cimxml/RequestWriter.h"

#include "cimxml/ElementWriter.h"
#include "cimxml/XmlText.h"
#include "schema/Declarations.h"

namespace zorva::cimxml {

namespace {

constexpr std::string_view kBegin =
    "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n"
    "<CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.3\"><MESSAGE ID=\"1\" PROTOCOLVERSION=\"1.0\"><SIMPLEREQ>";
constexpr std::string_view kEnd = "</SIMPLEREQ></MESSAGE></CIM>\n";

void appendNamed(std::string& out, std::string_view element, std::string_view name) {
  out += '<';
  out += element;
  appendAttribute(out, "NAME", name);
}

}  // namespace

IntrinsicCall::IntrinsicCall(std::string_view operation, std::string_view nameSpace) : text_(kBegin) {
  appendNamed(text_, "IMETHODCALL", operation);
  text_ += '>';
  appendLocalNamespacePath(text_, nameSpace);
}

void IntrinsicCall::begin(std::string_view parameter) {
  appendNamed(text_, "IPARAMVALUE", parameter);
  text_ += '>';
}

void IntrinsicCall::end() { text_ += "</IPARAMVALUE>"; }

IntrinsicCall& IntrinsicCall::className(std::string_view parameter, std::string_view name) {
  if (name.empty()) return *this;
  begin(parameter);
  appendNamed(text_, "CLASSNAME", name);
  text_ += "/>";
  end();
  return *this;
}

IntrinsicCall& IntrinsicCall::instanceName(std::string_view parameter, const broker::ObjectPath& path) {
  begin(parameter);
  appendInstanceName(text_, path);
  end();
  return *this;
}

IntrinsicCall& IntrinsicCall::text(std::string_view parameter, std::string_view value) {
  if (value.empty()) return *this;
  begin(parameter);
  appendValue(text_, broker::Value::text(std::string(value)));
  end();
  return *this;
}

IntrinsicCall& IntrinsicCall::boolean(std::string_view parameter, bool value) {
  begin(parameter);
  appendValue(text_, broker::Value::boolean(value));
  end();
  return *this;
}

IntrinsicCall& IntrinsicCall::propertyList(const std::optional<std::vector<std::string>>& names) {
  if (!names) return *this;
  begin("PropertyList");
  appendValue(text_, broker::Value::textArray(*names));
  end();
  return *this;
}

IntrinsicCall& IntrinsicCall::modifiedInstance(const broker::Instance& instance) {
  begin("ModifiedInstance");
  text_ += "<VALUE.NAMEDINSTANCE>";
  appendInstanceName(text_, instance.path);
  appendInstance(text_, instance);
  text_ += "</VALUE.NAMEDINSTANCE>";
  end();
  return *this;
}

std::string IntrinsicCall::message() {
  text_ += "</IMETHODCALL>";
  text_ += kEnd;
  return std::move(text_);
}

std::string methodCall(const broker::ObjectPath& path, std::string_view method,
                       const std::vector<broker::NamedValue>& input) {
  std::string text(kBegin);
  appendNamed(text, "METHODCALL", method);
  text += "><LOCALINSTANCEPATH>";
  appendLocalNamespacePath(text, path.nameSpace);
  appendInstanceName(text, path);
  text += "</LOCALINSTANCEPATH>";
  for (const broker::NamedValue& each : input) {
    appendNamed(text, "PARAMVALUE", each.name);
    const bool isReference = each.value.type == schema::Type::Reference;
    appendAttribute(text, "PARAMTYPE", isReference ? "reference" : schema::typeName(each.value.type));
    text += '>';
    appendValue(text, each.value);
    text += "</PARAMVALUE>";
  }
  text += "</METHODCALL>";
  text += kEnd;
  return text;
}

}  // namespace zorva::cimxml
