#pragma once

// The association providers: which objects belong together. tests/conformance/ has the order of their calls, their log
// lines and how they end.

#include <string>
#include <vector>

#include "tests/support/Matchers.h"
#include "tests/support/Providers.h"
#include "tests/support/RecordingBroker.h"
#include "tests/support/RecordingLogger.h"
#include "tests/support/World.h"

namespace ZV::Test {

using Names = std::vector<std::string>;

/// The text that identifies an object: its Name or InstanceID, or its class if it has no keys.
inline std::string nameOf(const Path& path) {
  if (path.keys.empty()) return path.className;
  return (path["InstanceID"].isNull() ? path["Name"] : path["InstanceID"]).text();
}

/// One association provider on a world that the test fills and installs.
class AssociationTest : public ::testing::Test {
 protected:
  explicit AssociationTest(const std::string& prefix) : AssociationTest(*findProvider(prefix)) {}
  explicit AssociationTest(const Provider& provider)
      : under(provider), instances(under.createInstanceMI, broker), associations(under.createAssociationMI, broker) {}

  /// The broker serves these objects of another provider's class.
  void serve(const char* className, Path (*pathOf)(const std::string&), const Names& names) {
    std::vector<Path> paths;
    for (const std::string& name : names) paths.push_back(pathOf(name));
    broker.serve(className, objectsOf(paths));
  }

  Path associationClass() const { return Path(under.className); }
  Path pairOf(const Path& left, const Path& right) const {
    return associationClass().key(under.leftRole, ref(left)).key(under.rightRole, ref(right));
  }

  /// Associations as `left > right`, each end by its name, in the order in which a request gave them.
  Names pairsIn(const Outcome& outcome) const {
    Names all;
    const auto add = [&](const Value& left, const Value& right) {
      all.push_back(nameOf(left.path()) + " > " + nameOf(right.path()));
    };
    for (const Path& path : outcome.paths()) add(path[under.leftRole], path[under.rightRole]);
    for (const Instance& one : outcome.instances()) add(one[under.leftRole], one[under.rightRole]);
    return all;
  }
  /// Objects by their names.
  static Names namesIn(const Outcome& outcome) {
    Names all;
    for (const Path& path : outcome.paths()) all.push_back(nameOf(path));
    for (const Instance& one : outcome.instances()) all.push_back(nameOf(one.path));
    return all;
  }

  /// The pairs that EnumInstances and EnumInstanceNames give.
  Names built() { return pairsIn(instances.enumerateInstances(associationClass())); }
  Names named() { return pairsIn(instances.enumerateInstanceNames(associationClass())); }
  /// Both, if they agree.
  Names enumerated() {
    const Names all = built();
    EXPECT_EQ(all, named());
    return all;
  }
  /// Whether GetInstance finds the pair.
  bool isFound(const Path& left, const Path& right) {
    return instances.getInstance(pairOf(left, right)).instances().size() == 1;
  }

  /// The far ends that Associators and AssociatorNames give, which have to agree.
  Names associated(const Path& source, const AssociationQuery& query = {}) {
    const Names all = namesIn(associations.associators(source, query));
    EXPECT_EQ(all, namesIn(associations.associatorNames(source, query)));
    return all;
  }
  /// The pairs that References and ReferenceNames give, which have to agree.
  Names referred(const Path& source) {
    const Names all = pairsIn(associations.references(source));
    EXPECT_EQ(all, pairsIn(associations.referenceNames(source)));
    return all;
  }

  const Provider& under;
  RecordingLogger logger;
  World world;
  RecordingBroker broker;
  InstanceProvider instances;
  AssociationProvider associations;
};

}  // namespace ZV::Test
