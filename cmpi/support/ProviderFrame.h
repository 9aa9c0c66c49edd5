#pragma once

// Shared by all providers: function tables and create functions.

#include <cmpidt.h>
#include <cmpift.h>

#define ZORVA_PROVIDER_EXPORT extern "C" __attribute__((visibility("default")))

namespace zorva::cmpi {

/// The version of the function tables, as all CMPI 2.x servers take it.
constexpr CMPISint32 kTableVersion = 200;

constexpr CMPIStatus kNotSupported = {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};

/// A function table of these members. Later versions of CMPI have appended slots to the tables; they stay null.
template <typename Table, typename... Members>
constexpr Table tableOf(Members... members) {
  if constexpr (requires { Table{members..., nullptr}; }) {
    return tableOf<Table>(members..., nullptr);
  } else {
    return Table{members...};
  }
}

}  // namespace zorva::cmpi

/// The create function of a provider's Instance, Association or Method operations. It returns this table, and stores
/// the broker in that variable: the latest call wins.
#define ZORVA_CREATE_MI(kind, prefix, table, brokerVariable)                                                     \
  ZORVA_PROVIDER_EXPORT CMPI##kind##MI* prefix##_Create_##kind##MI(const CMPIBroker* broker, const CMPIContext*, \
                                                                   CMPIStatus*) {                                \
    static CMPI##kind##MI mi = {nullptr, &(table)};                                                              \
    brokerVariable = broker;                                                                                     \
    return &mi;                                                                                                  \
  }
