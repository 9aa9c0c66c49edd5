// What the page knows of the host, gathered from CIM instances.

import { sameServer, serverProblem } from "./rules.js";
import { t } from "./texts.js";

export const ENDPOINT = "ZORVA_DNSProtocolEndPoint";
export const SETTING = "ZORVA_DNSSettingData";
export const GENERAL = "ZORVA_DNSGeneralSettingData";
export const ORIGIN = "ZORVA_DNSSettingOrigin";
export const SYSTEM = "ZORVA_ComputerSystem";

const interfaceOf = (id) => id.slice(id.indexOf("%") + 1);

/** The host's configuration. `rows` are its interfaces in the order of their names. */
export class HostModel {
  constructor() {
    this.name = "";
    this.rows = [];
    this.general = null; // the instance of the host's settings
    this.origin = {}; // of the host
    this.readAt = new Date();
  }

  row(key) {
    return this.rows.find((row) => row.key === key);
  }
}

function rowOf(id) {
  return {
    key: id, name: interfaceOf(id), isServiceProcessor: id.startsWith("BMC%"), endpoint: {}, endpointPath: null, setting: {},
    settingPath: null, origin: {},
  };
}

/** The id of an endpoint's settings. */
function idOfEndpoint(instance) {
  const system = instance.path.keys.find(([name]) => name === "SystemCreationClassName")?.[1] ?? "";
  return `${system.includes("SPComputerSystem") ? "BMC" : "Computer"}%${instance.properties.Name}`;
}

/** Rows by id. Several interfaces may have one name: each instance of a class goes to the next of them. */
class Rows {
  constructor() {
    this.all = [];
    this.byId = new Map();
  }

  place(id, taken, put) {
    const rows = this.byId.get(id) ?? [];
    let row = rows.find((each) => !taken(each));
    if (!row) {
      row = rowOf(id);
      if (rows.length > 0) row.key = `${id}%${rows.length}`;
      this.byId.set(id, [...rows, row]);
      this.all.push(row);
    }
    put(row);
  }
}

const readers = {
  [ENDPOINT]: (rows, instance) => rows.place(idOfEndpoint(instance), (row) => row.endpointPath, (row) => {
    row.endpoint = instance.properties;
    row.endpointPath = instance.path;
  }),
  [SETTING]: (rows, instance) => rows.place(instance.properties.InstanceID, (row) => row.settingPath, (row) => {
    row.setting = instance.properties;
    row.settingPath = instance.path;
  }),
};

const wanted = {
  [ENDPOINT]: ["Name", "EnabledState", "Hostname", "DomainName", "DNSSuffixesToAppend", "SystemName"],
  [SETTING]: ["InstanceID", "RequestedHostname", "DomainName", "DNSServerAddresses", "ConfigurationName"],
  [GENERAL]: ["InstanceID", "DNSSuffixesToAppend", "ConfigurationName"],
  [ORIGIN]: ["InstanceID", "Owner", "OwnerProfile", "OwnerOrigin", "OwnerServers", "File", "FileName", "SetProperties",
    "ResolverServers", "ResolverServersNotAsked", "ResolverSearch"],
};

/** Reads the host. `progress(count)` is called with the number of interfaces so far. */
export async function readHost(client, progress = () => {}) {
  const host = new HostModel();
  const rows = new Rows();
  const origins = new Map();
  const each = async (className, take) => {
    for await (const instances of client.instances(className, wanted[className])) {
      instances.forEach(take);
      progress(rows.all.length);
    }
  };
  await each(ENDPOINT, (instance) => readers[ENDPOINT](rows, instance));
  await Promise.all([
    each(SETTING, (instance) => readers[SETTING](rows, instance)),
    each(GENERAL, (instance) => { host.general = instance; }),
    each(ORIGIN, (instance) => origins.set(instance.properties.InstanceID, instance.properties)),
  ]);
  const systems = await client.instanceNames(SYSTEM);
  const own = systems.find((path) => path.className === SYSTEM);
  host.name = own?.keys.find(([name]) => name === "Name")?.[1] ?? location.hostname;
  host.origin = origins.get(host.general?.properties.InstanceID) ?? {};
  for (const row of rows.all) {
    row.origin = origins.get(row.isServiceProcessor ? `BMC%${row.name}` : `Computer%${row.name}`) ?? {};
    describe(row);
  }
  const order = new Intl.Collator("en", { numeric: true });
  host.rows = rows.all.sort((a, b) => order.compare(a.name, b.name));
  return host;
}

/** The values that the table shows, and the text that its filter looks at. */
function describe(row) {
  row.servers = row.setting.DNSServerAddresses ?? [];
  row.domain = row.setting.DomainName ?? row.endpoint.DomainName ?? "";
  row.suffixes = row.endpoint.DNSSuffixesToAppend ?? [];
  row.from = fromOf(row.origin);
  row.sought = [row.name, ...row.servers, row.domain, ...row.suffixes, row.from].join("\n").toLowerCase();
}

/** In the words of zorvactl, who supplies an interface's values. */
function fromOf(origin) {
  if (origin.File) return origin.File;
  if ((origin.SetProperties ?? []).length > 0) return "overlay.json";
  if (!origin.Owner) return "";
  if (!origin.OwnerProfile) return origin.Owner;
  const isPath = origin.OwnerProfile.startsWith("/");
  return t(isPath ? "ownerAndFile" : "ownerAndProfile", { owner: origin.Owner, profile: origin.OwnerProfile.split("/").at(-1) });
}

const endpointNames = { RequestedHostname: "Hostname" };
const onlyInFile = new Set(["ConfigurationName"]);

/** Where a setting's value comes from: "file", "set", "owner", "host" or "none". A file replaces all values, also by none. */
export function sourceOf(property, value, origin) {
  if (origin.File) return "file";
  const isEmpty = value === null || value === undefined || value.length === 0;
  if (isEmpty || onlyInFile.has(property)) return "none";
  if ((origin.SetProperties ?? []).includes(endpointNames[property] ?? property)) return "set";
  return property === "DNSServerAddresses" && origin.Owner ? "owner" : "host";
}

/** What can be seen to be wrong without asking a DNS server: [{kind, who, what}]. */
export function findingsOf(host) {
  const findings = [];
  for (const row of host.rows) {
    const seen = new Set();
    for (const server of row.servers) {
      if (serverProblem(server)) findings.push({ kind: "notAddress", who: row.name, what: server });
      const same = sameServer(server);
      if (seen.has(same)) findings.push({ kind: "twice", who: row.name, what: server });
      seen.add(same);
    }
  }
  for (const server of host.origin.ResolverServersNotAsked ?? []) findings.push({ kind: "notAsked", what: server });
  const hasServer = host.rows.some((row) => row.servers.length > 0) || (host.origin.ResolverServers ?? []).length > 0 ||
    (host.origin.OwnerServers ?? []).length > 0;
  if (!hasServer) findings.push({ kind: "noServer" });
  return findings;
}
