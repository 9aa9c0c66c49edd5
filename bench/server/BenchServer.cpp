// zorvacimd with the classes of the benchmark instead of its own.

#include <stdexcept>
#include <string>

#include "schema/Mof.h"
#include "server/BrokerLog.h"
#include "server/Daemon.h"

namespace {

constexpr const char* kClasses = R"mof(
Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
class Bench_Endpoint {
  [Key] string SystemCreationClassName; [Key] string SystemName; [Key] string CreationClassName; [Key] string Name;
  string ElementName; string Description; string Hostname; string DomainName; string OtherTypeDescription;
  uint16 EnabledState; uint16 RequestedState; uint16 ProtocolIFType; uint64 Speed; boolean AppendSuffixes;
  string Suffixes[];
  string Unset1; string Unset2; string Unset3; string Unset4; uint16 Unset5; uint16 Unset6; uint16 Unset7; uint16 Unset8;
  uint64 Unset9; uint64 Unset10; boolean Unset11; boolean Unset12; datetime Unset13; datetime Unset14;
  uint16 Unset15[]; uint16 Unset16[]; string Unset17[]; string Unset18[]; string Unset19[]; string Unset20[];
};
class Bench_Few : Bench_Endpoint {};
class Bench_Many : Bench_Endpoint {};
class Bench_TenThousand : Bench_Endpoint {};
)mof";

std::unique_ptr<zorva::broker::Broker> makeBroker(const zorva::server::Config&) {
  auto classes = std::make_shared<zorva::schema::ClassRepository>();
  zorva::schema::RepositorySink sink(*classes);
  const auto outcome = zorva::schema::parseMof(kClasses, "bench.mof", sink);
  if (!outcome) throw std::logic_error(outcome.error().text());
  zorva::broker::BrokerOptions options;
  options.registry = zorva::broker::ProviderRegistry();
  for (const char* name : {"Bench_Few", "Bench_Many", "Bench_TenThousand"}) {
    options.registry.add({name, "Bench", "zorvabenchprovider", zorva::broker::InstanceMi});
  }
  options.providerDirectory = ZORVA_LIB_DIR;
  options.log = zorva::server::logBrokerLine;
  return std::make_unique<zorva::broker::Broker>(classes, std::move(options));
}

}  // namespace

int main(int argc, char** argv) { return zorva::server::runServer(argc, argv, makeBroker); }
