#pragma once

// The agent's headers as another vendor may have them: the same names, no member const, and a cursor that converts to
// bool by itself. They are for compiling the library and have no implementation.

namespace ZV {
namespace NodeLexicon {

enum NodeType { NODE_NETWORK_IP_CONFIG = 29 };

enum Properties {
  PROP_DNS_SERVER_ADDRESSES = 94,
  PROP_PROTOCOL_IF_TYPE = 96,
  PROP_HOST_NAME = 97,
  PROP_DOMAIN_NAME = 98,
  PROP_DNS_SUFFIXES = 99,
  PROP_NAME = 108,
  PROP_ENABLED_STATE = 123
};

}  // namespace NodeLexicon
}  // namespace ZV
