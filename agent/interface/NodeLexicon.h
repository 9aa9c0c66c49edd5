#pragma once

// The numbers of the node types and of the node properties in the instrumentation tree.

namespace ZV::NodeLexicon {

/// A closed enumeration: no node has a type that is not listed.
enum NodeType : unsigned int {
  NODE_NETWORK_IP_CONFIG = 29,  ///< "NetworkIPConfig": the IP configuration of one network interface
};

/// A closed enumeration: no node has a property that is not listed.
enum Properties : unsigned int {
  PROP_DNS_SERVER_ADDRESSES = 94,  ///< list: DNS server addresses of the interface, in search order
  PROP_PROTOCOL_IF_TYPE = 96,      ///< number: protocol interface type
  PROP_HOST_NAME = 97,             ///< text: host name
  PROP_DOMAIN_NAME = 98,           ///< text: DNS domain name
  PROP_DNS_SUFFIXES = 99,          ///< list: DNS suffixes to append
  PROP_NAME = 108,                 ///< text: interface name
  PROP_ENABLED_STATE = 123,        ///< number: 1 up with carrier, 12 up without carrier, 16 administratively down
};

}  // namespace ZV::NodeLexicon
