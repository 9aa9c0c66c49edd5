// Any bytes as an Ethernet interface of a service. What becomes of it must be a state that the agent reads back as the
// same, and a change of it must be one that leaves nothing to change.

#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "agent/tree/BmcJson.h"
#include "bmc/Change.h"
#include "bmc/Ethernet.h"

namespace {

using namespace zorva;  // NOLINT(google-build-using-namespace)

void checkState(const bmc::Ethernet& ethernet) {
  agent::BmcState state;
  state.tree = bmc::treeOf({{"1", {ethernet, ethernet}}});
  const std::string text = formatBmcState(state);
  if (formatBmcState(agent::parseBmcState(text, "again")) == text) return;
  std::fprintf(stderr, "the state changes when it is read back:\n%s\n", text.c_str());
  std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  try {
    const std::string text(reinterpret_cast<const char*>(data), size);
    const bmc::Ethernet ethernet = bmc::readEthernet(agent::parseJson(text, "interface", 10000));
    checkState(ethernet);
    if (!bmc::differenceFrom(ethernet, bmc::propertiesOf(ethernet)).items.empty()) std::abort();
    (void)bmc::propertiesFor(ethernet, {bmc::StringList{"192.0.2.1"}, "example.org"});
  } catch (const bmc::Failed&) {
  } catch (const agent::ConfigError&) {
  }
  return 0;
}
