// Elements of the page, without markup in texts: a text of the host is never read as HTML.

const SVG = "http://www.w3.org/2000/svg";

function fill(element, attributes, children) {
  for (const [name, value] of Object.entries(attributes)) {
    if (value === undefined || value === null || value === false) continue;
    if (name.startsWith("on")) element.addEventListener(name.slice(2), value);
    else element.setAttribute(name, value === true ? "" : String(value));
  }
  element.append(...children.flat(Infinity).filter((child) => child !== null && child !== undefined && child !== false));
  return element;
}

/** An element. An attribute "onclick" is a listener; false and null attributes and children are left out. */
export function h(name, attributes = {}, ...children) {
  return fill(document.createElement(name), attributes, children);
}

/** The same for SVG. */
export function svg(name, attributes = {}, ...children) {
  return fill(document.createElementNS(SVG, name), attributes, children);
}

/** Waits until the browser had time to paint and to take input. */
export function breathe() {
  return new Promise((resolve) => setTimeout(resolve, 0));
}

let lastId = 0;

/** An id that no other element has. */
export function newId(prefix) {
  lastId += 1;
  return `${prefix}-${lastId}`;
}

/** A labelled field. `control` gets an id; `hint` and errors are read after its label. */
export function field(label, control, hint) {
  control.id ||= newId("field");
  const hintId = hint ? `${control.id}-hint` : null;
  if (hintId) control.setAttribute("aria-describedby", hintId);
  return h("div", { class: "field" }, h("label", { for: control.id }, label), control,
    hint && h("p", { class: "hint", id: hintId }, hint));
}

/** Shows a modal dialog, and removes it when it is closed. The browser gives the focus back to where it was. */
export function openDialog(dialog) {
  document.body.append(dialog);
  dialog.addEventListener("close", () => dialog.remove());
  dialog.showModal();
  return dialog;
}
