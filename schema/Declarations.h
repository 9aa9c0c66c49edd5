#pragma once

// The declarations of a MOF text, as plain records (DSP0004 2.x). A ClassDeclaration has only the declarations of its
// own text; the class with all inherited elements is schema::Class in ClassRepository.h.
//
// All text is UTF-8. Records are values: no sharing, no locking; a const record may be read by any number of threads.

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

namespace zorva::schema {

/// The beginning of a declaration: line and column from 1, the column counted in bytes. Line 0: not from a text.
struct Place {
  std::uint32_t line = 0;
  std::uint32_t column = 0;
};

/// CIM's intrinsic data types, and the reference.
enum class Type : std::uint8_t {
  Boolean,
  String,
  DateTime,
  Char16,
  Uint8,
  Sint8,
  Uint16,
  Sint16,
  Uint32,
  Sint32,
  Uint64,
  Sint64,
  Real32,
  Real64,
  Reference,
};

/// The MOF keyword of a type ("uint16"); "ref" for a reference.
std::string_view typeName(Type type) noexcept;

/// The type of a MOF keyword, in any case; "ref" is none here. Nothing if there is no such type.
std::optional<Type> typeFromName(std::string_view name) noexcept;

bool isUnsigned(Type type) noexcept;
bool isSigned(Type type) noexcept;
bool isReal(Type type) noexcept;

/// One value without its type. Unsigned types hold std::uint64_t, signed ones std::int64_t, both real types double,
/// date-times (25 characters, DSP0004 5.2.4) and references (an object path, or an alias with its "$") std::string;
/// std::monostate is CIM's null.
using Scalar = std::variant<std::monostate, bool, std::uint64_t, std::int64_t, double, char16_t, std::string>;

/// A scalar or an array of scalars. An array that is null itself is a null scalar with isArray set.
struct Value {
  bool isArray = false;
  bool isNull = true;
  Scalar scalar;                 ///< where isArray is false
  std::vector<Scalar> elements;  ///< where isArray is true

  static Value null(bool array = false);
  static Value of(Scalar one);
  static Value array(std::vector<Scalar> many);

  bool operator==(const Value&) const = default;
};

/// Converts `value` to a value of the type: a whole number becomes a signed one or a real if the type requires that, a
/// text is checked if the type is datetime. Null fits every type. Returns a message, such as "300 does not fit in
/// uint8", if that is not possible; then `value` is unchanged or partly converted.
std::optional<std::string> fitValue(Value& value, Type type, bool isArray);

/// True for a date-time or an interval of DSP0004 5.2.4: 25 characters, asterisks for unknown parts.
bool isDateTime(std::string_view text) noexcept;

/// True for the boolean true; false for all else, null included.
bool isTrue(const Value& value) noexcept;

/// The text of a string value; empty for all else.
std::string_view textOf(const Value& value) noexcept;

/// The elements that may have a qualifier: one bit each.
enum Scope : std::uint16_t {
  ScopeClass = 1,
  ScopeAssociation = 2,
  ScopeIndication = 4,
  ScopeProperty = 8,
  ScopeReference = 16,
  ScopeMethod = 32,
  ScopeParameter = 64,
  ScopeAny = 127,
};

/// How a qualifier is inherited by subclasses (DSP0004 5.1.2.10.3).
struct Flavor {
  bool toSubclass = true;   ///< false: Restricted
  bool overridable = true;  ///< false: DisableOverride
  bool translatable = false;

  bool operator==(const Flavor&) const = default;
};

/// A qualifier type: `Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride);`
struct QualifierType {
  std::string name;
  Type type = Type::Boolean;
  bool isArray = false;
  std::optional<std::uint32_t> arraySize;
  Value defaultValue;
  std::uint16_t scope = 0;  ///< Scope bits
  Flavor flavor;
  Place place;
};

/// The flavors that are written on a qualifier itself (`[Key : DisableOverride]`); the others come from its type.
struct StatedFlavor {
  std::optional<bool> toSubclass;
  std::optional<bool> overridable;
  std::optional<bool> translatable;
};

/// A qualifier on an element. As read, `value` is absent if the text gives none (`[Key]`) and `flavor` has no meaning;
/// a ClassRepository fills both from the qualifier's type.
struct Qualifier {
  std::string name;
  std::optional<Value> value;
  StatedFlavor stated;
  Flavor flavor;
  bool propagated = false;  ///< inherited, not written on the element itself; set by a ClassRepository
  Place place;
};

using Qualifiers = std::vector<Qualifier>;

/// The qualifier of that name, or null. The pointer is into `qualifiers`.
const Qualifier* findQualifier(const Qualifiers& qualifiers, std::string_view name) noexcept;

/// True if the qualifier exists and either has no value or is true: `[Key]`, `[Key(true)]`.
bool hasQualifier(const Qualifiers& qualifiers, std::string_view name) noexcept;

/// A property or, with Type::Reference, a reference of an association.
struct Property {
  Qualifiers qualifiers;
  Type type = Type::String;
  bool isArray = false;
  std::optional<std::uint32_t> arraySize;  ///< of an array of fixed size
  std::string name;
  std::string referenceClass;  ///< the class named before REF; empty for other types
  Value defaultValue;          ///< null if there is none
  Place place;
};

struct Parameter {
  Qualifiers qualifiers;
  Type type = Type::String;
  bool isArray = false;
  std::optional<std::uint32_t> arraySize;
  std::string name;
  std::string referenceClass;
  Place place;
};

struct Method {
  Qualifiers qualifiers;
  Type returnType = Type::Uint32;
  std::string name;
  std::vector<Parameter> parameters;
  Place place;
};

struct ClassDeclaration {
  Qualifiers qualifiers;
  std::string name;
  std::string superclass;  ///< empty: none
  std::vector<Property> properties;
  std::vector<Method> methods;
  Place place;
};

/// All that a repository is made of: each class comes after those that it names.
struct Declarations {
  std::vector<QualifierType> qualifierTypes;
  std::vector<ClassDeclaration> classes;
};

/// `instance of CIM_X as $a { Name = "n"; };`
struct InstanceProperty {
  Qualifiers qualifiers;
  std::string name;
  Value value;
  Place place;
};

struct InstanceDeclaration {
  Qualifiers qualifiers;
  std::string className;
  std::string alias;  ///< with its "$"; empty: none
  std::vector<InstanceProperty> properties;
  Place place;
};

/// Why a text or a class was refused, and the place.
struct SchemaError {
  std::string file;  ///< the name that the reader got; empty: no text
  std::uint32_t line = 0;
  std::uint32_t column = 0;
  std::string message;  ///< the error, with the expected and the actual text

  /// "file:line:column: message"; the parts that are not known are left out.
  std::string text() const;
};

}  // namespace zorva::schema
