#include "schema/CompiledClasses.h"

#include <bit>
#include <stdexcept>
#include <type_traits>
#include <utility>

namespace zorva::schema {
namespace {

// Numbers in groups of seven bits, the lowest first; the top bit says that another one comes.
class Packing {
 public:
  void number(std::uint64_t value) {
    for (; value >= 0x80U; value >>= 7U) bytes_ += static_cast<char>(value | 0x80U);
    bytes_ += static_cast<char>(value);
  }
  void text(const std::string& value) {
    number(value.size());
    bytes_ += value;
  }
  std::string take() { return std::move(bytes_); }

 private:
  std::string bytes_;
};

class Unpacking {
 public:
  explicit Unpacking(std::string_view bytes) : rest_(bytes) {}

  void number(std::uint64_t& value) {
    value = 0;
    for (unsigned shift = 0;; shift += 7) {
      const auto byte = static_cast<unsigned char>(take(1).front());
      value |= static_cast<std::uint64_t>(byte & 0x7FU) << (shift & 63U);
      if (byte < 0x80U) return;
    }
  }
  void text(std::string& value) {
    std::uint64_t size = 0;
    number(size);
    value = take(size);
  }

 private:
  std::string_view take(std::uint64_t size) {
    if (size > rest_.size()) throw std::logic_error("compiled declarations break off");
    const std::string_view taken = rest_.substr(0, size);
    rest_.remove_prefix(size);
    return taken;
  }

  std::string_view rest_;
};

// Writes or reads each member of the records, so that both have the same order.
template <typename Bytes>
class Transfer {
 public:
  explicit Transfer(Bytes& bytes) : bytes_(bytes) {}

  template <typename... Members>
  void operator()(Members&... members) {
    (one(members), ...);
  }

 private:
  void one(std::string& text) { bytes_.text(text); }
  void one(std::monostate&) {}
  void one(double& real) {
    auto bits = std::bit_cast<std::uint64_t>(real);
    bytes_.number(bits);
    real = std::bit_cast<double>(bits);
  }

  template <typename Number>
  requires(std::is_integral_v<Number> || std::is_enum_v<Number>) void one(Number& number) {
    auto wide = static_cast<std::uint64_t>(number);
    bytes_.number(wide);
    number = static_cast<Number>(wide);
  }

  template <typename Content>
  void one(std::optional<Content>& optional) {
    bool isThere = optional.has_value();
    one(isThere);
    if (!isThere) return;
    if (!optional) optional.emplace();
    one(*optional);
  }

  template <typename Element>
  void one(std::vector<Element>& elements) {
    std::size_t size = elements.size();
    one(size);
    elements.resize(size);
    for (Element& element : elements) one(element);
  }

  template <typename... Types>
  void one(std::variant<Types...>& variant) {
    std::size_t index = variant.index();
    one(index);
    std::size_t at = 0;
    ((at++ == index ? alternative<Types>(variant) : void()), ...);
  }
  template <typename Type, typename Variant>
  void alternative(Variant& variant) {
    if (!std::holds_alternative<Type>(variant)) variant.template emplace<Type>();
    one(std::get<Type>(variant));
  }

  void one(Value& value) { (*this)(value.isArray, value.isNull, value.scalar, value.elements); }
  void one(Flavor& flavor) { (*this)(flavor.toSubclass, flavor.overridable, flavor.translatable); }
  void one(StatedFlavor& flavor) { (*this)(flavor.toSubclass, flavor.overridable, flavor.translatable); }
  void one(QualifierType& type) {
    (*this)(type.name, type.type, type.isArray, type.arraySize, type.defaultValue, type.scope, type.flavor);
  }
  void one(Qualifier& qualifier) { (*this)(qualifier.name, qualifier.value, qualifier.stated); }
  void one(Property& property) {
    (*this)(property.qualifiers, property.type, property.isArray, property.arraySize, property.name,
            property.referenceClass, property.defaultValue);
  }
  void one(Parameter& parameter) {
    (*this)(parameter.qualifiers, parameter.type, parameter.isArray, parameter.arraySize, parameter.name,
            parameter.referenceClass);
  }
  void one(Method& method) { (*this)(method.qualifiers, method.returnType, method.name, method.parameters); }
  void one(ClassDeclaration& declaration) {
    (*this)(declaration.qualifiers, declaration.name, declaration.superclass, declaration.properties,
            declaration.methods);
  }

  Bytes& bytes_;
};

}  // namespace

std::string compileDeclarations(Declarations declarations) {
  Packing packing;
  Transfer transfer(packing);
  transfer(declarations.qualifierTypes, declarations.classes);
  return packing.take();
}

Declarations readCompiledDeclarations(std::string_view compiled) {
  Declarations declarations;
  Unpacking unpacking(compiled);
  Transfer transfer(unpacking);
  transfer(declarations.qualifierTypes, declarations.classes);
  return declarations;
}

}  // namespace zorva::schema
