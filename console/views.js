// The views of the host and of one interface.

import { ChangeDialog } from "./change.js";
import { checksCard } from "./checks.js";
import { field, h } from "./dom.js";
import { linkTo } from "./graph.js";
import { findingsOf, sourceOf } from "./model.js";
import { WindowedTable } from "./rows.js";
import { countText, t, word } from "./texts.js";

const MOST_FINDINGS = 20;
const GOOD = "2", BAD = "3";

const linkToInterface = (row) => `#/interface/${encodeURIComponent(row.key)}`;
const nameOf = (row) => (row.isServiceProcessor ? `${row.name} (${t("bmc")})` : row.name);

function stateOf(row) {
  const state = row.endpoint.EnabledState;
  if (state === null || state === undefined) return "–";
  const kind = state === GOOD ? "good" : state === BAD ? "bad" : "middling";
  return h("span", { class: `state ${kind}` }, word(state));
}

const list = (texts) => (texts?.length > 0 ? h("ol", { class: "plain" }, texts.map((text) => h("li", {}, text))) : t("none"));

/** Pairs of a name and a value; those whose value is nothing are left out. */
function facts(pairs) {
  return h("dl", {}, pairs.filter(([, value]) => value).map(([name, value]) => h("div", {}, h("dt", {}, name), h("dd", {}, value))));
}

function changeButton(app, text, target) {
  const button = h("button", { type: "button", class: "change", onclick: () => new ChangeDialog(app, target()).open() }, text);
  button.disabled = app.trial !== null;
  return button;
}

function hostCard(app, host) {
  const origin = host.origin;
  const suffixes = host.general?.properties.DNSSuffixesToAppend ?? [];
  const resolver = (name) => (origin[name]?.length > 0 ? list(origin[name]) : null);
  const place = origin.FileName && t(origin.File ? "suffixesFromFile" : "suffixesFromHost", { file: origin.FileName });
  return h("section", { class: "card" }, h("h2", {}, t("host")),
    facts([[t("programsAsk"), resolver("ResolverServers")], [t("neverAsked"), resolver("ResolverServersNotAsked")],
      [t("searchList"), resolver("ResolverSearch")], [t("asks", { owner: origin.Owner ?? "" }), resolver("OwnerServers")],
      [t("suffixes"), list(suffixes)]]),
    place && h("p", { class: "hint" }, place),
    host.general && changeButton(app, t("changeSuffixes"), () => ({
      what: t("suffixes"), path: host.general.path, properties: ["DNSSuffixesToAppend"], origin,
    })));
}

function findingsCard(host) {
  const findings = findingsOf(host);
  const item = (finding) => h("li", {}, t(`${finding.kind}_finding`, finding));
  return h("section", { class: "card" }, h("h2", {}, t("findings")),
    findings.length === 0 ? h("p", {}, t("noFindings")) : h("ul", { class: "findings" }, findings.slice(0, MOST_FINDINGS).map(item)),
    findings.length > MOST_FINDINGS && h("p", {}, t("moreFindings", { count: countText(findings.length - MOST_FINDINGS) })));
}

const cut = (texts, separator = " ") => {
  const text = texts.join(separator);
  return h("span", { title: text }, text || "–");
};

function interfaceTable() {
  return new WindowedTable(t("interfaces"), [
    { title: t("name"), className: "name" }, { title: t("state"), className: "state-cell" }, { title: t("servers"), className: "servers" },
    { title: t("domain"), className: "domain" }, { title: t("suffixes"), className: "suffixes" }, { title: t("from"), className: "from" },
  ], (row) => [h("a", { href: linkToInterface(row) }, nameOf(row)), stateOf(row), cut(row.servers), cut([row.domain]),
    cut(row.suffixes), cut([row.from])]);
}

/** The host at a glance. */
export function overview(app) {
  const { host } = app;
  const table = interfaceTable();
  const count = h("p", { class: "count", role: "status" });
  const input = h("input", { type: "search", spellcheck: "false", placeholder: t("filterHint") });
  input.value = app.filter;
  const filter = () => {
    app.filter = input.value;
    const words = input.value.toLowerCase().split(/\s+/).filter(Boolean);
    const rows = words.length === 0 ? host.rows : host.rows.filter((row) => words.every((each) => row.sought.includes(each)));
    table.show(rows);
    count.textContent = host.rows.length === 0 ? t("noInterface") : rows.length === 0 ? t("noneMatch")
      : t("shown", { shown: countText(rows.length), all: countText(host.rows.length) });
  };
  input.addEventListener("input", filter);
  filter();
  const element = h("div", {}, h("div", { class: "cards" }, hostCard(app, host), h("div", { class: "stack" }, findingsCard(host), checksCard(app, host))),
    h("section", { class: "card interfaces" }, h("div", { class: "bar" }, h("h2", {}, t("interfaces")), count, field(t("filter"), input)), table.element));
  return { title: t("of", { host: host.name }), element, start: () => table.start(), stop: () => table.stop() };
}

const SETTINGS = ["RequestedHostname", "DomainName", "DNSServerAddresses", "ConfigurationName"];

function sourceText(property, value, origin) {
  return t(`from_${sourceOf(property, value, origin)}`, { file: origin.File, owner: origin.Owner });
}

function settingsTable(row) {
  const line = (name) => {
    const value = row.setting[name];
    const texts = Array.isArray(value) ? value : value ? [value] : [];
    return h("tr", {}, h("th", { scope: "row" }, name), h("td", { "data-label": t("from") }, sourceText(name, value, row.origin)),
      h("td", { "data-label": t("value") }, texts.length === 0 ? "–" : texts.map((text) => h("div", {}, text))));
  };
  return h("table", { class: "settings" },
    h("thead", {}, h("tr", {}, [t("setting"), t("from"), t("value")].map((text) => h("th", { scope: "col" }, text)))),
    h("tbody", {}, SETTINGS.map(line)));
}

/** One interface with everything in full. */
export function interfaceView(app, key) {
  const row = app.host.row(key);
  const back = h("p", {}, h("a", { href: "#/" }, `← ${t("back")}`));
  if (!row) {
    const text = t("noSuchInterface", { name: key });
    return { title: text, element: back };
  }
  const { origin } = row;
  const head = h("section", { class: "card" }, h("h2", {}, t("interface")), facts([
    [t("state"), stateOf(row)], [t("from"), row.from], [t("owner"), origin.Owner], [t("profile"), origin.OwnerProfile],
    [t("origin"), origin.OwnerOrigin && word(origin.OwnerOrigin)], [t("servers"), list(row.servers)],
    [t("serversOfOwner"), origin.File && origin.OwnerServers?.length > 0 ? list(origin.OwnerServers) : null],
    [t("domain"), row.domain || t("none")], [t("suffixes"), list(row.suffixes)], [t("hostName"), row.endpoint.Hostname], [t("system"), row.endpoint.SystemName],
  ]), h("p", { class: "buttons left" },
    row.settingPath && changeButton(app, t("changeInterface"), () => ({
      what: row.name, path: row.settingPath, properties: ["DNSServerAddresses", "DomainName"], origin,
    })),
    row.endpointPath && h("a", { class: "button", href: linkTo(row.endpointPath) }, t("showGraph"))));
  const settings = h("section", { class: "card" }, h("h2", {}, t("settings")), h("div", { class: "scrolls" }, settingsTable(row)));
  return { title: nameOf(row), element: h("div", {}, back, h("div", { class: "cards" }, head, settings)) };
}
