#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "schema/Declarations.h"
#include "util/Names.h"

// The classes of a namespace with everything that they inherit, and the questions that a broker or a server asks of
// them.
//
// Names are taken in any case and given back in the schema's own spelling. A ClassRepository is filled first (add) by
// one thread; from then on its const functions, and those of its classes, may be called by any number of threads. All
// pointers that it hands out stay good as long as the repository lives.

namespace zorva::schema {

class Class;

/// A property as a class has it: own, overridden or inherited. Inherited ones are shared with the class that declares
/// them: where `origin` is not the class at hand, the property and all its qualifiers are propagated, whatever the
/// qualifiers' own marks say, which are those at `origin`.
struct ClassProperty : Property {
  const Class* origin = nullptr;     ///< the class at hand or the nearest above it that declares or overrides it
  const Class* reference = nullptr;  ///< the class of a reference; null for other types
  bool isKey = false;
  const ClassProperty* bequeathed = nullptr;  ///< what subclasses see, where Restricted qualifiers hide; null: this
};

/// A method as a class has it, shared in the same way.
struct ClassMethod : Method {
  const Class* origin = nullptr;
  const ClassMethod* bequeathed = nullptr;
};

/// A class with all that it inherits (DSP0004 5.1.2). Immutable.
class Class {
 public:
  Class(const Class&) = delete;
  Class& operator=(const Class&) = delete;
  ~Class();

  const std::string& name() const noexcept { return name_; }

  /// Null for a class without one.
  const Class* superclass() const noexcept { return superclass_; }

  /// Its own qualifiers and those that it inherits (marked propagated); each has its value and flavor.
  const Qualifiers& qualifiers() const noexcept { return qualifiers_; }

  /// Inherited ones first, in the order of their first declaration, root first; overridden ones in their old place.
  const std::vector<const ClassProperty*>& properties() const noexcept { return properties_; }
  const std::vector<const ClassMethod*>& methods() const noexcept { return methods_; }

  /// The key properties, in the order of properties(). Empty for a class that has none.
  const std::vector<const ClassProperty*>& keys() const noexcept { return keys_; }

  /// The reference properties, in the order of properties(). Empty for what is no association.
  const std::vector<const ClassProperty*>& references() const noexcept { return references_; }

  /// Null where the class has no such property or method.
  const ClassProperty* findProperty(std::string_view name) const noexcept;
  const ClassMethod* findMethod(std::string_view name) const noexcept;

  bool isAssociation() const noexcept { return isAssociation_; }
  bool isAbstract() const noexcept { return isAbstract_; }

  /// True for the class itself and every class below `ancestor`.
  bool isA(const Class& ancestor) const noexcept;
  /// The same by name; false for a name that no class in the chain has.
  bool isA(std::string_view ancestor) const noexcept;

  /// The classes that name this one as their superclass, in the order in which they were added.
  const std::vector<const Class*>& subclasses() const noexcept { return subclasses_; }

  /// What the class itself declares, without what it inherits: for writing it down (writeMof).
  ClassDeclaration declaration() const;

 private:
  friend class ClassRepository;
  friend class ClassBuilder;
  Class() = default;

  std::string name_;
  const Class* superclass_ = nullptr;
  Qualifiers qualifiers_;
  std::vector<std::unique_ptr<ClassProperty>> ownProperties_;
  // Twins, without the Restricted qualifiers, of own elements that have such; other elements are shared as they are.
  std::vector<std::unique_ptr<ClassProperty>> bequeathedProperties_;
  std::vector<std::unique_ptr<ClassMethod>> ownMethods_;
  std::vector<std::unique_ptr<ClassMethod>> bequeathedMethods_;
  std::vector<const ClassProperty*> properties_;
  std::vector<std::uint32_t> propertyHashes_;  // util::nameHash of properties_[i]->name: a look-up compares few names
  std::vector<const ClassMethod*> methods_;
  std::vector<const ClassProperty*> keys_;
  std::vector<const ClassProperty*> references_;
  std::vector<const Class*> subclasses_;
  bool isAssociation_ = false;
  bool isAbstract_ = false;
};

/// The classes and qualifier types of one namespace (several namespaces may share one repository).
class ClassRepository {
 public:
  ClassRepository();
  ~ClassRepository();
  ClassRepository(const ClassRepository&) = delete;
  ClassRepository& operator=(const ClassRepository&) = delete;

  /// Adds a qualifier type. Refused where one of that name is there. `file` goes into the error.
  std::optional<SchemaError> add(QualifierType type, std::string_view file = {});

  /// Adds a class and works out what it inherits. Everything that it names must be there already: its superclass, the
  /// classes of its references and the types of its qualifiers (a class may refer to itself). Refused, with the
  /// repository unchanged, are: a class that is there already; a missing superclass or class of a reference; a
  /// qualifier without a type, with a value of another type, out of its scope, or twice on an element; an override that
  /// changes type, arrayness or the value of a DisableOverride qualifier, that lacks the Override qualifier, or that
  /// names nothing to override; a further key below a class with keys; a reference in what is no association; more than
  /// 1,000 properties or methods, 250 qualifiers or parameters, or 100 classes in a chain.
  std::optional<SchemaError> add(ClassDeclaration declaration, std::string_view file = {});

  /// Null where there is no such class.
  const Class* find(std::string_view name) const noexcept;

  /// All classes in the order in which they were added; each stands after its superclass.
  const std::vector<const Class*>& classes() const noexcept { return order_; }

  /// The classes below `ancestor`: direct ones, or with `deep` all, each before those below it. Without `ancestor`: the
  /// classes that have no superclass, or with `deep` all classes.
  std::vector<const Class*> subclasses(const Class* ancestor, bool deep) const;

  /// The associations that are not abstract and have a reference that an object of class `source` can stand at.
  /// `ancestor`: only it and the associations below it; null: all. In the order of classes(). An abstract class stands
  /// for those below it, so this is the list of concrete names that an omitted or a superclass AssocClass means.
  std::vector<const Class*> associationsOf(const Class& source, const Class* ancestor = nullptr) const;

  /// Null where there is no such qualifier type.
  const QualifierType* findQualifierType(std::string_view name) const noexcept;
  /// All qualifier types, in the order in which they were added.
  const std::vector<const QualifierType*>& qualifierTypes() const noexcept { return qualifierOrder_; }

 private:
  std::unordered_map<std::string_view, std::unique_ptr<Class>, util::NameHash, util::NameEqual>
      classes_;  // keys: the classes' names
  std::unordered_map<std::string_view, std::unique_ptr<QualifierType>, util::NameHash, util::NameEqual> qualifierTypes_;
  std::vector<const Class*> order_;
  std::vector<const QualifierType*> qualifierOrder_;
  std::size_t inheritedBytes_ = 0;
};

}  // namespace zorva::schema
