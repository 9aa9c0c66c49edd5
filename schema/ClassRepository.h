#pragma once

// The classes of a namespace with all inherited elements, and the queries that a broker or a server needs.
//
// Names are accepted in any case and returned in the schema's own spelling. A ClassRepository is first filled (add) by
// one thread. From then on its const functions, and those of its classes, may be called by any number of threads. All
// returned pointers are valid as long as the repository lives.

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "schema/Declarations.h"
#include "util/Expected.h"
#include "util/Names.h"
#include "util/NotCopied.h"

namespace zorva::schema {

class Class;

/// A property of a class: own, overridden or inherited. Inherited ones are shared with the class that declares them: if
/// `origin` is another class, the property and all its qualifiers are propagated, independent of the qualifiers' own
/// marks, which are those at `origin`.
struct ClassProperty : Property {
  const Class* origin = nullptr;     ///< the class itself or the nearest superclass that declares or overrides it
  const Class* reference = nullptr;  ///< the class of a reference; null for other types
  bool isKey = false;
  const ClassProperty* bequeathed =
      nullptr;  ///< the property that subclasses see, if it has Restricted qualifiers; null: this one
};

/// A method of a class, shared in the same way.
struct ClassMethod : Method {
  const Class* origin = nullptr;
  const ClassMethod* bequeathed = nullptr;
};

/// A class with all its inherited elements (DSP0004 5.1.2). Immutable.
class Class : util::NotCopied {
 public:
  ~Class();

  const std::string& name() const noexcept { return name_; }

  /// Null for a class without one.
  const Class* superclass() const noexcept { return superclass_; }

  /// Its own qualifiers and the inherited ones (marked propagated); each has its value and flavor.
  const Qualifiers& qualifiers() const noexcept { return qualifiers_; }

  /// Inherited ones first, in the order of their first declaration, root first; an overridden one keeps its place.
  const std::vector<const ClassProperty*>& properties() const noexcept { return properties_; }
  const std::vector<const ClassMethod*>& methods() const noexcept { return methods_; }

  /// The key properties, in the order of properties(). Empty for a class that has none.
  const std::vector<const ClassProperty*>& keys() const noexcept { return keys_; }

  /// The reference properties, in the order of properties(). Empty if the class is no association.
  const std::vector<const ClassProperty*>& references() const noexcept { return references_; }

  /// Null if the class has no such property or method.
  const ClassProperty* findProperty(std::string_view name) const noexcept;
  const ClassMethod* findMethod(std::string_view name) const noexcept;

  bool isAssociation() const noexcept { return isAssociation_; }

  /// True for the class itself and every class below `ancestor`.
  bool isA(const Class& ancestor) const noexcept;
  /// The same by name; false if no class in the chain has that name.
  bool isA(std::string_view ancestor) const noexcept;

  /// The classes that name this one as their superclass, in the order in which they were added.
  const std::vector<const Class*>& subclasses() const noexcept { return subclasses_; }

  /// The class's own declarations, without inherited ones, for writeMof.
  ClassDeclaration declaration() const;

 private:
  friend class ClassRepository;
  friend class ClassBuilder;
  Class() = default;

  std::string name_;
  const Class* superclass_ = nullptr;
  Qualifiers qualifiers_;
  std::vector<std::unique_ptr<ClassProperty>> ownProperties_;
  /// Copies, without the Restricted qualifiers, of own elements that have such; other elements are shared.
  std::vector<std::unique_ptr<ClassProperty>> bequeathedProperties_;
  std::vector<std::unique_ptr<ClassMethod>> ownMethods_;
  std::vector<std::unique_ptr<ClassMethod>> bequeathedMethods_;
  std::vector<const ClassProperty*> properties_;
  std::vector<std::uint32_t> propertyHashes_;  ///< util::nameHash of properties_[i]->name: a look-up compares few names
  std::vector<const ClassMethod*> methods_;
  std::vector<const ClassProperty*> keys_;
  std::vector<const ClassProperty*> references_;
  std::vector<const Class*> subclasses_;
  bool isAssociation_ = false;
  bool isAbstract_ = false;
};

/// The classes and qualifier types of one namespace (several namespaces may share one repository).
class ClassRepository : util::NotCopied {
 public:
  ClassRepository();
  ~ClassRepository();

  /// Adds a qualifier type. Refused if the name exists. `file` is used in the error.
  Expected<void, SchemaError> add(QualifierType type, std::string_view file = {});

  /// Adds a class and computes its inherited elements. Everything that it names must exist already: its superclass, the
  /// classes of its references and the types of its qualifiers (a class may refer to itself). Refused, with the
  /// repository unchanged, are: a class that exists already; a missing superclass or class of a reference; a qualifier
  /// without a type, with a value of another type, out of its scope, or twice on an element; an override that changes
  /// type, arrayness or the value of a DisableOverride qualifier, that lacks the Override qualifier, or that names
  /// nothing to override; a further key below a class with keys; a reference in a class that is no association; more
  /// than 1,000 properties or methods, 250 qualifiers or parameters, or 100 classes in a chain.
  Expected<void, SchemaError> add(ClassDeclaration declaration, std::string_view file = {});

  /// Null if there is no such class.
  const Class* find(std::string_view name) const noexcept;

  /// All classes in the order in which they were added; each comes after its superclass.
  const std::vector<const Class*>& classes() const noexcept { return order_; }

  /// The subclasses of `ancestor`: direct ones, or with `deep` all, each before its own subclasses. Without `ancestor`:
  /// the classes that have no superclass, or with `deep` all classes.
  std::vector<const Class*> subclasses(const Class* ancestor, bool deep) const;

  /// The associations that are not abstract and have a reference that can refer to an object of class `source`.
  /// `ancestor`: only it and its subclasses; null: all. In the order of classes(). An omitted AssocClass, or a
  /// superclass, means this list of concrete classes.
  std::vector<const Class*> associationsOf(const Class& source, const Class* ancestor = nullptr) const;

  /// Null if there is no such qualifier type.
  const QualifierType* findQualifierType(std::string_view name) const noexcept;
  /// All qualifier types, in the order in which they were added.
  const std::vector<const QualifierType*>& qualifierTypes() const noexcept { return qualifierOrder_; }

 private:
  std::unordered_map<std::string_view, std::unique_ptr<Class>, util::NameHash, util::NameEqual>
      classes_;  ///< keys: the classes' names
  std::unordered_map<std::string_view, std::unique_ptr<QualifierType>, util::NameHash, util::NameEqual> qualifierTypes_;
  std::vector<const Class*> order_;
  std::vector<const QualifierType*> qualifierOrder_;
  std::size_t inheritedBytes_ = 0;
};

}  // namespace zorva::schema
