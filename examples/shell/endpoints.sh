#!/bin/sh
# The names of the DNS endpoints of a host, with one request of CIM-XML.
#
#   endpoints.sh URL      http://localhost:5988; for a server with logins add curl's --user and --cacert
set -eu
curl --silent --show-error --fail "$1/cimom" \
  -H 'Content-Type: application/xml; charset=utf-8' \
  -H 'CIMOperation: MethodCall' -H 'CIMMethod: EnumerateInstanceNames' -H 'CIMObject: root/cimv2' \
  --data-binary '<?xml version="1.0" encoding="utf-8"?>
<CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="1" PROTOCOLVERSION="1.0"><SIMPLEREQ>
<IMETHODCALL NAME="EnumerateInstanceNames">
<LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="cimv2"/></LOCALNAMESPACEPATH>
<IPARAMVALUE NAME="ClassName"><CLASSNAME NAME="ZORVA_DNSProtocolEndPoint"/></IPARAMVALUE>
</IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>' |
  xmllint --xpath '//KEYBINDING[@NAME="Name"]/KEYVALUE/text()' - |
  sed '/^$/d'
