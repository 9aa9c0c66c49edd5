"""Clients that send the most expensive requests that the server takes, and one that goes on with its work beside them.

load.py runs it as the figure "hostile".
"""

import http.client
import multiprocessing
import time

BODY_BYTES = 3_900_000  # a little less than the 4 MiB that a body may have
FIELDS = {"Content-Type": 'application/xml; charset="utf-8"', "CIMOperation": "MethodCall",
          "CIMMethod": "EnumerateInstances", "CIMObject": "root/cimv2"}
HEAD = ('<CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="1" PROTOCOLVERSION="1.0"><SIMPLEREQ>'
        '<IMETHODCALL NAME="EnumerateInstances"><LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="cimv2"/>'
        '</LOCALNAMESPACEPATH><IPARAMVALUE NAME="ClassName"><CLASSNAME NAME="ZORVA_DNSProtocolEndPoint"/>'
        '</IPARAMVALUE>')
TAIL = "</IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>"


def filled(before, piece, after, most=10_000_000):
    """Between the two, the piece, numbered, as often as a body has room for, and at most so often."""
    room = BODY_BYTES - len(HEAD) - len(before) - len(after) - len(TAIL)
    count = min(room // len(piece % 1_000_000), most)
    return (HEAD + before + "".join(piece % (1_000_000 + i) for i in range(count)) + after + TAIL).encode()


def bodies():
    """A request for each kind of element that can be repeated; the caps refuse some of them, others are read whole."""
    parameter = '<IPARAMVALUE NAME="P">'
    end = "</IPARAMVALUE>"
    deep = ('<VALUE.REFERENCE><INSTANCENAME CLASSNAME="C"><KEYBINDING NAME="K%d">' * 30).replace("%d", "", 29)
    return {
        "unknown parameters": filled("", '<IPARAMVALUE NAME="P%d"/>', "", 140_000),
        "keys": filled(parameter + '<INSTANCENAME CLASSNAME="C">',
                       '<KEYBINDING NAME="K%d"><KEYVALUE>v</KEYVALUE></KEYBINDING>', "</INSTANCENAME>" + end),
        "properties": filled(parameter + '<INSTANCE CLASSNAME="C">', '<PROPERTY NAME="P%d" TYPE="string"></PROPERTY>',
                             "</INSTANCE>" + end),
        "values": filled('<IPARAMVALUE NAME="PropertyList"><VALUE.ARRAY>', "<VALUE>Name of a property %d</VALUE>",
                         "</VALUE.ARRAY>" + end, 65_000),
        "references": filled(parameter, deep + "<KEYVALUE/>" +
                             "</KEYBINDING></INSTANCENAME></VALUE.REFERENCE>" * 30, end, 2_000),
        "comments": filled('<IPARAMVALUE NAME="PropertyList"><VALUE.ARRAY><VALUE>', "a<!--%d-->",
                           "</VALUE></VALUE.ARRAY>" + end),
        "entities": filled(parameter + "<VALUE>", "&amp;%d", "</VALUE>" + end),
        "unknown elements": filled("", '<EXTRA A="%d"/>', "", 190_000),
        "attributes": HEAD.encode() + b"<EXTRA " + b"".join(b' a%d=""' % i for i in range(300_000)) + b"/>" +
                      TAIL.encode(),
    }


def post(port, body):
    """The status of the answer, or nothing where the server ended the connection."""
    connection = http.client.HTTPConnection("127.0.0.1", port, timeout=60)
    try:
        connection.request("POST", "/cimom", body, FIELDS)
        response = connection.getresponse()
        response.read()
        return response.status
    except (ConnectionError, http.client.HTTPException):
        return None
    finally:
        connection.close()


def attack(port, body, until, count):
    while time.monotonic() < until.value:
        post(port, body)
        with count.get_lock():
            count.value += 1


def latencies_beside(port, some, attackers, seconds):
    """Milliseconds of a client's requests, a new connection for each, and how many of the others were answered."""
    until = multiprocessing.Value("d", time.monotonic() + seconds)
    count = multiprocessing.Value("i", 0)
    processes = [multiprocessing.Process(target=attack, args=(port, some[i % len(some)], until, count), daemon=True)
                 for i in range(attackers)]
    for process in processes:
        process.start()
    small = (HEAD + TAIL).encode()
    times = []
    try:
        while time.monotonic() < until.value:
            begin = time.perf_counter()
            if post(port, small) != 200:
                raise RuntimeError("the server refused a good request")
            times.append((time.perf_counter() - begin) * 1000)
            time.sleep(0.005)
    finally:
        until.value = 0
        for process in processes:
            process.join(timeout=60)
    return sorted(times), count.value
