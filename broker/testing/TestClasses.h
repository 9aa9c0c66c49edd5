#pragma once

// The classes that TestProvider.cpp serves, for the tests of the broker.

#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "broker/core/BrokerOptions.h"
#include "schema/ClassRepository.h"
#include "schema/Mof.h"

namespace zorva::broker::testing {

inline constexpr const char* kTestClasses = R"mof(
Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
Qualifier Abstract : boolean = false, Scope(class, association, indication), Flavor(EnableOverride, Restricted);
Qualifier Association : boolean = false, Scope(association), Flavor(DisableOverride, ToSubclass);
Qualifier Override : string = null, Scope(property, reference, method), Flavor(EnableOverride, Restricted);
Qualifier EmbeddedInstance : string = null, Scope(property, method, parameter);
Qualifier Description : string = null, Scope(any), Flavor(EnableOverride, ToSubclass, Translatable);
Qualifier Write : boolean = false, Scope(property);
Qualifier MaxLen : uint32 = null, Scope(property, method, parameter);
Qualifier Values : string[], Scope(property, method, parameter), Flavor(EnableOverride, ToSubclass, Translatable);
Qualifier In : boolean = true, Scope(parameter), Flavor(DisableOverride, ToSubclass);
Qualifier Out : boolean = false, Scope(parameter), Flavor(DisableOverride, ToSubclass);
Qualifier Required : boolean = false, Scope(property, reference, method, parameter);
Qualifier Static : boolean = false, Scope(property, method), Flavor(DisableOverride, ToSubclass);

[Abstract] class T_Base { [Key, MaxLen(64)] string Name; };

[Description("A thing")] class T_Thing : T_Base {
  [Write, Values {"small", "large"}] uint16 Size;
  [Write] string Labels[];
  boolean Good; char16 Letter; datetime Since;
  uint8 Tiny = 5; sint8 STiny; sint16 SSmall; uint32 Wide; sint32 SWide; uint64 Huge; sint64 SHuge;
  real32 Rough; real64 Ratio;
  uint16 Numbers[];
  [Write, EmbeddedInstance("T_Thing")] string Inner;
  [Description("Says it again")] uint32 Echo([In, Description("What")] string Text, [In] uint16 Times,
                                             [In(false), Out] string Said, [In] T_Thing REF Target);
  uint32 Call([Required, In] string Text, [Required, In(false), Out] string Said);
  [Static] uint32 CallAll();
};
class T_SpecialThing : T_Thing { string Extra; };
class T_Other : T_Base { string Note; };
class T_Trouble : T_Base { string Note; };
class T_Calling : T_Base { string Note; };
class T_Absent : T_Base { string Note; };
class T_Unserved : T_Base { string Note; };
class T_Two { [Key] string First; [Key] uint32 Second; [Write] string Note; };
class T_Keyless { string Note; };

[Association, Abstract] class T_Link { [Key] T_Base REF Left; [Key] T_Base REF Right; };
[Association] class T_ThingOther : T_Link {
  [Override("Left")] T_Thing REF Left; [Override("Right")] T_Other REF Right; uint16 Rank; };
[Association] class T_ThingTrouble : T_Link {
  [Override("Left")] T_Thing REF Left; [Override("Right")] T_Trouble REF Right; };
[Association] class T_ThingAbsent : T_Link {
  [Override("Left")] T_Thing REF Left; [Override("Right")] T_Absent REF Right; };
)mof";

inline std::shared_ptr<const schema::ClassRepository> testClasses() {
  auto repository = std::make_shared<schema::ClassRepository>();
  schema::RepositorySink sink(*repository);
  const auto outcome = schema::parseMof(kTestClasses, "test.mof", sink);
  if (!outcome) throw std::runtime_error(outcome.error().text());
  return repository;
}

/// A provider of the test library that serves a class.
inline ProviderEntry testProvider(const std::string& className, const std::string& prefix, unsigned kinds) {
  return {className, prefix, "zorvabrokertestprovider", kinds};
}

/// The options of a broker with these providers only; `libraries` is the directory of the test library.
inline BrokerOptions testOptions(const std::string& libraries, const std::vector<ProviderEntry>& providers) {
  BrokerOptions options;
  options.registry = ProviderRegistry();
  for (const ProviderEntry& provider : providers) options.registry.add(provider);
  options.providerDirectory = libraries;
  return options;
}

}  // namespace zorva::broker::testing
