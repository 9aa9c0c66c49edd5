// The body of a function that returns what is wrong with the page for people who use a keyboard or a screen reader, or who see
// little: a list of sentences. It is a small part of what WCAG 2.1 asks for, and the part that a machine can see.
const wrong = [];
const isShown = (element) => element.checkVisibility({ visibilityProperty: true }) && element.getClientRects().length > 0;
const describe = (element) => `<${element.tagName.toLowerCase()} class="${element.getAttribute("class") ?? ""}"> "${element.textContent.trim().slice(0, 40)}"`;
const dialog = document.querySelector("dialog[open]");
const scope = dialog ?? document.body;

// One heading of the first level, and no level is left out.
const headings = [...document.querySelectorAll("h1, h2, h3, h4")].filter(isShown);
if (headings.filter((each) => each.tagName === "H1").length !== 1) wrong.push("there is not one h1");
headings.reduce((before, each) => {
  const level = Number(each.tagName[1]);
  if (level > before + 1) wrong.push(`${describe(each)} leaves out a level`);
  return level;
}, 0);

// Landmarks, language, title.
for (const name of ["header", "nav", "main", "footer"]) {
  if (document.querySelectorAll(name).length !== 1) wrong.push(`there is not one ${name}`);
}
if (!["en", "de"].includes(document.documentElement.lang)) wrong.push("the page has no language");
if (!document.title) wrong.push("the page has no title");

// Names.
const labelled = (element) => (element.getAttribute("aria-labelledby") ?? "").split(" ").filter(Boolean)
  .map((id) => document.getElementById(id)?.textContent ?? "").join(" ");
const nameOf = (element) => (labelled(element) || element.getAttribute("aria-label") ||
  [...(element.labels ?? [])].map((label) => label.textContent).join(" ") || (element.matches("input, textarea, select") ? "" : element.textContent)).trim();
for (const element of scope.querySelectorAll("a[href], button, input, textarea, select, summary, [tabindex='0']")) {
  if (isShown(element) && !nameOf(element)) wrong.push(`${describe(element)} has no name`);
}
for (const element of document.querySelectorAll("dialog, nav, [role=table], [role=group], section.trial")) {
  if (isShown(element) && !(labelled(element) || element.getAttribute("aria-label"))) wrong.push(`${describe(element)} has no name`);
}
const ids = [...document.querySelectorAll("[id]")].map((each) => each.id);
for (const id of new Set(ids)) if (ids.filter((each) => each === id).length > 1) wrong.push(`the id ${id} is there twice`);
for (const element of document.querySelectorAll("[tabindex]")) {
  if (element.tabIndex > 0) wrong.push(`${describe(element)} changes the order of the keyboard`);
}

// Contrast: 4.5:1 of each text to what is behind it (3:1 for large text).
const canvas = document.createElement("canvas").getContext("2d", { willReadFrequently: true });
const rgb = (color) => {
  canvas.clearRect(0, 0, 1, 1);
  canvas.fillStyle = color;
  canvas.fillRect(0, 0, 1, 1);
  const [r, g, b, a] = canvas.getImageData(0, 0, 1, 1).data;
  return { r, g, b, a: a / 255 };
};
const luminance = ({ r, g, b }) => [r, g, b].map((c) => c / 255).map((c) => (c <= 0.04045 ? c / 12.92 : ((c + 0.055) / 1.055) ** 2.4))
  .reduce((sum, c, i) => sum + c * [0.2126, 0.7152, 0.0722][i], 0);
const over = (top, below) => ({ r: top.r * top.a + below.r * (1 - top.a), g: top.g * top.a + below.g * (1 - top.a), b: top.b * top.a + below.b * (1 - top.a), a: 1 });
const behind = (element) => {
  const layers = [];
  for (let each = element; each; each = each.parentElement) {
    const svgBox = each.matches?.("svg .node") ? each.querySelector("rect") : null;
    const color = rgb(svgBox ? getComputedStyle(svgBox).fill : getComputedStyle(each).backgroundColor);
    if (color.a > 0) layers.push(color);
    if (color.a === 1) break;
  }
  return layers.reverse().reduce((below, layer) => over(layer, below), { r: 255, g: 255, b: 255, a: 1 });
};
const texts = document.createTreeWalker(scope, NodeFilter.SHOW_TEXT);
const seen = new Set();
while (texts.nextNode()) {
  const element = texts.currentNode.parentElement;
  if (!texts.currentNode.textContent.trim() || seen.has(element) || !isShown(element) || element.closest("title, option, :disabled")) continue;
  seen.add(element);
  const style = getComputedStyle(element);
  const back = behind(element);
  let front = rgb(element.closest("svg") ? style.fill : style.color);
  front = over({ ...front, a: front.a * Number(style.opacity) }, back);
  const [low, high] = [luminance(front), luminance(back)].sort((a, b) => a - b);
  const ratio = (high + 0.05) / (low + 0.05);
  const size = parseFloat(style.fontSize);
  const needed = size >= 24 || (size >= 18.66 && Number(style.fontWeight) >= 700) ? 3 : 4.5;
  if (ratio < needed) wrong.push(`${describe(element)} has a contrast of ${ratio.toFixed(2)}`);
}

// No horizontal scrolling.
const overflow = document.documentElement.scrollWidth - document.documentElement.clientWidth;
if (overflow > 0) wrong.push(`the page is ${overflow} px wider than the window`);
return wrong;
