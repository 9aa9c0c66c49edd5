// The associations of one object as a picture, and the way on to its far ends.

import { h, svg } from "./dom.js";
import { t } from "./texts.js";

const AT_ONCE = 24;
const NODE = { width: 290, height: 66, gap: 14 };
const NARROW = 760; // below this width the far ends are listed under the object

// Ends that stand above the other one, and so on the left.
const UPPER = new Set(["Antecedent", "ManagedElement", "GroupComponent"]);

const shortClass = (name) => name.replace(/^(ZORVA|CIM)_/, "");

/** The text by which a person knows an object. */
export function labelOf(path) {
  const keys = Object.fromEntries(path.keys);
  return keys.InstanceID ?? keys.Name ?? path.keys.map(([, value]) => value).join(" ");
}

export const linkTo = (path) => `#/graph/${encodeURIComponent(JSON.stringify([path.className, path.keys]))}`;

/** The path in a link; null if there is none in it. */
export function pathIn(text) {
  try {
    const [className, keys] = JSON.parse(decodeURIComponent(text));
    const isGood = typeof className === "string" && keys.every((key) => key.length === 2 && key.every((each) => typeof each === "string"));
    return isGood ? { className, keys } : null;
  } catch {
    return null;
  }
}

const identity = (path) => JSON.stringify([path.className.toLowerCase(), path.keys.map(([name, value]) => [name.toLowerCase(), value]).sort()]);

/** The far end of an association as seen from an object: {association, role, path}. */
function farEndOf(association, near) {
  const ends = association.keys.filter(([, value]) => typeof value === "object");
  const own = identity(near);
  const at = ends.findIndex(([, value]) => identity(value) === own);
  const far = ends.find((_, i) => i !== Math.max(at, 0)) ?? ends[0];
  return { association: association.className, role: far[0], path: far[1] };
}

function fitted(text, room) {
  return text.length <= room ? text : `${text.slice(0, room - 1)}…`;
}

/** The width of a character on average, by the class of its line. */
const CHARACTER = { small: 6.9, class: 7.6, name: 8.8 };

function nodeOf({ x, y, width, lines, label, link, isFocus }) {
  const first = (NODE.height - (lines.length - 1) * 18) / 2 + 5;
  const texts = lines.map(([text, className], i) => svg("text", { x: 14, y: first + i * 18, class: className },
    fitted(text, Math.floor((width - 24) / CHARACTER[className]))));
  const box = svg("rect", { width, height: NODE.height, rx: 8 });
  const group = { transform: `translate(${x} ${y})`, class: isFocus ? "node focus" : link ? "node" : "node dead" };
  const content = [svg("title", {}, label), box, texts];
  return link ? svg("a", { href: link, "aria-label": label, ...group }, content) : svg("g", group, content);
}

const edge = (from, to, isNarrow) => svg("path", {
  class: "edge",
  d: isNarrow ? `M ${from.x} ${from.y} V ${to.y} H ${to.x}` : `M ${from.x} ${from.y} C ${(from.x + to.x) / 2} ${from.y} ${(from.x + to.x) / 2} ${to.y} ${to.x} ${to.y}`,
});

const stackHeight = (count) => count * (NODE.height + NODE.gap) - NODE.gap;

function farNode(end, x, y, width) {
  const isDead = end.path.keys.length === 0;
  const name = isDead ? t("noKeys") : labelOf(end.path);
  return nodeOf({
    x, y, width, link: isDead ? null : linkTo(end.path),
    lines: [[`${end.role} · ${shortClass(end.association)}`, "small"], [shortClass(end.path.className), "class"], [name, "name"]],
    label: `${shortClass(end.association)}, ${end.role}: ${shortClass(end.path.className)} ${name}`,
  });
}

function wide(focus, ends, width) {
  const sides = [ends.filter((end) => UPPER.has(end.role)), ends.filter((end) => !UPPER.has(end.role))];
  const height = Math.max(NODE.height, ...sides.map((side) => stackHeight(side.length)));
  const columns = sides.filter((side) => side.length > 0).length + 1;
  const nodeWidth = Math.min(NODE.width, Math.floor((width - 120) / 3));
  const gap = Math.min(190, (width - columns * nodeWidth) / Math.max(1, columns - 1));
  const used = columns * nodeWidth + (columns - 1) * gap;
  const center = { x: sides[0].length > 0 ? nodeWidth + gap : 1, y: (height - NODE.height) / 2 };
  const middle = height / 2;
  const parts = sides.flatMap((side, which) => side.map((end, i) => {
    const top = (height - stackHeight(side.length)) / 2 + i * (NODE.height + NODE.gap);
    const x = which === 0 ? 1 : used - nodeWidth - 1;
    const from = { x: which === 0 ? center.x : center.x + nodeWidth, y: middle };
    const to = { x: which === 0 ? x + nodeWidth : x, y: top + NODE.height / 2 };
    return [edge(from, to, false), farNode(end, x, top, nodeWidth)];
  }));
  return { height, edges: parts.map(([line]) => line), nodes: [focusNode(focus, center.x, center.y, nodeWidth), ...parts.map(([, node]) => node)] };
}

function narrow(focus, ends, width) {
  const indent = 28, nodeWidth = width - indent - 2;
  const top = (i) => (i + 1) * (NODE.height + NODE.gap);
  const edges = ends.map((_, i) => edge({ x: indent / 2, y: NODE.height }, { x: indent, y: top(i) + NODE.height / 2 }, true));
  const nodes = ends.map((end, i) => farNode(end, indent, top(i), nodeWidth));
  return { height: stackHeight(ends.length + 1), edges, nodes: [focusNode(focus, 1, 0, nodeWidth), ...nodes] };
}

function focusNode(path, x, y, width) {
  const lines = [[shortClass(path.className), "class"], [labelOf(path), "name"]];
  return nodeOf({ x, y, width, lines, label: `${shortClass(path.className)} ${labelOf(path)}`, isFocus: true });
}

function moveAmong(event) {
  const step = { ArrowDown: 1, ArrowRight: 1, ArrowUp: -1, ArrowLeft: -1 }[event.key];
  if (!step) return;
  const links = [...event.currentTarget.querySelectorAll("a")];
  const next = links[links.indexOf(event.target.closest("a")) + step];
  if (!next) return;
  event.preventDefault();
  next.focus();
}

function picture(path, ends, width) {
  const { height, edges, nodes } = width < NARROW ? narrow(path, ends, width) : wide(path, ends, width);
  return svg("svg", { viewBox: `0 -1 ${width} ${height + 2}`, width, height: height + 2, role: "group", onkeydown: moveAmong,
    "aria-label": t("graphOf", { name: labelOf(path) }) }, edges, nodes);
}

function endsTable(ends) {
  const row = (end) => h("tr", {}, h("td", {}, end.association), h("td", {}, end.role), h("td", {},
    end.path.keys.length === 0 ? `${end.path.className} ${t("noKeys")}` : h("a", { href: linkTo(end.path) }, `${end.path.className} ${labelOf(end.path)}`)));
  return h("details", {}, h("summary", {}, t("asTable")), h("div", { class: "scrolls" }, h("table", {},
    h("thead", {}, h("tr", {}, [t("association"), t("role"), t("farEnd")].map((text) => h("th", { scope: "col" }, text)))),
    h("tbody", {}, ends.map(row)))));
}

function propertiesTable(instance) {
  const text = (value) => (value === null ? "–" : Array.isArray(value) ? value.map((each) => h("div", {}, each)) : typeof value === "object" ? labelOf(value) : value);
  const rows = Object.entries(instance.properties).filter(([, value]) => value !== null && value.length !== 0);
  return h("table", { class: "facts" }, h("tbody", {}, rows.map(([name, value]) => h("tr", {}, h("th", { scope: "row" }, name), h("td", {}, text(value))))));
}

/** Takes up to `count` far ends more. */
async function take(pieces, near, count) {
  const ends = [];
  while (ends.length < count && !pieces.isDone) {
    if (pieces.left.length === 0) {
      const { value, done } = await pieces.source.next();
      if (done) pieces.isDone = true;
      else pieces.left = value;
      continue;
    }
    ends.push(...pieces.left.splice(0, count - ends.length).map((each) => farEndOf(each, near)));
  }
  if (pieces.left.length === 0 && !pieces.isDone) {
    const { value, done } = await pieces.source.next();
    pieces.isDone = done ?? false;
    pieces.left = value ?? [];
  }
  return ends;
}

/** The view of one object. `stop()` of the result ends what it still reads. */
export async function graphView(app, path) {
  const pieces = { source: app.client.referenceNames(path), left: [], isDone: false };
  let ends = await take(pieces, path, AT_ONCE);
  const instance = await app.client.getInstance(path).catch((error) => error);
  const frame = h("div", { class: "graph" });
  const rest = h("div", {});
  const draw = () => frame.replaceChildren(picture(path, ends, Math.max(280, Math.floor(frame.clientWidth || 900))));
  const describe = () => {
    const isMore = pieces.left.length > 0;
    const more = async () => {
      ends = [...ends, ...await take(pieces, path, AT_ONCE)];
      draw();
      describe();
    };
    rest.replaceChildren(...[ends.length === 0 && h("p", {}, t("noAssociations")),
      isMore && h("p", {}, t("shownOf", { count: ends.length }), " ", h("button", { type: "button", onclick: more }, t("more"))),
      ends.length > 0 && endsTable(ends)].filter(Boolean));
  };
  describe();
  const observer = new ResizeObserver(draw);
  const element = h("div", {}, h("p", { class: "hint" }, t("graphHint")), frame, rest,
    h("section", { class: "card" }, h("h2", {}, t("properties")),
      instance instanceof Error ? h("p", {}, t("notThere", { why: instance.message })) : propertiesTable(instance)));
  return {
    title: t("graphOf", { name: labelOf(path) }), element,
    start: () => observer.observe(frame),
    stop: () => { observer.disconnect(); pieces.source.return(); },
  };
}
