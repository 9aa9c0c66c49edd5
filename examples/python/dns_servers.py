#!/usr/bin/env python3
"""Shows the DNS servers of each interface of a host, or sets those of one, by CIM-XML over HTTP.

  dns_servers.py URL                        http://localhost:5988
  dns_servers.py URL INTERFACE SERVER...
"""
import http.client
import sys
import urllib.parse
import xml.etree.ElementTree as ET
from xml.sax.saxutils import escape, quoteattr

NAMESPACE = ["root", "cimv2"]
CLASS = "ZORVA_DNSSettingData"


class CimError(Exception):
    """An operation that the server refused: its code (DSP0200) and text."""


def call(url, method, parameters):
    """Sends an intrinsic method; returns the children of its IRETURNVALUE."""
    path = "".join(f"<NAMESPACE NAME={quoteattr(name)}/>" for name in NAMESPACE)
    values = "".join(f"<IPARAMVALUE NAME={quoteattr(name)}>{xml}</IPARAMVALUE>" for name, xml in parameters.items())
    body = ('<?xml version="1.0" encoding="utf-8"?>\n<CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="1" '
            f'PROTOCOLVERSION="1.0"><SIMPLEREQ><IMETHODCALL NAME={quoteattr(method)}><LOCALNAMESPACEPATH>{path}'
            f'</LOCALNAMESPACEPATH>{values}</IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>')
    where = urllib.parse.urlsplit(url)
    connection = http.client.HTTPConnection(where.hostname, where.port or 5988, timeout=10)
    connection.request("POST", "/cimom", body.encode(), {
        "Content-Type": "application/xml; charset=utf-8", "CIMOperation": "MethodCall", "CIMMethod": method,
        "CIMObject": "/".join(NAMESPACE)})
    response = connection.getresponse()
    text = response.read()
    if response.status != 200:
        raise CimError(f"HTTP {response.status} {response.reason} {response.getheader('CIMError', '')}")
    reply = ET.fromstring(text).find(".//IMETHODRESPONSE")
    if (error := reply.find("ERROR")) is not None:
        raise CimError(f"{error.get('CODE')}: {error.get('DESCRIPTION')}")
    result = reply.find("IRETURNVALUE")
    return [] if result is None else list(result)


def setting_of(element):
    """A VALUE.NAMEDINSTANCE: the InstanceID, and the servers in their order."""
    instance = element.find("INSTANCE")
    name = instance.findtext("PROPERTY[@NAME='InstanceID']/VALUE")
    servers = instance.findall("PROPERTY.ARRAY[@NAME='DNSServerAddresses']/VALUE.ARRAY/VALUE")
    return name, [server.text or "" for server in servers]


def settings(url):
    found = call(url, "EnumerateInstances", {"ClassName": f'<CLASSNAME NAME="{CLASS}"/>'})
    return [setting_of(element) for element in found]


def set_servers(url, interface, servers):
    values = "".join(f"<VALUE>{escape(server)}</VALUE>" for server in servers)
    call(url, "ModifyInstance", {
        "ModifiedInstance": f'<VALUE.NAMEDINSTANCE><INSTANCENAME CLASSNAME="{CLASS}"><KEYBINDING NAME="InstanceID">'
                            f"<KEYVALUE>{escape('Computer%' + interface)}</KEYVALUE></KEYBINDING></INSTANCENAME>"
                            f'<INSTANCE CLASSNAME="{CLASS}"><PROPERTY.ARRAY NAME="DNSServerAddresses" TYPE="string">'
                            f"<VALUE.ARRAY>{values}</VALUE.ARRAY></PROPERTY.ARRAY></INSTANCE></VALUE.NAMEDINSTANCE>",
        # Without the list, the server takes every property of the instance for one that is to be changed.
        "PropertyList": "<VALUE.ARRAY><VALUE>DNSServerAddresses</VALUE></VALUE.ARRAY>"})


def main(words):
    if len(words) not in (1, *range(3, 20)):
        sys.exit(__doc__)
    if len(words) > 1:
        set_servers(words[0], words[1], words[2:])
    for name, servers in settings(words[0]):
        print(name, *servers)


try:
    main(sys.argv[1:])
except (CimError, OSError, ET.ParseError) as problem:
    sys.exit(f"dns_servers.py: {problem}")
