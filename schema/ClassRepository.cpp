#include "schema/ClassRepository.h"

#include <algorithm>
#include <utility>

namespace zorva::schema {

namespace {

// Limits that no schema in use comes near. They keep the work linear in the size of the input: a look-up among siblings
// tests all of them, and a subclass holds a copy of the qualifiers that it inherits.
constexpr std::size_t kMostElements = 1000;   // properties of a class, with the inherited ones; likewise methods
constexpr std::size_t kMostParameters = 250;  // of a method
constexpr std::size_t kMostQualifiers = 250;  // of an element
constexpr std::size_t kDeepest = 100;         // classes in a superclass chain
constexpr std::size_t kMostInheritedBytes = 128U << 20U;  // held by a whole repository

struct Refusal {
  SchemaError error;
};

// An element in the words of an error; the text is only composed when there is an error.
struct Element {
  std::string_view kind;
  std::string_view name;
  std::string_view method = {};  ///< of a parameter

  std::string text() const {
    std::string all = std::string(kind) + " '" + std::string(name) + "'";
    return method.empty() ? all : all + " of method '" + std::string(method) + "'";
  }
};

[[noreturn]] void refuse(Place place, std::string message) {
  throw Refusal{SchemaError{{}, place.line, place.column, std::move(message)}};
}

std::string quote(std::string_view name) { return "'" + std::string(name) + "'"; }

std::string typeText(const Property& property) {
  const std::string type =
      property.type == Type::Reference ? property.referenceClass + " REF" : std::string(typeName(property.type));
  return property.isArray ? type + "[]" : type;
}

std::size_t bytesOf(const Qualifier& qualifier) {
  std::size_t bytes = sizeof(Qualifier) + qualifier.name.size();
  if (!qualifier.value) return bytes;
  bytes += textOf(*qualifier.value).size();
  for (const Scalar& element : qualifier.value->elements) {
    const auto* text = std::get_if<std::string>(&element);
    bytes += sizeof(Scalar) + (text == nullptr ? 0 : text->size());
  }
  return bytes;
}

void requireAtMost(std::size_t most, std::size_t count, std::string_view what, Element on, Place place) {
  if (count <= most) return;
  refuse(place, on.text() + " has " + std::to_string(count) + " " + std::string(what) + "; at most " +
                    std::to_string(most) + " can be");
}

bool hasRestricted(const Qualifiers& qualifiers) {
  return std::any_of(qualifiers.begin(), qualifiers.end(), [](const Qualifier& q) { return !q.flavor.toSubclass; });
}

void dropRestricted(Qualifiers& qualifiers) {
  std::erase_if(qualifiers, [](const Qualifier& q) { return !q.flavor.toSubclass; });
}

Qualifiers ownOnly(const Qualifiers& qualifiers) {
  Qualifiers own;
  std::copy_if(qualifiers.begin(), qualifiers.end(), std::back_inserter(own),
               [](const Qualifier& q) { return !q.propagated; });
  return own;
}

// The index in `elements` of the one with that name; elements.size() if there is none.
template <typename Element>
std::size_t indexOf(const std::vector<const Element*>& elements, std::string_view name) {
  std::size_t i = 0;
  while (i < elements.size() && !util::sameName(elements[i]->name, name)) ++i;
  return i;
}

template <typename Element>
const Element& inheritedForm(const Element& element) {
  return element.bequeathed != nullptr ? *element.bequeathed : element;
}

}  // namespace

// Builds one class from its declaration, or throws a Refusal; the repository is only read.
class ClassBuilder {
 public:
  ClassBuilder(const ClassRepository& repository, ClassDeclaration& declaration)
      : repository_(repository), declaration_(declaration), class_(new Class) {}

  std::unique_ptr<Class> build();
  /// The bytes of inherited qualifiers and of tables in the built class.
  std::size_t inheritedBytes() const noexcept { return inheritedBytes_; }

 private:
  void resolveSuperclass();
  void resolveClassQualifiers();
  void addProperty(Property& declared);
  void addMethod(Method& declared);
  void overrideProperty(ClassProperty& property, const ClassProperty& inherited) const;
  void checkOverrideQualifier(const Qualifiers& qualifiers, Element element, Place place, bool overrides) const;
  const Class* resolveReference(std::string_view name, Element user, Place place) const;
  void resolveQualifiers(Qualifiers& qualifiers, unsigned scope, Element on) const;
  void mergeQualifiers(Qualifiers& own, const Qualifiers& inherited, Element on) const;
  void checkSize() const;
  void index();

  const ClassRepository& repository_;
  ClassDeclaration& declaration_;
  std::unique_ptr<Class> class_;
  mutable std::size_t inheritedBytes_ = 0;
};

std::unique_ptr<Class> ClassBuilder::build() {
  if (repository_.find(declaration_.name) != nullptr) {
    refuse(declaration_.place, "class " + quote(declaration_.name) + " is declared a second time");
  }
  class_->name_ = declaration_.name;
  resolveSuperclass();
  resolveClassQualifiers();
  if (const Class* above = class_->superclass_) {
    for (const ClassProperty* property : above->properties_) class_->properties_.push_back(&inheritedForm(*property));
    for (const ClassMethod* method : above->methods_) class_->methods_.push_back(&inheritedForm(*method));
  }
  checkSize();
  for (Property& property : declaration_.properties) addProperty(property);
  for (Method& method : declaration_.methods) addMethod(method);
  index();
  return std::move(class_);
}

void ClassBuilder::resolveSuperclass() {
  if (declaration_.superclass.empty()) return;
  class_->superclass_ = repository_.find(declaration_.superclass);
  if (class_->superclass_ == nullptr) {
    refuse(declaration_.place, "superclass " + quote(declaration_.superclass) + " of class " +
                                   quote(declaration_.name) + " is not declared");
  }
}

void ClassBuilder::checkSize() const {
  const Element on{"class", declaration_.name};
  const std::size_t properties = class_->properties_.size() + declaration_.properties.size();
  const std::size_t methods = class_->methods_.size() + declaration_.methods.size();
  requireAtMost(kMostElements, properties, "properties", on, declaration_.place);
  requireAtMost(kMostElements, methods, "methods", on, declaration_.place);
  std::size_t depth = 0;
  for (const Class* at = class_->superclass_; at != nullptr; at = at->superclass_) ++depth;
  requireAtMost(kDeepest, depth, "superclasses", on, declaration_.place);
  inheritedBytes_ += sizeof(Class) + (properties + methods) * (sizeof(void*) + sizeof(std::uint32_t));
}

void ClassBuilder::resolveClassQualifiers() {
  const Class* above = class_->superclass_;
  Qualifiers& qualifiers = declaration_.qualifiers;
  class_->isAssociation_ = hasQualifier(qualifiers, "Association") || (above != nullptr && above->isAssociation_);
  class_->isAbstract_ = hasQualifier(qualifiers, "Abstract");
  unsigned scope = ScopeClass;
  if (class_->isAssociation_) scope |= ScopeAssociation;
  if (hasQualifier(qualifiers, "Indication")) scope |= ScopeIndication;
  const Element on{"class", class_->name_};
  resolveQualifiers(qualifiers, scope, on);
  if (above != nullptr) mergeQualifiers(qualifiers, above->qualifiers_, on);
  class_->qualifiers_ = std::move(qualifiers);
}

void ClassBuilder::addProperty(Property& declared) {
  const bool isReference = declared.type == Type::Reference;
  const std::size_t at = indexOf(class_->properties_, declared.name);
  const ClassProperty* inherited = at < class_->properties_.size() ? class_->properties_[at] : nullptr;
  auto property = std::make_unique<ClassProperty>();
  static_cast<Property&>(*property) = std::move(declared);
  const Element on{isReference ? "reference" : "property", property->name};
  if (inherited != nullptr && inherited->origin == class_.get()) {
    refuse(property->place, on.text() + " is declared twice");
  }
  if (isReference && !class_->isAssociation_) {
    refuse(property->place, on.text() + " is in a class without the Association qualifier");
  }
  property->origin = class_.get();
  resolveQualifiers(property->qualifiers, isReference ? ScopeReference : ScopeProperty, on);
  if (isReference) property->reference = resolveReference(property->referenceClass, on, property->place);
  if (property->reference != nullptr) property->referenceClass = property->reference->name_;
  checkOverrideQualifier(property->qualifiers, on, property->place, inherited != nullptr);
  if (inherited != nullptr) overrideProperty(*property, *inherited);
  property->isKey = hasQualifier(property->qualifiers, "Key");
  const bool wasKey = inherited != nullptr && inherited->isKey;
  if (property->isKey && !wasKey && class_->superclass_ != nullptr && !class_->superclass_->keys_.empty()) {
    refuse(property->place,
           on.text() + " is a further key: class " + quote(class_->superclass_->name_) + " has its keys already");
  }

  if (inherited != nullptr) property->name = inherited->name;

  if (hasRestricted(property->qualifiers)) {
    auto bequeathed = std::make_unique<ClassProperty>(*property);
    dropRestricted(bequeathed->qualifiers);
    property->bequeathed = bequeathed.get();
    class_->bequeathedProperties_.push_back(std::move(bequeathed));
  }
  if (inherited != nullptr) {
    class_->properties_[at] = property.get();
  } else {
    class_->properties_.push_back(property.get());
  }
  class_->ownProperties_.push_back(std::move(property));
}

void ClassBuilder::overrideProperty(ClassProperty& property, const ClassProperty& inherited) const {
  const Element on{"property", property.name};
  const bool sameType = property.type == inherited.type && property.isArray == inherited.isArray;
  if (!sameType || (property.reference != nullptr && property.reference != class_.get() &&
                    !property.reference->isA(*inherited.reference))) {
    refuse(property.place, on.text() + " is of type " + typeText(property) + " and overrides " + typeText(inherited) +
                               " of class " + quote(inherited.origin->name_));
  }
  mergeQualifiers(property.qualifiers, inherited.qualifiers, on);
  if (property.defaultValue.isNull) property.defaultValue = inherited.defaultValue;
}

void ClassBuilder::addMethod(Method& declared) {
  const std::size_t at = indexOf(class_->methods_, declared.name);
  const ClassMethod* inherited = at < class_->methods_.size() ? class_->methods_[at] : nullptr;
  auto method = std::make_unique<ClassMethod>();
  static_cast<Method&>(*method) = std::move(declared);
  const Element on{"method", method->name};
  if (inherited != nullptr && inherited->origin == class_.get())
    refuse(method->place, on.text() + " is declared twice");
  method->origin = class_.get();
  resolveQualifiers(method->qualifiers, ScopeMethod, on);
  checkOverrideQualifier(method->qualifiers, on, method->place, inherited != nullptr);
  if (inherited != nullptr && inherited->returnType != method->returnType) {
    refuse(method->place, on.text() + " returns " + std::string(typeName(method->returnType)) +
                              " and overrides one of class " + quote(inherited->origin->name_) + " that returns " +
                              std::string(typeName(inherited->returnType)));
  }
  if (inherited != nullptr) mergeQualifiers(method->qualifiers, inherited->qualifiers, on);
  requireAtMost(kMostParameters, method->parameters.size(), "parameters", on, method->place);
  for (std::size_t i = 0; i < method->parameters.size(); ++i) {
    Parameter& parameter = method->parameters[i];
    const Element which{"parameter", parameter.name, method->name};
    const auto same = [&](const Parameter& other) { return util::sameName(other.name, parameter.name); };
    if (std::any_of(method->parameters.begin(), method->parameters.begin() + static_cast<std::ptrdiff_t>(i), same)) {
      refuse(parameter.place, which.text() + " is declared twice");
    }
    resolveQualifiers(parameter.qualifiers, ScopeParameter, which);
    if (parameter.type == Type::Reference) {
      parameter.referenceClass = resolveReference(parameter.referenceClass, which, parameter.place)->name_;
    }
  }

  if (hasRestricted(method->qualifiers)) {
    auto bequeathed = std::make_unique<ClassMethod>(*method);
    dropRestricted(bequeathed->qualifiers);
    method->bequeathed = bequeathed.get();
    class_->bequeathedMethods_.push_back(std::move(bequeathed));
  }
  if (inherited != nullptr) {
    class_->methods_[at] = method.get();
  } else {
    class_->methods_.push_back(method.get());
  }
  class_->ownMethods_.push_back(std::move(method));
}

// Override names the property, alone or after "Class.". Without the qualifier a second declaration is an error.
void ClassBuilder::checkOverrideQualifier(const Qualifiers& qualifiers, Element element, Place place,
                                          bool overrides) const {
  const Qualifier* qualifier = findQualifier(qualifiers, "Override");
  if (qualifier == nullptr || qualifier->value->isNull) {
    if (overrides) refuse(place, element.text() + " is inherited already and has no Override qualifier");
    return;
  }
  std::string_view target = textOf(*qualifier->value);
  if (const std::size_t dot = target.rfind('.'); dot != std::string_view::npos) target.remove_prefix(dot + 1);
  if (!overrides || !util::sameName(target, element.name)) {
    refuse(qualifier->place,
           element.text() + " overrides " + quote(textOf(*qualifier->value)) + ", which it does not inherit");
  }
}

const Class* ClassBuilder::resolveReference(std::string_view name, Element user, Place place) const {
  if (util::sameName(name, class_->name_)) return class_.get();
  const Class* found = repository_.find(name);
  if (found == nullptr) refuse(place, "class " + quote(name) + " of " + user.text() + " is not declared");
  return found;
}

void ClassBuilder::resolveQualifiers(Qualifiers& qualifiers, unsigned scope, Element on) const {
  requireAtMost(kMostQualifiers, qualifiers.size(), "qualifiers", on, declaration_.place);
  for (Qualifier& qualifier : qualifiers) {
    const QualifierType* type = repository_.findQualifierType(qualifier.name);
    const std::string_view name = qualifier.name;
    const auto what = [&] { return "qualifier " + quote(name) + " on " + on.text(); };
    if (type == nullptr) refuse(qualifier.place, what() + " is not declared");
    if ((type->scope & scope) == 0)
      refuse(qualifier.place, what() + " does not belong there: its scope leaves that out");
    if (findQualifier(qualifiers, name) != &qualifier) refuse(qualifier.place, what() + " is given twice");
    if (!qualifier.value) {
      qualifier.value = type->type == Type::Boolean && !type->isArray ? Value::of(true) : Value::null(type->isArray);
    }
    if (const std::optional<std::string> misfit = fitValue(*qualifier.value, type->type, type->isArray)) {
      refuse(qualifier.place, what() + ": " + *misfit);
    }
    qualifier.flavor.toSubclass = qualifier.stated.toSubclass.value_or(type->flavor.toSubclass);
    qualifier.flavor.overridable = qualifier.stated.overridable.value_or(type->flavor.overridable);
    qualifier.flavor.translatable = qualifier.stated.translatable.value_or(type->flavor.translatable);
    qualifier.name = type->name;
  }
}

// Adds the inherited ones that are not stated again; a DisableOverride qualifier may only be stated with the same
// value.
void ClassBuilder::mergeQualifiers(Qualifiers& own, const Qualifiers& inherited, Element on) const {
  for (const Qualifier& above : inherited) {
    if (!above.flavor.toSubclass) continue;
    const Qualifier* stated = findQualifier(own, above.name);
    if (stated == nullptr) {
      own.push_back(above);
      own.back().propagated = true;
      inheritedBytes_ += bytesOf(above);
    } else if (!above.flavor.overridable && *stated->value != *above.value) {
      refuse(stated->place, "qualifier " + quote(stated->name) + " on " + on.text() +
                                " changes the inherited value, which its flavor DisableOverride forbids");
    }
  }
}

void ClassBuilder::index() {
  for (const ClassProperty* property : class_->properties_) {
    class_->propertyHashes_.push_back(util::nameHash(property->name));
    if (property->isKey) class_->keys_.push_back(property);
    if (property->type == Type::Reference) class_->references_.push_back(property);
  }
  if (class_->isAssociation_ && class_->references_.size() < 2) {
    refuse(declaration_.place, "association " + quote(class_->name_) + " has " +
                                   std::to_string(class_->references_.size()) + " references; it needs two at least");
  }
}

Class::~Class() = default;

const ClassProperty* Class::findProperty(std::string_view name) const noexcept {
  const std::uint32_t hash = util::nameHash(name);
  for (std::size_t i = 0; i < properties_.size(); ++i) {
    if (propertyHashes_[i] == hash && util::sameName(properties_[i]->name, name)) return properties_[i];
  }
  return nullptr;
}

const ClassMethod* Class::findMethod(std::string_view name) const noexcept {
  const std::size_t at = indexOf(methods_, name);
  return at < methods_.size() ? methods_[at] : nullptr;
}

bool Class::isA(const Class& ancestor) const noexcept {
  for (const Class* at = this; at != nullptr; at = at->superclass_) {
    if (at == &ancestor) return true;
  }
  return false;
}

bool Class::isA(std::string_view ancestor) const noexcept {
  for (const Class* at = this; at != nullptr; at = at->superclass_) {
    if (util::sameName(at->name_, ancestor)) return true;
  }
  return false;
}

ClassDeclaration Class::declaration() const {
  ClassDeclaration declared;
  declared.name = name_;
  if (superclass_ != nullptr) declared.superclass = superclass_->name_;
  declared.qualifiers = ownOnly(qualifiers_);
  for (const auto& property : ownProperties_) {
    declared.properties.push_back(*property);
    declared.properties.back().qualifiers = ownOnly(property->qualifiers);
  }
  for (const auto& method : ownMethods_) {
    declared.methods.push_back(*method);
    declared.methods.back().qualifiers = ownOnly(method->qualifiers);
  }
  return declared;
}

ClassRepository::ClassRepository() = default;
ClassRepository::~ClassRepository() = default;

Expected<void, SchemaError> ClassRepository::add(QualifierType type, std::string_view file) {
  if (findQualifierType(type.name) != nullptr) {
    return unexpected(SchemaError{std::string(file), type.place.line, type.place.column,
                                  "qualifier " + quote(type.name) + " is declared a second time"});
  }
  auto added = std::make_unique<QualifierType>(std::move(type));
  qualifierOrder_.push_back(added.get());
  const std::string_view name = added->name;
  qualifierTypes_.emplace(name, std::move(added));
  return {};
}

Expected<void, SchemaError> ClassRepository::add(ClassDeclaration declaration, std::string_view file) {
  std::unique_ptr<Class> added;
  try {
    ClassBuilder builder(*this, declaration);
    added = builder.build();
    requireAtMost(kMostInheritedBytes, inheritedBytes_ + builder.inheritedBytes(),
                  "bytes of what it and the classes before it inherit", {"class", declaration.name}, declaration.place);
    inheritedBytes_ += builder.inheritedBytes();
  } catch (Refusal& refusal) {
    refusal.error.file = std::string(file);
    return unexpected(std::move(refusal.error));
  }
  if (const Class* above = added->superclass_) {
    classes_.find(above->name_)->second->subclasses_.push_back(added.get());
  }
  order_.push_back(added.get());
  const std::string_view name = added->name_;
  classes_.emplace(name, std::move(added));
  return {};
}

const Class* ClassRepository::find(std::string_view name) const noexcept {
  const auto found = classes_.find(name);
  return found == classes_.end() ? nullptr : found->second.get();
}

std::vector<const Class*> ClassRepository::subclasses(const Class* ancestor, bool deep) const {
  std::vector<const Class*> found;
  for (const Class* candidate : order_) {
    const bool fits = !deep                 ? candidate->superclass_ == ancestor
                      : ancestor == nullptr ? true
                                            : candidate != ancestor && candidate->isA(*ancestor);
    if (fits) found.push_back(candidate);
  }
  return found;
}

std::vector<const Class*> ClassRepository::associationsOf(const Class& source, const Class* ancestor) const {
  std::vector<const Class*> found;
  for (const Class* candidate : order_) {
    if (!candidate->isAssociation_ || candidate->isAbstract_) continue;
    if (ancestor != nullptr && !candidate->isA(*ancestor)) continue;
    const auto takesSource = [&](const ClassProperty* reference) { return source.isA(*reference->reference); };
    if (std::any_of(candidate->references_.begin(), candidate->references_.end(), takesSource)) {
      found.push_back(candidate);
    }
  }
  return found;
}

const QualifierType* ClassRepository::findQualifierType(std::string_view name) const noexcept {
  const auto found = qualifierTypes_.find(name);
  return found == qualifierTypes_.end() ? nullptr : found->second.get();
}

}  // namespace zorva::schema
