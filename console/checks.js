// What the DNS servers answer, as zorvactl check shows it. The server asks them when the instances are read.

import { h } from "./dom.js";
import { countText, numberText, t } from "./texts.js";

const SERVER = "ZORVA_DNSServerCheck", SUFFIX = "ZORVA_DNSSuffixCheck";
const MOST_ROWS = 10, MOST_USERS = 5;

/** Both classes: {servers, suffixes}, each a list of properties, what is wrong first. */
async function readChecks(client) {
  const all = async (className, properties) => {
    const found = [];
    for await (const instances of client.instances(className, properties)) found.push(...instances.map((each) => each.properties));
    return found;
  };
  const servers = await all(SERVER, ["Server", "Answer", "IsGood", "ResponseTime", "UsedBy", "UserCount"]);
  const suffixes = await all(SUFFIX, ["Suffix", "Resolves", "UsedBy", "UserCount"]);
  const wrongFirst = (isWrong) => (a, b) => isWrong(b) - isWrong(a);
  return {
    servers: servers.sort(wrongFirst((each) => each.IsGood !== "TRUE")),
    suffixes: suffixes.sort(wrongFirst((each) => each.Resolves === "FALSE")),
  };
}

function users(check) {
  const named = (check.UsedBy ?? []).slice(0, MOST_USERS).map((name) => (name === "host" ? t("host") : name));
  const left = Number(check.UserCount ?? 0) - named.length;
  return named.join(", ") + (left > 0 ? ` ${t("moreFindings", { count: countText(left) })}` : "");
}

const state = (kind, text) => h("span", { class: `state ${kind}` }, text);

function time(check) {
  return check.ResponseTime === null || check.ResponseTime === undefined ? "–" : `${numberText(check.ResponseTime / 1000, 1)} ms`;
}

function suffixState(check) {
  if (check.Resolves === "TRUE") return state("good", t("resolves"));
  return check.Resolves === "FALSE" ? state("bad", t("doesNotResolve")) : state("middling", t("unknown"));
}

function table(titles, checks, cells) {
  const row = (check) => {
    const [first, ...others] = cells(check);
    return h("tr", {}, h("th", { scope: "row" }, first), others.map((each, i) => h("td", { "data-label": titles[i + 1] }, each)));
  };
  return h("div", { class: "scrolls" }, h("table", { class: "settings checks" },
    h("thead", {}, h("tr", {}, titles.map((title) => h("th", { scope: "col" }, title)))), h("tbody", {}, checks.slice(0, MOST_ROWS).map(row))),
  checks.length > MOST_ROWS && h("p", {}, t("moreFindings", { count: countText(checks.length - MOST_ROWS) })));
}

function content({ servers, suffixes }) {
  if (servers.length === 0) return h("p", {}, t("noServerToAsk"));
  return [
    table([t("server"), t("time"), t("answer"), t("usedBy")], servers,
      (each) => [each.Server, time(each), state(each.IsGood === "TRUE" ? "good" : "bad", each.Answer), users(each)]),
    suffixes.length > 0 && table([t("suffix"), t("answer"), t("usedBy")], suffixes, (each) => [each.Suffix, suffixState(each), users(each)]),
    h("p", { class: "hint" }, t("checksHint")),
  ].filter(Boolean);
}

/** A card that fills itself as soon as the servers have answered, or do not. They are asked once for each reading of the host. */
export function checksCard(app, host) {
  const place = h("div", { role: "status" }, h("p", {}, t("asking")));
  host.checks ??= readChecks(app.client);
  host.checks.then((checks) => place.replaceChildren(...[content(checks)].flat()),
    (error) => place.replaceChildren(h("p", {}, t("notAskedNow", { why: error.message }))));
  return h("section", { class: "card", id: "checks" }, h("h2", {}, t("checks")), place);
}
