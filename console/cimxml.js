// A client of CIM-XML over HTTP (DSP0200 1.4, DSP0201 2.4). It knows nothing of DNS and nothing of the page.

const escapes = { "&": "&amp;", "<": "&lt;", ">": "&gt;", '"': "&quot;" };
const escaped = (text) => String(text).replace(/[&<>"]/g, (c) => escapes[c]);

/** An operation that failed: `code` is the CIM status code, 0 where none came; `status` is that of HTTP. */
export class CimError extends Error {
  constructor(message, { code = 0, status = 0, isLost = false } = {}) {
    super(message);
    this.code = code;
    this.status = status;
    this.isLost = isLost;
  }
}

export const ACCESS_DENIED = 2;
export const NOT_FOUND = 6;
export const NOT_SUPPORTED = 7;

// ---- Requests ----

const namespaceXml = (namespace) => namespace.split("/").map((part) => `<NAMESPACE NAME="${escaped(part)}"/>`).join("");

function keyXml([name, value]) {
  const inner = typeof value === "object"
    ? `<VALUE.REFERENCE><INSTANCEPATH>${fullPathXml(value)}</INSTANCEPATH></VALUE.REFERENCE>`
    : `<KEYVALUE VALUETYPE="string">${escaped(value)}</KEYVALUE>`;
  return `<KEYBINDING NAME="${escaped(name)}">${inner}</KEYBINDING>`;
}

const nameXml = (path) => `<INSTANCENAME CLASSNAME="${escaped(path.className)}">${path.keys.map(keyXml).join("")}</INSTANCENAME>`;

const fullPathXml = (path) => `<NAMESPACEPATH><HOST>${escaped(path.host ?? "")}</HOST><LOCALNAMESPACEPATH>` +
  `${namespaceXml(path.namespace ?? "root/cimv2")}</LOCALNAMESPACEPATH></NAMESPACEPATH>${nameXml(path)}`;

const arrayXml = (values) => `<VALUE.ARRAY>${values.map((value) => `<VALUE>${escaped(value)}</VALUE>`).join("")}</VALUE.ARRAY>`;

function propertyXml([name, value]) {
  return Array.isArray(value)
    ? `<PROPERTY.ARRAY NAME="${escaped(name)}" TYPE="string">${arrayXml(value)}</PROPERTY.ARRAY>`
    : `<PROPERTY NAME="${escaped(name)}" TYPE="string"><VALUE>${escaped(value)}</VALUE></PROPERTY>`;
}

/** The parameters of the operations that the console uses, as XML. */
export const parameter = {
  className: (name) => `<CLASSNAME NAME="${escaped(name)}"/>`,
  path: nameXml,
  text: (value) => `<VALUE>${escaped(value)}</VALUE>`,
  texts: arrayXml,
  changed: (path, properties) => `<VALUE.NAMEDINSTANCE>${nameXml(path)}<INSTANCE CLASSNAME="${escaped(path.className)}">` +
    `${Object.entries(properties).map(propertyXml).join("")}</INSTANCE></VALUE.NAMEDINSTANCE>`,
};

let lastMessage = 0;

function message(namespace, operation, parameters) {
  lastMessage += 1;
  const inner = Object.entries(parameters).map(([name, xml]) => `<IPARAMVALUE NAME="${name}">${xml}</IPARAMVALUE>`).join("");
  return `<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="${lastMessage}" ` +
    `PROTOCOLVERSION="1.4"><SIMPLEREQ><IMETHODCALL NAME="${operation}"><LOCALNAMESPACEPATH>${namespaceXml(namespace)}` +
    `</LOCALNAMESPACEPATH>${inner}</IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>`;
}

// ---- Responses ----

const childNamed = (element, ...names) => [...element.children].find((child) => names.includes(child.tagName));

function valueOf(property) {
  if (property.tagName === "PROPERTY.ARRAY") {
    const array = childNamed(property, "VALUE.ARRAY");
    return array ? [...array.children].map((value) => value.textContent) : null;
  }
  if (property.tagName === "PROPERTY.REFERENCE") {
    const reference = childNamed(property, "VALUE.REFERENCE");
    return reference ? pathOf(reference) : null;
  }
  return childNamed(property, "VALUE")?.textContent ?? null;
}

/** The path in an element: {className, keys: [[name, text or path]], namespace, host}. */
function pathOf(element) {
  const name = element.tagName === "INSTANCENAME" ? element : element.querySelector("INSTANCENAME");
  const path = { className: name.getAttribute("CLASSNAME"), keys: [] };
  const outer = name.parentElement;
  const namespace = outer && childNamed(outer, "NAMESPACEPATH", "LOCALNAMESPACEPATH");
  if (namespace) {
    path.namespace = [...namespace.querySelectorAll("NAMESPACE")].map((part) => part.getAttribute("NAME")).join("/");
    path.host = namespace.querySelector("HOST")?.textContent;
  }
  for (const key of name.children) {
    const value = key.firstElementChild;
    path.keys.push([key.getAttribute("NAME"), value.tagName === "KEYVALUE" ? value.textContent : pathOf(value)]);
  }
  return path;
}

function instanceOf(element) {
  const instance = element.tagName === "INSTANCE" ? element : childNamed(element, "INSTANCE");
  const properties = {};
  for (const property of instance.children) {
    if (property.tagName.startsWith("PROPERTY")) properties[property.getAttribute("NAME")] = valueOf(property);
  }
  const name = element.tagName === "INSTANCE" ? null : childNamed(element, "INSTANCEPATH", "INSTANCENAME", "LOCALINSTANCEPATH");
  return { className: instance.getAttribute("CLASSNAME"), path: name && pathOf(name), properties };
}

function resultOf(text, operation) {
  const document = new DOMParser().parseFromString(text, "application/xml");
  const response = document.querySelector("IMETHODRESPONSE");
  if (document.querySelector("parsererror") || !response) throw new CimError(`${operation}: the answer is no CIM-XML`);
  const error = childNamed(response, "ERROR");
  if (error) {
    throw new CimError(error.getAttribute("DESCRIPTION") ?? "", { code: Number(error.getAttribute("CODE")), status: 200 });
  }
  return response;
}

function outputOf(response, name) {
  const found = [...response.children].find((child) => child.tagName === "PARAMVALUE" && child.getAttribute("NAME") === name);
  return found?.textContent ?? "";
}

const elementsOf = (response) => [...(childNamed(response, "IRETURNVALUE")?.children ?? [])];

// ---- The client ----

export class CimClient {
  constructor(url, namespace) {
    this.url = url;
    this.namespace = namespace;
    this.authorization = null;
  }

  /** Logs in from now on; a null name logs out. The password is kept in memory alone. */
  login(name, password) {
    const bytes = new TextEncoder().encode(`${name}:${password}`);
    this.authorization = name === null ? null : `Basic ${btoa(String.fromCharCode(...bytes))}`;
  }

  /** Sends one operation. Throws CimError. With `keepalive` it is sent even if the page closes meanwhile. */
  async call(operation, parameters, { keepalive = false } = {}) {
    const headers = {
      "Content-Type": 'application/xml; charset="utf-8"', CIMOperation: "MethodCall", CIMMethod: operation, CIMObject: this.namespace,
    };
    if (this.authorization) headers.Authorization = this.authorization;
    const body = message(this.namespace, operation, parameters);
    let response, text;
    try {
      // "omit": the browser has no login of its own for this server, and asks for none.
      response = await fetch(this.url, { method: "POST", headers, body, credentials: "omit", cache: "no-store", keepalive });
      text = await response.text();
    } catch (error) {
      throw new CimError(error.message, { isLost: true });
    }
    if (!response.ok) throw new CimError(text.trim(), { status: response.status, isLost: response.status === 503 });
    return resultOf(text, operation);
  }

  async getInstance(path) {
    const found = await this.call("GetInstance", { InstanceName: parameter.path(path) });
    return { ...instanceOf(elementsOf(found)[0]), path };
  }

  async instanceNames(className) {
    const found = await this.call("EnumerateInstanceNames", { ClassName: parameter.className(className) });
    return elementsOf(found).map(pathOf);
  }

  /** Sends these properties alone; the others stay as they are. */
  async modify(path, properties, options) {
    await this.call("ModifyInstance", {
      ModifiedInstance: parameter.changed(path, properties), PropertyList: parameter.texts(Object.keys(properties)),
    }, options);
  }

  /** The instances of a class, in pieces: the page stays usable, however many there are. */
  instances(className, properties) {
    return this.#pulled("OpenEnumerateInstances", "PullInstancesWithPath", instanceOf,
      { ClassName: parameter.className(className), PropertyList: parameter.texts(properties) });
  }

  /** The names of the associations of an object, in pieces. */
  referenceNames(path) {
    return this.#pulled("OpenReferenceInstancePaths", "PullInstancePaths", pathOf, { InstanceName: parameter.path(path) });
  }

  async *#pulled(open, pull, read, parameters) {
    const first = 100, further = 500;
    let response = await this.call(open, { ...parameters, MaxObjectCount: parameter.text(first) });
    let context = "";
    try {
      for (;;) {
        context = outputOf(response, "EnumerationContext");
        const isLast = outputOf(response, "EndOfSequence").toUpperCase() === "TRUE";
        if (isLast) context = "";
        yield elementsOf(response).map(read);
        if (isLast) return;
        response = await this.call(pull, { EnumerationContext: parameter.text(context), MaxObjectCount: parameter.text(further) });
      }
    } finally {
      // The reader wants no more: the server need not keep the rest.
      if (context) this.call("CloseEnumeration", { EnumerationContext: parameter.text(context) }).catch(() => {});
    }
  }
}
