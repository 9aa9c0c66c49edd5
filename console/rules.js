// What is refused before it is sent, by the rules of zorvactl. The server checks again.

const groups = (text) => (text === "" ? [] : text.split(":"));

function bytesOfIPv4(text) {
  const parts = text.split(".");
  if (parts.length !== 4 || parts.some((part) => !/^(0|[1-9][0-9]{0,2})$/.test(part) || Number(part) > 255)) return null;
  return parts.map(Number);
}

function bytesOfIPv6(text) {
  let rest = text;
  const lastColon = rest.lastIndexOf(":");
  if (rest.includes(".")) {
    const tail = lastColon < 0 ? null : bytesOfIPv4(rest.slice(lastColon + 1));
    if (!tail) return null;
    rest = `${rest.slice(0, lastColon + 1)}${((tail[0] << 8) | tail[1]).toString(16)}:${((tail[2] << 8) | tail[3]).toString(16)}`;
  }
  const halves = rest.split("::");
  if (halves.length > 2) return null;
  const left = groups(halves[0]), right = halves.length === 2 ? groups(halves[1]) : [];
  const missing = 8 - left.length - right.length;
  if (halves.length === 1 ? missing !== 0 : missing < 1) return null;
  const all = [...left, ...Array(missing).fill("0"), ...right];
  if (all.some((group) => !/^[0-9a-fA-F]{1,4}$/.test(group))) return null;
  return all.flatMap((group) => [parseInt(group, 16) >> 8, parseInt(group, 16) & 0xff]);
}

/** An address in a form that is equal for all its spellings: {family, bytes, zone}; null if the text is none. */
export function addressOf(text) {
  const four = bytesOfIPv4(text);
  if (four) return { family: 4, bytes: four, zone: "" };
  const percent = text.indexOf("%");
  const address = percent < 0 ? text : text.slice(0, percent);
  const zone = percent < 0 ? "" : text.slice(percent + 1);
  if (percent >= 0 && (zone === "" || /\s/.test(zone))) return null;
  const bytes = bytesOfIPv6(address);
  if (!bytes) return null;
  const isMapped = bytes.slice(0, 10).every((byte) => byte === 0) && bytes[10] === 0xff && bytes[11] === 0xff;
  return isMapped ? { family: 4, bytes: bytes.slice(12), zone: "" } : { family: 6, bytes, zone };
}

const keyOf = (address) => `${address.family} ${address.bytes.join(".")}%${address.zone}`;

/** One text for all spellings of a server. */
export function sameServer(text) {
  const address = addressOf(text);
  return address ? keyOf(address) : text;
}

/** One text for all spellings of a suffix. */
export const sameSuffix = (text) => text.replace(/\.$/, "").toLowerCase();

/** Why a server is refused, as the name of a text; null if it is good. */
export function serverProblem(text) {
  const address = addressOf(text);
  if (!address) return "notAnAddress";
  const isMulticast = address.family === 4 ? address.bytes[0] >> 4 === 14 : address.bytes[0] === 0xff;
  if (isMulticast) return "multicast";
  return address.bytes.every((byte) => byte === 0) ? "unspecified" : null;
}

/** Whether a text is a domain name. The empty one is. */
export function isName(text) {
  if (text === "") return true;
  const bare = text.endsWith(".") ? text.slice(0, -1) : text;
  return bare.length <= 253 && bare.split(".").every((label) => /^[A-Za-z0-9_-]{1,63}$/.test(label));
}

export const suffixProblem = (text) => (text !== "" && isName(text) ? null : "notASuffix");
export const domainProblem = (text) => (isName(text) ? null : "notADomain");

/** The first thing that is wrong in a list: {text, problem}; null if nothing is. */
export function listProblem(texts, problemOf, same) {
  const seen = new Set();
  for (const text of texts) {
    const problem = problemOf(text) ?? (seen.has(same(text)) ? "twice" : null);
    if (problem) return { text, problem };
    seen.add(same(text));
  }
  return null;
}
