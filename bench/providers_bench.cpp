// The cost of the providers by the number of objects, through the broker, as a client of zorvactl sees it.

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <string>
#include <thread>
#include <variant>
#include <vector>

#include "agent/Agent.h"
#include "bench/StraightEndpoints.h"
#include "broker/Broker.h"
#include "schema/Schema.h"
#include "util/NotCopied.h"

namespace {

namespace fs = std::filesystem;

// A directory of this process with a configuration and a tree of interfaces, which the agent reads from then on.
class BenchHost : zorva::util::NotCopied {
 public:
  BenchHost() {
    std::string name = (fs::temp_directory_path() / "zorva-bench-XXXXXX").string();
    if (::mkdtemp(name.data()) == nullptr) throw std::runtime_error("no temporary directory");
    directory_ = name;
    fs::create_directory(directory_ / "data");
  }
  ~BenchHost() { fs::remove_all(directory_); }

  fs::path dataFile(int interface) const { return directory_ / "data" / ("ifcfg-eth" + std::to_string(interface)); }

  // Each interface has one address and one suffix; all interfaces have the same servers.
  void use(int interfaces, int servers) {
    std::ofstream tree(directory_ / "tree.json");
    tree << R"({"system_name":"host1","nodes":[{"type":"System","name":"system","description":"Computer","children":[)";
    for (int i = 0; i < interfaces; ++i) {
      tree << (i == 0 ? "" : ",") << R"({"type":"Port","name":"eth)" << i
           << R"(","description":"","children":[{"type":"NetworkIPConfig","name":"ip","description":"","properties":{)"
           << R"("name":"eth)" << i << R"(","host_name":"host1","domain_name":"example.org",)"
           << R"("dns_suffixes":["example.org"],"dns_server_addresses":[)";
      for (int s = 0; s < servers; ++s) {
        tree << (s == 0 ? "" : ",") << "\"192.0." << s / 250 << "." << s % 250 + 1 << '"';
      }
      tree << R"(],"protocol_if_type":4097,"enabled_state":1,)"
           << R"("addresses":[{"address":"10.)" << i / 62500 << "." << i / 250 % 250 << "." << i % 250 + 1
           << R"(","prefix_length":8,"origin":"static"}]}}]})";
    }
    tree << "]}]}";
    tree.close();
    std::ofstream(directory_ / "agent.toml")
        << "[agent]\ndata_dir = \"data/\"\n[tree]\nsource = \"file\"\nfile = \"tree.json\"\n[log]\ntarget = \"off\"\n";
    zorva::agent::loadConfig((directory_ / "agent.toml").string());
    // The first look at a file that was written just now is not the last one.
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }

 private:
  fs::path directory_;
};

zorva::broker::Broker& theBroker() {
  static zorva::broker::Broker broker(zorva::schema::loadBuiltInClasses(), [] {
    zorva::broker::BrokerOptions options;
    options.providerDirectory = ZORVA_LIB_DIR;
    return options;
  }());
  return broker;
}

void enumerate(zorva::broker::Broker& broker, const char* className, const zorva::broker::InstanceSink& sink) {
  const zorva::broker::Status status = broker.enumerateInstances("", className, {}, sink);
  if (status.rc != 0) throw std::runtime_error(status.message);
}

std::size_t countOf(zorva::broker::Broker& broker, const char* className) {
  std::size_t count = 0;
  enumerate(broker, className, [&](const zorva::broker::Instance&) {
    ++count;
    return true;
  });
  return count;
}

std::size_t enumerateInstances(const char* className) { return countOf(theBroker(), className); }

void run(benchmark::State& state, const char* className, std::size_t expected) {
  enumerateInstances(className);  // reads the tree, which does not change afterwards
  for (auto _ : state) {
    if (enumerateInstances(className) != expected) state.SkipWithError("wrong number of instances");
  }
  state.SetItemsProcessed(static_cast<std::int64_t>(expected) * state.iterations());
}

constexpr const char* kEndpoints = "ZORVA_DNSProtocolEndPoint";

void Endpoints(benchmark::State& state) {
  BenchHost host;
  host.use(static_cast<int>(state.range(0)), 2);
  run(state, kEndpoints, static_cast<std::size_t>(state.range(0)));
}
BENCHMARK(Endpoints)->Arg(100)->Arg(1000)->Arg(10000)->Unit(benchmark::kMillisecond);

std::vector<zorva::broker::Instance> instancesOf(zorva::broker::Broker& broker) {
  std::vector<zorva::broker::Instance> instances;
  enumerate(broker, kEndpoints, [&](const zorva::broker::Instance& instance) {
    instances.push_back(instance);
    return true;
  });
  return instances;
}

// The same instances by a program that only makes the calls of CMPI.
void StraightEndpoints(benchmark::State& state) {
  static zorva::broker::Broker broker(zorva::schema::loadBuiltInClasses(), straightEndpoints());
  const auto count = static_cast<std::size_t>(state.range(0));
  BenchHost host;
  host.use(static_cast<int>(count), 2);
  setStraightEndpoints(count);
  if (instancesOf(broker) != instancesOf(theBroker())) return state.SkipWithError("other instances");
  for (auto _ : state) {
    if (countOf(broker, kEndpoints) != count) state.SkipWithError("wrong number of instances");
  }
}
BENCHMARK(StraightEndpoints)->Arg(1000)->Unit(benchmark::kMillisecond);

// Servers by endpoints.
void RemoteAccess(benchmark::State& state) {
  BenchHost host;
  host.use(static_cast<int>(state.range(1)), static_cast<int>(state.range(0)));
  run(state, "ZORVA_RemoteAccessAvailableToElement", static_cast<std::size_t>(state.range(0) * state.range(1)));
}
BENCHMARK(RemoteAccess)->Args({8, 32})->Args({64, 256})->Unit(benchmark::kMillisecond);

constexpr int kFiles = 1000;

void writeFiles(const BenchHost& host) {
  for (int i = 0; i < kFiles; ++i) {
    std::ofstream(host.dataFile(i)) << "BOOTPROTO=dhcp\nDOMAINNAME=example.org\nHOSTNAME=host1\nCONFIG_NAME=lab\n"
                                    << "DNSSERVERS=192.0.2.1 192.0.2.2 \nDNSSUFFIXES=example.org \n";
  }
}

void SettingDataFromFiles(benchmark::State& state) {
  BenchHost host;
  host.use(kFiles, 2);
  writeFiles(host);
  run(state, "ZORVA_DNSSettingData", kFiles);
}
BENCHMARK(SettingDataFromFiles)->Unit(benchmark::kMillisecond);

// The least work for reading four keys of each file.
void FourPassesOverFiles(benchmark::State& state) {
  BenchHost host;
  host.use(kFiles, 2);
  writeFiles(host);
  std::array<char, 4096> buffer{};
  for (auto _ : state) {
    for (int pass = 0; pass < 4; ++pass) {
      for (int i = 0; i < kFiles; ++i) {
        const std::string path = host.dataFile(i).string();
        struct stat status {};
        if (::stat(path.c_str(), &status) != 0) state.SkipWithError("no file");
        const int file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
        while (::read(file, buffer.data(), buffer.size()) > 0) {
        }
        ::close(file);
      }
    }
  }
}
BENCHMARK(FourPassesOverFiles)->Unit(benchmark::kMillisecond);

// All eight associations by the number of interfaces.
void Association(benchmark::State& state, const char* className) {
  BenchHost host;
  host.use(static_cast<int>(state.range(0)), 2);
  run(state, className, enumerateInstances(className));
}
#define ASSOCIATION_BENCHMARK(name) \
  BENCHMARK_CAPTURE(Association, name, "ZORVA_" #name)->Arg(8)->Arg(64)->Arg(512)->Unit(benchmark::kMillisecond)
ASSOCIATION_BENCHMARK(RemoteAccessAvailableToElement);
ASSOCIATION_BENCHMARK(DNSSAPSAPDependency);
ASSOCIATION_BENCHMARK(DNSHostedAccessPoint);
ASSOCIATION_BENCHMARK(DNSGeneralElementSettingData);
ASSOCIATION_BENCHMARK(DNSGenEndPointElementSettingData);
ASSOCIATION_BENCHMARK(DNSEndPointElementSettingData);
ASSOCIATION_BENCHMARK(DNSGenOrderedComponent);
ASSOCIATION_BENCHMARK(DNSOrderedComponent);

// --- The table: each class, and each association from one source, by the number of interfaces.

const zorva::broker::ObjectPath& referenceOf(const zorva::broker::Instance& instance, std::size_t number) {
  for (const zorva::broker::Property& property : instance.properties) {
    if (property.value.type != zorva::schema::Type::Reference || number-- != 0) continue;
    return *std::get<zorva::broker::Boxed<zorva::broker::ObjectPath>>(property.value.scalar);
  }
  throw std::runtime_error(instance.path.className + " has no such reference");
}

void TableOfClass(benchmark::State& state, const char* className) {
  BenchHost host;
  host.use(static_cast<int>(state.range(0)), 2);
  const std::size_t results = enumerateInstances(className);
  run(state, className, results);
  state.counters["results"] = static_cast<double>(results);
}

// The associators of the first instance's reference with that number.
void TableFromOne(benchmark::State& state, const char* className, std::size_t reference) {
  BenchHost host;
  host.use(static_cast<int>(state.range(0)), 2);
  zorva::broker::ObjectPath source;
  enumerate(theBroker(), className, [&](const zorva::broker::Instance& instance) {
    source = referenceOf(instance, reference);
    return false;
  });
  zorva::broker::AssociationFilter filter;
  filter.associationClass = className;
  std::size_t results = 0;
  for (auto _ : state) {
    results = 0;
    const zorva::broker::Status status =
        theBroker().associators(source, filter, {}, [&](const zorva::broker::Instance&) { return ++results != 0; });
    if (status.rc != 0) state.SkipWithError(status.message.c_str());
  }
  state.counters["results"] = static_cast<double>(results);
}

struct TableRow {
  const char* className;
  std::int64_t most;  ///< more interfaces take minutes: all endpoints are compared with all setting data
  bool isAssociation;
};
constexpr TableRow kTable[] = {
    {kEndpoints, 10000, false},
    {"ZORVA_RemoteServiceAccessPoint", 10000, false},
    {"ZORVA_DNSSettingData", 10000, false},
    {"ZORVA_DNSGeneralSettingData", 10000, false},
    {"ZORVA_RemoteAccessAvailableToElement", 10000, true},
    {"ZORVA_DNSSAPSAPDependency", 10000, true},
    {"ZORVA_DNSHostedAccessPoint", 10000, true},
    {"ZORVA_DNSGeneralElementSettingData", 10000, true},
    {"ZORVA_DNSGenEndPointElementSettingData", 10000, true},
    {"ZORVA_DNSEndPointElementSettingData", 1000, true},
    {"ZORVA_DNSGenOrderedComponent", 10000, true},
    {"ZORVA_DNSOrderedComponent", 1000, true},
};

void registerTable() {
  for (const TableRow& row : kTable) {
    const std::string name = row.className;
    auto* ofClass = benchmark::RegisterBenchmark(("Table/" + name).c_str(), TableOfClass, row.className);
    std::vector<benchmark::internal::Benchmark*> all = {ofClass};
    for (std::size_t reference = 0; row.isAssociation && reference < 2; ++reference) {
      all.push_back(benchmark::RegisterBenchmark(("TableFromOne/" + name + "/" + std::to_string(reference)).c_str(),
                                                 TableFromOne, row.className, reference));
    }
    for (auto* each : all) {
      for (std::int64_t interfaces = 10; interfaces <= (each == ofClass ? row.most : 10000); interfaces *= 10) {
        each->Arg(interfaces);
      }
    }
  }
}

}  // namespace

int main(int argc, char** argv) {
  registerTable();
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  return 0;
}
