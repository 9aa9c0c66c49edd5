// The companion providers: the classes that the DNS associations refer to and that a bare CIM server lacks.

#include "cmpi/support/ProviderFrame.h"
#include "host/HostObjects.h"
#include "host/HostProvider.h"

// The provider of what that function publishes.
#define ZORVA_HOST_PROVIDER(prefix, publish)                                                      \
  namespace zorva::host {                                                                         \
  static constinit CMPIInstanceMIFT prefix##Table = Provider<publish>::table("instance" #prefix); \
  }                                                                                               \
  ZORVA_CREATE_MI(Instance, prefix, ::zorva::host::prefix##Table,                                 \
                  ::zorva::host::Provider<::zorva::host::publish>::broker)

ZORVA_HOST_PROVIDER(HostComputerSystemProvider, computerSystems)
ZORVA_HOST_PROVIDER(HostIPProtocolEndpointProvider, ipEndpoints)
ZORVA_HOST_PROVIDER(HostIPAssignmentSettingDataProvider, ipAssignments)
