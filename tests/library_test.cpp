// The provider library as a CIM server uses it: a file that is loaded, searched for its create functions and unloaded.

#include <dlfcn.h>
#include <gmock/gmock.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>
#include <set>
#include <sstream>

#include "tests/support/ProviderCall.h"
#include "util/NotCopied.h"

namespace ZV::Test {
namespace {

using ::testing::IsEmpty;

const std::string kLibrary = ZORVA_LIB_DIR "/libzorvadnsclientprofileprovider.so.1";
const std::string kAgent = ZORVA_LIB_DIR "/libzorvagent.so.1";

const std::set<std::string> kCreateFunctions = {
    "DNSClientProvider_Create_InstanceMI",
    "DNSClientProvider_Create_MethodMI",
    "DNSRemoteServiceAccessPointProvider_Create_InstanceMI",
    "DNSSettingDataProvider_Create_InstanceMI",
    "DNSGeneralSettingDataProvider_Create_InstanceMI",
    "DNSRemoteAccessAvailableToElementProvider_Create_InstanceMI",
    "DNSRemoteAccessAvailableToElementProvider_Create_AssociationMI",
    "DNSSAPSAPDependencyProvider_Create_InstanceMI",
    "DNSSAPSAPDependencyProvider_Create_AssociationMI",
    "DNSHostedAccessPointProvider_Create_InstanceMI",
    "DNSHostedAccessPointProvider_Create_AssociationMI",
    "DNSGeneralElementSettingDataProvider_Create_InstanceMI",
    "DNSGeneralElementSettingDataProvider_Create_AssociationMI",
    "DNSGenEndPointElementSettingDataProvider_Create_InstanceMI",
    "DNSGenEndPointElementSettingDataProvider_Create_AssociationMI",
    "DNSEndPointElementSettingDataProvider_Create_InstanceMI",
    "DNSEndPointElementSettingDataProvider_Create_AssociationMI",
    "DNSGeneralOrderedComponentProvider_Create_InstanceMI",
    "DNSGeneralOrderedComponentProvider_Create_AssociationMI",
    "DNSOrderedComponentProvider_Create_InstanceMI",
    "DNSOrderedComponentProvider_Create_AssociationMI",
};

// The output lines of a command.
std::vector<std::string> linesOf(const std::string& command) {
  const std::unique_ptr<std::FILE, int (*)(std::FILE*)> pipe(::popen(command.c_str(), "r"), ::pclose);
  if (pipe == nullptr) throw std::runtime_error("cannot run " + command);
  std::string output;
  for (int c = std::fgetc(pipe.get()); c != EOF; c = std::fgetc(pipe.get())) output += static_cast<char>(c);
  std::vector<std::string> lines;
  std::istringstream in(output);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

// A library, loaded by the constructor and unloaded by the destructor.
class Loaded : zorva::util::NotCopied {
 public:
  Loaded() : handle_(::dlopen(kLibrary.c_str(), RTLD_NOW | RTLD_LOCAL)) {
    if (handle_ == nullptr) throw std::runtime_error(::dlerror());
  }
  ~Loaded() { EXPECT_EQ(0, ::dlclose(handle_)); }

  template <typename Function>
  Function find(const std::string& name) const {
    return reinterpret_cast<Function>(::dlsym(handle_, name.c_str()));
  }

 private:
  void* handle_;
};

bool isLoaded(const std::string& library) {
  void* const handle = ::dlopen(library.c_str(), RTLD_NOW | RTLD_NOLOAD);
  if (handle == nullptr) return false;
  ::dlclose(handle);
  return true;
}

std::ptrdiff_t openFiles() {
  const std::filesystem::directory_iterator files("/proc/self/fd");
  return std::distance(begin(files), end(files));
}

TEST(Library, ExportsItsCreateFunctionsAndNothingElse) {
  std::set<std::string> exported;
  for (const std::string& line : linesOf("nm -D --defined-only '" + kLibrary + "'")) {
    exported.insert(line.substr(line.rfind(' ') + 1));
  }
  EXPECT_EQ(kCreateFunctions, exported);
  EXPECT_EQ(21U, exported.size());
}

TEST(Library, NeedsTheAgentAndTheLanguageAlone) {
  std::vector<std::string> others;
  bool needsTheAgent = false;
  for (const std::string& line : linesOf("readelf -d -W '" + kLibrary + "'")) {
    if (line.find("(NEEDED)") == std::string::npos) continue;
    const std::size_t start = line.find('[') + 1;
    const std::string name = line.substr(start, line.find(']') - start);
    needsTheAgent = needsTheAgent || name == "libzorvagent.so.1";
    bool isOfTheLanguage = name == "libzorvagent.so.1";
    for (const char* family : {"libstdc++.so.", "libgcc_s.so.", "libc.so.", "libm.so.", "ld-linux",  //
                               "libasan.so.", "libubsan.so.", "libtsan.so."}) {
      isOfTheLanguage = isOfTheLanguage || name.starts_with(family);
    }
    if (!isOfTheLanguage) others.push_back(name);
  }
  EXPECT_TRUE(needsTheAgent);
  EXPECT_THAT(others, IsEmpty());
}

TEST(Library, CarriesItsNameAndVersion) {
  bool isNamed = false;
  for (const std::string& line : linesOf("readelf -d -W '" + kLibrary + "'")) {
    isNamed = isNamed || (line.find("(SONAME)") != std::string::npos &&
                          line.find("[libzorvadnsclientprofileprovider.so.1]") != std::string::npos);
  }
  EXPECT_TRUE(isNamed);
}

// The first three words of every MI's function table are the same.
struct AnyMI {
  void* hdl;
  const struct {
    CMPISint32 ftVersion;
    CMPISint32 miVersion;
    const char* miName;
  } * ft;
};
using AnyCreate = const AnyMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

TEST(Library, EachCreateFunctionIsFoundByItsNameAndNeedsNoStatus) {
  const Loaded library;
  for (const std::string& name : kCreateFunctions) {
    const auto create = library.find<AnyCreate>(name);
    ASSERT_NE(nullptr, create) << name;
    const AnyMI* const mi = create(nullptr, nullptr, nullptr);
    ASSERT_NE(nullptr, mi) << name;
    // "Association", "Instance" or "Method" after the last "_Create_", in small letters before the prefix
    const std::size_t end = name.rfind("_Create_");
    std::string kind = name.substr(end + 8, name.size() - end - 8 - 2);
    kind[0] = static_cast<char>(std::tolower(static_cast<unsigned char>(kind[0])));
    EXPECT_EQ(kind + name.substr(0, end), mi->ft->miName);
    EXPECT_EQ(200, mi->ft->ftVersion);
    EXPECT_EQ(nullptr, mi->hdl);
  }
}

TEST(Library, IsGoneWhenItIsUnloadedAHundredTimes) {
  const std::ptrdiff_t filesBefore = openFiles();
  for (int i = 0; i < 100; ++i) {
    {
      const Loaded library;
      ASSERT_TRUE(isLoaded(kLibrary));
      ASSERT_TRUE(isLoaded(kAgent));
      for (const std::string& name : kCreateFunctions) {
        ASSERT_NE(nullptr, library.find<AnyCreate>(name)(nullptr, nullptr, nullptr));
      }
    }
    ASSERT_FALSE(isLoaded(kLibrary)) << i;
    ASSERT_FALSE(isLoaded(kAgent)) << i;
  }
  EXPECT_EQ(filesBefore, openFiles());
}

// A host of two interfaces in a file, which the agent of the loaded library reads.
class HostInAFile : zorva::util::NotCopied {
 public:
  HostInAFile() {
    std::string path = (std::filesystem::temp_directory_path() / "zorva-library-XXXXXX").string();
    if (::mkdtemp(path.data()) == nullptr) throw std::runtime_error("no directory can be made as " + path);
    directory_ = path;
    std::ofstream(path + "/tree.json") << R"({ "system_name": "host1", "nodes": [
      { "type": "System", "name": "system", "description": "Computer", "children": [
        { "type": "Port", "name": "eth0", "description": "", "children": [
          { "type": "NetworkIPConfig", "name": "ip", "description": "",
            "properties": { "name": "eth0", "dns_server_addresses": ["192.0.2.53"] } } ] },
        { "type": "Port", "name": "eth1", "description": "", "children": [
          { "type": "NetworkIPConfig", "name": "ip", "description": "", "properties": { "name": "eth1" } } ] } ] } ] })";
    std::ofstream(path + "/agent.toml") << "[agent]\ndata_dir = \"" << path << "/\"\n[tree]\nsource = \"file\"\n"
                                        << "file = \"" << path << "/tree.json\"\n[log]\ntarget = \"off\"\n";
    ::setenv("ZORVAGENT_CONFIG", (path + "/agent.toml").c_str(), 1);
  }
  ~HostInAFile() {
    ::unsetenv("ZORVAGENT_CONFIG");
    std::error_code ignored;
    std::filesystem::remove_all(directory_, ignored);
  }

 private:
  std::filesystem::path directory_;
};

TEST(Library, IsGoneAfterItHasWorked) {
  const HostInAFile host;
  const std::ptrdiff_t filesBefore = openFiles();
  for (int i = 0; i < 20; ++i) {
    {
      const Loaded library;
      RecordingBroker broker;
      InstanceProvider provider(library.find<InstanceProvider::Create>("DNSClientProvider_Create_InstanceMI"), broker);
      const Outcome outcome = provider.enumerateInstanceNames(Path("ZORVA_DNSProtocolEndPoint"));
      ASSERT_EQ(2U, outcome.paths().size());
      EXPECT_EQ("host1", outcome.paths()[0]["SystemName"].text());
      AssociationProvider association(
          library.find<AssociationProvider::Create>("DNSOrderedComponentProvider_Create_AssociationMI"), broker);
      association.references(Path("ZORVA_DNSSettingData").key("InstanceID", "Computer%eth0"));
      EXPECT_EQ(CMPI_RC_OK, provider.cleanup().rc);
    }
    ASSERT_FALSE(isLoaded(kLibrary)) << i;
    ASSERT_FALSE(isLoaded(kAgent)) << i;
  }
  EXPECT_EQ(filesBefore, openFiles());
}

}  // namespace
}  // namespace ZV::Test
