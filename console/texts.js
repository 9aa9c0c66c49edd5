// The page's own words, in English and German. Texts of the server are shown as they come.

const en = {
  overview: "Overview", graph: "Graph", refresh: "Refresh", logIn: "Log in", logOut: "Log out", anonymous: "not logged in",
  skip: "Skip to the content", navigation: "Views", of: "DNS client configuration of {host}", close: "Close", cancel: "Cancel",
  asOf: "as of {time}", loading: "Reading the host …", loadingMany: "{count} interfaces so far …",
  host: "Host", programsAsk: "Programs ask", neverAsked: "Never asked", searchList: "Search list", suffixes: "Suffixes",
  asks: "{owner} asks", none: "none", unknown: "not known", change: "Change", changeSuffixes: "Change the suffixes",
  suffixesFromHost: "The suffixes are from the host. The file {file}, which does not exist, would replace them.",
  suffixesFromFile: "The suffixes are kept in {file}: the settings of the host are in the file of the first interface.",
  findings: "What stands out", noFindings: "Nothing.",
  checks: "What the servers answer", asking: "The servers are being asked …", server: "Server", time: "Time", answer: "Answer", usedBy: "Used by",
  suffix: "Suffix", resolves: "resolves", doesNotResolve: "does not resolve", noServerToAsk: "There is no DNS server to ask.",
  notAskedNow: "The servers could not be asked: {why}",
  checksHint: "The host has just asked each server for the root, and the first three of each list about the suffixes. Refresh asks again.",
  twice_finding: "{who} has {what} twice; it is never asked a second time in its turn.",
  notAsked_finding: "{what} is never asked: /etc/resolv.conf has it after the first three servers.",
  notAddress_finding: "{who} has {what}, which is no address of a server.",
  noServer_finding: "No interface and not the host has a DNS server.",
  moreFindings: "… and {count} more",
  interfaces: "Interfaces", interface: "Interface", filter: "Filter", filterHint: "By name, server, domain or owner",
  shown: "{shown} of {all}", name: "Name", state: "State", servers: "Servers", domain: "Domain", owner: "Owner", from: "From",
  noneMatch: "No interface matches.", noInterface: "This host has no interface besides loopback.",
  serverOrder: "Servers, in the order in which they are asked", profile: "Profile", origin: "Origin", hostName: "Host name", system: "System",
  serversOfOwner: "Servers of the owner", settings: "Settings", setting: "Setting", value: "Value", bmc: "service processor",
  from_file: "{file}", from_host: "host", from_owner: "{owner}", from_set: "set, overlay.json", from_none: "–",
  ownerAndProfile: "{owner}, profile {profile}", ownerAndFile: "{owner}, {profile}",
  noSuchInterface: "This host has no interface {name}.", back: "All interfaces", showGraph: "Show in the graph",
  changeInterface: "Change servers and domain", changeOf: "Change {what}", oneEachLine: "One in each line, in the order in which they are asked.",
  suffixHint: "One in each line, in the order in which they are tried.", domainHint: "Empty: none.",
  confirmWithin: "Confirm within", seconds: "{count} seconds", withoutConfirm: "No confirmation: keep it at once",
  confirmHint: "Unless you confirm in time, this page writes the former values back.",
  preview: "Preview", previewTitle: "This would change", now: "Now", after: "After", object: "Object", apply: "Apply", edit: "Back",
  nothingChanges: "Nothing would change.", fileMissing: "{property} would not be stored: {file} does not exist. On the host, 'zorvactl ifcfg init {name}' makes it.",
  applied: "Changed on trial. It is taken back in {count} s unless you keep it.", keep: "Keep", rollBack: "Roll back now", kept: "Kept.", stored: "Stored.",
  rolledBack: "Rolled back: the former values are stored again.",
  rollBackFailed: "The former values could not be written back: {why}", rollBackLost: "The server does not answer; the page goes on trying to write the former values back.",
  changedMeanwhile: "Not rolled back: somebody else has changed {property} since.",
  refused: "Refused: {why}", notStored: "{property} was not stored; the server still says {value}.",
  notAnAddress: "'{text}' is no IP address. A server is given by its address: 192.0.2.53 or 2001:db8::53.",
  multicast: "'{text}' is a multicast address; no server has one.", unspecified: "'{text}' is the unspecified address; no server has it.",
  notASuffix: "'{text}' is no suffix: letters, digits, '-' and '_' between single dots, at most 63 in each part and 253 in all.",
  notADomain: "'{text}' is no domain name: letters, digits, '-' and '_' between single dots, at most 63 in each part and 253 in all.",
  twice: "'{text}' is given twice.",
  denied: "You may not change this. Log in as a user who may, or ask the administrator of the server.",
  lost: "The server does not answer. What is shown is as of {time}; trying again …", lostFirst: "The server does not answer; trying again …",
  back_again: "The server answers again.", needsLogin: "The server asks for a login.", failed: "That failed: {why}",
  loginTitle: "Log in", user: "User", password: "Password", loginHint: "The name and password are kept until this page is closed, and sent to this server alone.",
  loginPlain: "The server takes logins over HTTPS only, and this page came by plain HTTP. Open it by its https:// URL.",
  loginWrong: "The server did not take this login: {why}", loggedIn: "Logged in as {name}.", loggedOut: "Logged out.",
  graphOf: "Associations of {name}", graphHint: "Choose an object to walk on. Arrow keys move between the objects, Enter walks.",
  noAssociations: "This object has no associations.", more: "Show more", shownOf: "{count} shown; there are more.", properties: "Properties",
  property: "Property", association: "Association", farEnd: "Far end", role: "Role", noKeys: "(without keys)", notThere: "This object cannot be read: {why}", asTable: "The same as a table",
  footer: "The console of zorvacimd. It asks the server by CIM-XML, as any CIM client does.",
};

const de = {
  overview: "Übersicht", graph: "Graph", refresh: "Neu lesen", logIn: "Anmelden", logOut: "Abmelden", anonymous: "nicht angemeldet",
  skip: "Zum Inhalt springen", navigation: "Ansichten", of: "DNS-Client-Konfiguration von {host}", close: "Schließen", cancel: "Abbrechen",
  asOf: "Stand {time}", loading: "Der Rechner wird gelesen …", loadingMany: "{count} Schnittstellen bisher …",
  host: "Rechner", programsAsk: "Programme fragen", neverAsked: "Nie gefragt", searchList: "Suchliste", suffixes: "Suffixe",
  asks: "{owner} fragt", none: "keine", unknown: "nicht bekannt", change: "Ändern", changeSuffixes: "Suffixe ändern",
  suffixesFromHost: "Die Suffixe sind die des Rechners. Die Datei {file}, die es nicht gibt, würde sie ersetzen.",
  suffixesFromFile: "Die Suffixe stehen in {file}: Die Einstellungen des Rechners sind in der Datei der ersten Schnittstelle.",
  findings: "Was auffällt", noFindings: "Nichts.",
  checks: "Was die Server antworten", asking: "Die Server werden gefragt …", server: "Server", time: "Zeit", answer: "Antwort", usedBy: "Genutzt von",
  suffix: "Suffix", resolves: "wird aufgelöst", doesNotResolve: "wird nicht aufgelöst", noServerToAsk: "Es gibt keinen DNS-Server, der gefragt werden könnte.",
  notAskedNow: "Die Server konnten nicht gefragt werden: {why}",
  checksHint: "Der Rechner hat eben jeden Server nach der Wurzel gefragt und die ersten drei jeder Liste nach den Suffixen. „Neu lesen“ fragt wieder.",
  twice_finding: "{who} hat {what} zweimal; der Server wird kein zweites Mal gefragt.",
  notAsked_finding: "{what} wird nie gefragt: Die Adresse steht in /etc/resolv.conf nach den ersten drei Servern.",
  notAddress_finding: "{who} hat {what}; das ist keine Adresse eines Servers.",
  noServer_finding: "Weder eine Schnittstelle noch der Rechner hat einen DNS-Server.",
  moreFindings: "… und {count} weitere",
  interfaces: "Schnittstellen", interface: "Schnittstelle", filter: "Filter", filterHint: "Nach Name, Server, Domain oder Besitzer",
  shown: "{shown} von {all}", name: "Name", state: "Zustand", servers: "Server", domain: "Domain", owner: "Besitzer", from: "Von",
  noneMatch: "Keine Schnittstelle passt.", noInterface: "Dieser Rechner hat außer Loopback keine Schnittstelle.",
  serverOrder: "Server in der Reihenfolge, in der sie gefragt werden", profile: "Profil", origin: "Herkunft", hostName: "Rechnername", system: "System",
  serversOfOwner: "Server des Besitzers", settings: "Einstellungen", setting: "Einstellung", value: "Wert", bmc: "Serviceprozessor",
  from_file: "{file}", from_host: "Rechner", from_owner: "{owner}", from_set: "gesetzt, overlay.json", from_none: "–",
  ownerAndProfile: "{owner}, Profil {profile}", ownerAndFile: "{owner}, {profile}",
  noSuchInterface: "Dieser Rechner hat keine Schnittstelle {name}.", back: "Alle Schnittstellen", showGraph: "Im Graphen zeigen",
  changeInterface: "Server und Domain ändern", changeOf: "{what} ändern", oneEachLine: "Einer je Zeile, in der Reihenfolge, in der sie gefragt werden.",
  suffixHint: "Eines je Zeile, in der Reihenfolge, in der sie versucht werden.", domainHint: "Leer: keine.",
  confirmWithin: "Bestätigen innerhalb von", seconds: "{count} Sekunden", withoutConfirm: "Ohne Bestätigung: sofort behalten",
  confirmHint: "Ohne rechtzeitige Bestätigung schreibt diese Seite die früheren Werte zurück.",
  preview: "Vorschau", previewTitle: "Das würde sich ändern", now: "Jetzt", after: "Danach", object: "Objekt", apply: "Anwenden", edit: "Zurück",
  nothingChanges: "Nichts würde sich ändern.", fileMissing: "{property} würde nicht gespeichert: {file} gibt es nicht. Auf dem Rechner legt 'zorvactl ifcfg init {name}' die Datei an.",
  applied: "Auf Probe geändert. In {count} s wird es zurückgenommen, wenn Sie es nicht behalten.", keep: "Behalten", rollBack: "Jetzt zurücknehmen", kept: "Behalten.", stored: "Gespeichert.",
  rolledBack: "Zurückgenommen: Die früheren Werte sind wieder gespeichert.",
  rollBackFailed: "Die früheren Werte konnten nicht zurückgeschrieben werden: {why}", rollBackLost: "Der Server antwortet nicht; die Seite versucht weiter, die früheren Werte zurückzuschreiben.",
  changedMeanwhile: "Nicht zurückgenommen: {property} wurde inzwischen von jemand anderem geändert.",
  refused: "Abgelehnt: {why}", notStored: "{property} wurde nicht gespeichert; der Server sagt weiter {value}.",
  notAnAddress: "„{text}“ ist keine IP-Adresse. Ein Server wird mit seiner Adresse angegeben: 192.0.2.53 oder 2001:db8::53.",
  multicast: "„{text}“ ist eine Multicast-Adresse; kein Server hat eine.", unspecified: "„{text}“ ist die unbestimmte Adresse; kein Server hat sie.",
  notASuffix: "„{text}“ ist kein Suffix: Buchstaben, Ziffern, „-“ und „_“ zwischen einzelnen Punkten, höchstens 63 je Teil und 253 insgesamt.",
  notADomain: "„{text}“ ist kein Domainname: Buchstaben, Ziffern, „-“ und „_“ zwischen einzelnen Punkten, höchstens 63 je Teil und 253 insgesamt.",
  twice: "„{text}“ ist zweimal angegeben.",
  denied: "Das dürfen Sie nicht ändern. Melden Sie sich als jemand an, der es darf, oder fragen Sie den Verwalter des Servers.",
  lost: "Der Server antwortet nicht. Gezeigt wird der Stand von {time}; neuer Versuch …", lostFirst: "Der Server antwortet nicht; neuer Versuch …",
  back_again: "Der Server antwortet wieder.", needsLogin: "Der Server verlangt eine Anmeldung.", failed: "Das ist fehlgeschlagen: {why}",
  loginTitle: "Anmelden", user: "Benutzer", password: "Passwort", loginHint: "Name und Passwort bleiben, bis diese Seite geschlossen wird, und gehen nur an diesen Server.",
  loginPlain: "Der Server nimmt Anmeldungen nur über HTTPS an, und diese Seite kam über einfaches HTTP. Öffnen Sie sie mit ihrer https://-URL.",
  loginWrong: "Der Server hat diese Anmeldung nicht angenommen: {why}", loggedIn: "Angemeldet als {name}.", loggedOut: "Abgemeldet.",
  graphOf: "Assoziationen von {name}", graphHint: "Wählen Sie ein Objekt, um weiterzugehen. Pfeiltasten wechseln zwischen den Objekten, Enter geht weiter.",
  noAssociations: "Dieses Objekt hat keine Assoziationen.", more: "Mehr zeigen", shownOf: "{count} gezeigt; es gibt mehr.", properties: "Eigenschaften",
  property: "Eigenschaft", association: "Assoziation", farEnd: "Gegenüber", role: "Rolle", noKeys: "(ohne Schlüssel)", notThere: "Dieses Objekt kann nicht gelesen werden: {why}", asTable: "Dasselbe als Tabelle",
  footer: "Die Konsole von zorvacimd. Sie fragt den Server mit CIM-XML wie jeder CIM-Client.",
};

// CIM_EnabledLogicalElement.EnabledState, and what an owner says of the origin of its settings.
const words = {
  en: { 0: "Unknown", 1: "Other", 2: "Enabled", 3: "Disabled", 5: "Not Applicable", 6: "Enabled but Offline", static: "set by hand",
    learned: "learned", mixed: "set by hand and learned" },
  de: { 0: "Unbekannt", 1: "Anderer", 2: "Aktiv", 3: "Abgeschaltet", 5: "Nicht anwendbar", 6: "Aktiv, offline", static: "von Hand gesetzt",
    learned: "gelernt", mixed: "von Hand gesetzt und gelernt" },
};

const tables = { en, de };

/** The first of the browser's languages that the page has; English if it has none of them. */
function chosen(languages) {
  return languages.map((language) => language.toLowerCase().split("-")[0]).find((language) => language in tables) ?? "en";
}

export const language = chosen(navigator.languages ?? [navigator.language ?? "en"]);

/** The text of that name, with the values of its {places}. */
export function t(name, values = {}) {
  return tables[language][name].replace(/\{(\w+)\}/g, (_, place) => String(values[place] ?? ""));
}

/** The word for a value of the schema or the agent; the value itself where there is none. */
export const word = (value) => words[language][value] ?? String(value ?? "");

export const timeText = (date) => new Intl.DateTimeFormat(language, { timeStyle: "medium" }).format(date);
export const countText = (count) => new Intl.NumberFormat(language).format(count);
export const numberText = (number, digits) =>
  new Intl.NumberFormat(language, { minimumFractionDigits: digits, maximumFractionDigits: digits }).format(number);

/** For tests: the names that one language lacks. */
export const lacking = () => Object.keys({ ...en, ...de }).filter((name) => !(name in en) || !(name in de));
