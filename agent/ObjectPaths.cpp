#include "agent/interface/ObjectPaths.h"

#include <cmpift.h>

#include <algorithm>
#include <optional>
#include <string>
#include <vector>

namespace ZV {
namespace {

// References may be nested; no real key goes deeper than this.
constexpr int kDeepestReference = 16;

struct Key {
  std::string name;
  CMPIData value;
};

// A path in the form in which it is compared.
struct Path {
  std::string className;
  std::string nameSpace;
  std::vector<Key> keys;
};

// Names are CIM identifiers: only their ASCII letters have case, independent of the process's locale.
char lower(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; }

std::string folded(std::string text) {
  std::transform(text.begin(), text.end(), text.begin(), lower);
  return text;
}

template <typename Object>
bool isNull(const Object* object) {
  return object == nullptr || object->hdl == nullptr || object->ft == nullptr;
}

// The text of a string object, empty if it has none, or nothing if it cannot be read.
std::optional<std::string> textOf(const CMPIString* string, const CMPIStatus& status) {
  if (status.rc != CMPI_RC_OK) return std::nullopt;
  if (isNull(string)) return std::string();
  CMPIStatus read{CMPI_RC_OK, nullptr};
  const char* text = string->ft->getCharPtr(string, &read);
  if (read.rc != CMPI_RC_OK) return std::nullopt;
  return std::string(text == nullptr ? "" : text);
}

template <typename Getter>
std::optional<std::string> nameOf(const CMPIObjectPath* path, Getter get) {
  CMPIStatus status{CMPI_RC_OK, nullptr};
  const CMPIString* string = get(path, &status);
  auto text = textOf(string, status);
  if (text.has_value()) *text = folded(std::move(*text));
  return text;
}

// Only the value is checked: servers leave any state beside a good value.
bool isNull(const CMPIData& data) {
  switch (data.type) {
    case CMPI_null:
      return true;
    case CMPI_chars:
      return data.value.chars == nullptr;
    case CMPI_string:
      return isNull(data.value.string);
    case CMPI_dateTime:
      return isNull(data.value.dateTime);
    default:
      return false;
  }
}

std::optional<Key> keyAt(const CMPIObjectPath* path, CMPICount index) {
  CMPIStatus status{CMPI_RC_OK, nullptr};
  CMPIString* name = nullptr;
  const CMPIData value = path->ft->getKeyAt(path, index, &name, &status);
  const auto text = textOf(name, status);
  const bool isMissing = isNull(value) && (value.state & (CMPI_notFound | CMPI_badValue)) != 0;
  if (!text.has_value() || isMissing) return std::nullopt;
  return Key{folded(*text), value};
}

// The path with its names in small letters and its keys by name; nothing if it cannot be read.
std::optional<Path> readPath(const CMPIObjectPath* object) {
  if (isNull(object)) return std::nullopt;
  const auto className = nameOf(object, object->ft->getClassName);
  const auto nameSpace = nameOf(object, object->ft->getNameSpace);
  CMPIStatus status{CMPI_RC_OK, nullptr};
  const CMPICount count = object->ft->getKeyCount(object, &status);
  if (!className.has_value() || !nameSpace.has_value() || status.rc != CMPI_RC_OK) return std::nullopt;

  Path path{*className, *nameSpace, {}};
  for (CMPICount i = 0; i < count; ++i) {
    auto key = keyAt(object, i);
    if (!key.has_value()) return std::nullopt;
    path.keys.push_back(std::move(*key));
  }
  std::sort(path.keys.begin(), path.keys.end(),
            [](const Key& left, const Key& right) { return left.name < right.name; });
  return path;
}

bool isText(CMPIType type) { return type == CMPI_string || type == CMPI_chars; }

std::optional<std::string> textOf(const CMPIData& data) {
  if (data.type == CMPI_chars) return std::string(data.value.chars == nullptr ? "" : data.value.chars);
  return textOf(data.value.string, CMPIStatus{CMPI_RC_OK, nullptr});
}

// A date or interval as its 25 characters.
std::optional<std::string> dateOf(const CMPIDateTime* date) {
  if (isNull(date)) return std::nullopt;
  CMPIStatus status{CMPI_RC_OK, nullptr};
  const CMPIString* text = date->ft->getStringFormat(date, &status);
  return textOf(text, status);
}

// A text that cannot be read equals no other text.
bool equalTexts(const std::optional<std::string>& left, const std::optional<std::string>& right) {
  return left.has_value() && right.has_value() && *left == *right;
}

bool equalNumbers(CMPIType type, const CMPIValue& left, const CMPIValue& right) {
  switch (type) {
    case CMPI_boolean:
      return (left.boolean != 0) == (right.boolean != 0);
    case CMPI_char16:
      return left.char16 == right.char16;
    case CMPI_uint8:
      return left.uint8 == right.uint8;
    case CMPI_uint16:
      return left.uint16 == right.uint16;
    case CMPI_uint32:
      return left.uint32 == right.uint32;
    case CMPI_uint64:
      return left.uint64 == right.uint64;
    case CMPI_sint8:
      return left.sint8 == right.sint8;
    case CMPI_sint16:
      return left.sint16 == right.sint16;
    case CMPI_sint32:
      return left.sint32 == right.sint32;
    case CMPI_sint64:
      return left.sint64 == right.sint64;
    case CMPI_real32:
      return std::equal_to<>()(left.real32, right.real32);
    case CMPI_real64:
      return std::equal_to<>()(left.real64, right.real64);
    default:
      return false;  // no type of a key
  }
}

// Compares two paths, and the references in them.
class Comparison {
 public:
  explicit Comparison(bool comparesReferences) : comparesReferences_(comparesReferences) {}

  // The namespaces are those of the enclosing paths; empty for the outermost.
  bool equalPaths(const CMPIObjectPath* leftObject, const CMPIObjectPath* rightObject, const std::string& leftNameSpace,
                  const std::string& rightNameSpace, int depth) const {
    auto left = readPath(leftObject);
    auto right = readPath(rightObject);
    if (!left.has_value() || !right.has_value() || depth > kDeepestReference) return false;
    if (left->nameSpace.empty()) left->nameSpace = leftNameSpace;
    if (right->nameSpace.empty()) right->nameSpace = rightNameSpace;
    const auto equalKeys = [&](const Key& leftKey, const Key& rightKey) {
      return leftKey.name == rightKey.name &&
             equalValues(leftKey.value, rightKey.value, left->nameSpace, right->nameSpace, depth);
    };
    return left->className == right->className && left->nameSpace == right->nameSpace &&
           std::equal(left->keys.begin(), left->keys.end(), right->keys.begin(), right->keys.end(), equalKeys);
  }

 private:
  bool equalValues(const CMPIData& left, const CMPIData& right, const std::string& leftNameSpace,
                   const std::string& rightNameSpace, int depth) const {
    if (left.type == CMPI_ref || right.type == CMPI_ref) {
      return comparesReferences_ && left.type == right.type &&
             equalPaths(left.value.ref, right.value.ref, leftNameSpace, rightNameSpace, depth + 1);
    }
    if (isNull(left) || isNull(right)) return isNull(left) && isNull(right);
    if (isText(left.type) && isText(right.type)) return equalTexts(textOf(left), textOf(right));
    if (left.type != right.type) return false;
    if (left.type == CMPI_dateTime) return equalTexts(dateOf(left.value.dateTime), dateOf(right.value.dateTime));
    return equalNumbers(left.type, left.value, right.value);
  }

  bool comparesReferences_;
};

}  // namespace

bool isObjPathsEqual(const CMPIObjectPath* left, const CMPIObjectPath* right, bool comparesReferences) {
  return Comparison(comparesReferences).equalPaths(left, right, {}, {}, 0);
}

}  // namespace ZV
