#include "broker/objects/ObjectText.h"

#include <array>
#include <charconv>
#include <cstdio>

#include "broker/objects/ClassTable.h"
#include "broker/objects/Convert.h"
#include "broker/objects/Numbers.h"
#include "broker/objects/PathText.h"
#include "broker/objects/QueryObjects.h"

namespace zorva::broker {

namespace {

struct Kind {
  const void* table;
  const char* name;
};

const std::array<Kind, 14>& kinds() noexcept {
  static const std::array<Kind, 14> all = {{
      {&InstanceObject::table, "CMPIInstance"},
      {&PathObject::table, "CMPIObjectPath"},
      {&StringObject::table, "CMPIString"},
      {&ArrayObject::table, "CMPIArray"},
      {&ArgsObject::table, "CMPIArgs"},
      {&DateTimeObject::table, "CMPIDateTime"},
      {&EnumerationObject::table, "CMPIEnumeration"},
      {&ContextObject::table, "CMPIContext"},
      {&resultTable, "CMPIResult"},
      {&ErrorObject::table, "CMPIError"},
      {&SelectExpObject::table, "CMPISelectExp"},
      {&SelectCondObject::table, "CMPISelectCond"},
      {&SubCondObject::table, "CMPISubCond"},
      {&PredicateObject::table, "CMPIPredicate"},
  }};
  return all;
}

std::string realText(double number) {
  char text[40];
  return std::string(text, std::to_chars(text, text + sizeof text, number).ptr);
}

/// As in MOF; a character that is not printable ASCII is written as its number.
std::string characterText(CMPIChar16 code) {
  if (code >= 0x20 && code < 0x7F && code != '\'' && code != '\\') return {'\'', static_cast<char>(code), '\''};
  char text[16];
  std::snprintf(text, sizeof text, "'\\x%04X'", static_cast<unsigned>(code));
  return text;
}

std::string elementsText(const CMPIData* elements, std::size_t count) {
  std::string text = "{";
  for (std::size_t i = 0; i < count; ++i) text += (i == 0 ? "" : ", ") + dataText(elements[i]);
  return text + "}";
}

std::string entriesText(const EntryList& list) {
  std::string text = "(";
  for (const EntryList::Entry& entry : list) {
    if (text.size() > 1) text += ", ";
    text += std::string(entry.name->view()) + "=" + dataText(entry.data);
  }
  return text + ")";
}

std::string instanceText(const InstanceObject& instance) {
  std::string text = "instance of " + instance.info->name() + " {\n";
  for (std::uint32_t i = 0; i < instance.count; ++i) {
    const InstanceObject::Slot& slot = instance.slots[i];
    text += "  " + slot.property->declared->name + " = " + dataText(slot.data) + ";\n";
  }
  return text + "}";
}

std::string errorText(const ErrorObject& error) {
  std::string text(statusName(error.codes.status));
  if (error.messageId != nullptr) text += " " + std::string(error.messageId->view());
  if (error.message != nullptr) text += ": " + std::string(error.message->view());
  return text;
}

}  // namespace

bool isOwnTable(const void* table) noexcept {
  for (const Kind& kind : kinds()) {
    if (kind.table == table) return true;
  }
  return false;
}

const char* typeNameOf(const void* object) noexcept {
  // All encapsulated objects begin with the same two pointers.
  const auto* handle = static_cast<const CMPIString*>(object);
  if (handle == nullptr || handle->hdl == nullptr) return nullptr;
  for (const Kind& kind : kinds()) {
    if (kind.table == handle->ft) return kind.name;
  }
  return nullptr;
}

std::string objectText(const PathObject& path) {
  ObjectPath plain;
  fillPath(path, plain);
  return pathText(plain);
}

std::string objectText(const void* object) {
  if (const auto* text = own<StringObject>(static_cast<const CMPIString*>(object))) return std::string(text->view());
  if (const auto* path = own<PathObject>(static_cast<const CMPIObjectPath*>(object))) return objectText(*path);
  if (const auto* instance = own<InstanceObject>(static_cast<const CMPIInstance*>(object))) {
    return instanceText(*instance);
  }
  if (const auto* array = own<ArrayObject>(static_cast<const CMPIArray*>(object))) {
    return elementsText(array->elements, array->count);
  }
  if (const auto* args = own<ArgsObject>(static_cast<const CMPIArgs*>(object))) return entriesText(args->list);
  if (const auto* time = own<DateTimeObject>(static_cast<const CMPIDateTime*>(object))) {
    return std::string(time->text->view());
  }
  if (const auto* list = own<EnumerationObject>(static_cast<const CMPIEnumeration*>(object))) {
    return elementsText(list->elements, list->count);
  }
  if (const auto* context = own<ContextObject>(static_cast<const CMPIContext*>(object))) {
    return entriesText(context->list);
  }
  if (const auto* error = own<ErrorObject>(static_cast<const CMPIError*>(object))) return errorText(*error);
  const char* name = typeNameOf(object);
  return name != nullptr ? name : "";
}

std::string dataText(const CMPIData& data) {
  if (data.state != CMPI_goodValue) return "NULL";
  if ((data.type & CMPI_ARRAY) != 0) return objectText(static_cast<const void*>(data.value.array));
  if (isUnsignedType(data.type)) return std::to_string(unsignedOf(data));
  if (isSignedType(data.type)) return std::to_string(signedOf(data));
  switch (data.type) {
    case CMPI_boolean:
      return data.value.boolean != 0 ? "TRUE" : "FALSE";
    case CMPI_char16:
      return characterText(data.value.char16);
    case CMPI_real32:
      return realText(static_cast<double>(data.value.real32));
    case CMPI_real64:
      return realText(data.value.real64);
    case CMPI_dateTime:
    case CMPI_ref:
    case CMPI_string:
      return quotedText(objectText(static_cast<const void*>(data.value.string)));
    case CMPI_instance:
      return objectText(static_cast<const void*>(data.value.inst));
    default:
      return "NULL";
  }
}

}  // namespace zorva::broker
