-- wrk sends one request over and over: its class comes as the first argument, a login as the second.
local class = "Bench_Few"
local namespace = "root/cimv2"

function init(arguments)
  class = arguments[1] or class
  local names = ""
  for part in string.gmatch(namespace, "[^/]+") do
    names = names .. '<NAMESPACE NAME="' .. part .. '"/>'
  end
  wrk.method = "POST"
  wrk.path = "/cimom"
  wrk.headers["Content-Type"] = 'application/xml; charset="utf-8"'
  wrk.headers["CIMOperation"] = "MethodCall"
  wrk.headers["CIMMethod"] = "EnumerateInstances"
  wrk.headers["CIMObject"] = namespace
  wrk.headers["Authorization"] = arguments[2]  -- nil: none
  wrk.body = '<?xml version="1.0" encoding="utf-8"?>\n<CIM CIMVERSION="2.0" DTDVERSION="2.0">'
    .. '<MESSAGE ID="1" PROTOCOLVERSION="1.0"><SIMPLEREQ><IMETHODCALL NAME="EnumerateInstances">'
    .. "<LOCALNAMESPACEPATH>" .. names .. "</LOCALNAMESPACEPATH>"
    .. '<IPARAMVALUE NAME="ClassName"><CLASSNAME NAME="' .. class .. '"/></IPARAMVALUE>'
    .. '<IPARAMVALUE NAME="LocalOnly"><VALUE>FALSE</VALUE></IPARAMVALUE>'
    .. "</IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>"
end

function done(summary, latency)
  local seconds = summary.duration / 1e6
  io.write(string.format("FIGURES %.1f %d %d\n", summary.requests / seconds, latency:percentile(50),
    latency:percentile(99)))
end
