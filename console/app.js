// The console: what is shown, and what happens when the server or its user says something.

import { CimClient } from "./cimxml.js";
import { breathe, h } from "./dom.js";
import { graphView, pathIn } from "./graph.js";
import { openLogin } from "./login.js";
import { SYSTEM, readHost } from "./model.js";
import { countText, language, t, timeText } from "./texts.js";
import { interfaceView, overview } from "./views.js";

const RETRY_MILLISECONDS = 3000;

class App {
  constructor() {
    this.client = new CimClient("/cimom", "root/cimv2");
    this.host = null;
    this.user = null;
    this.trial = null;
    this.filter = "";
    this.view = null;
    this.main = document.getElementById("main");
    this.notices = document.getElementById("notices");
    this.banner = h("p", { class: "notice error", hidden: true });
    this.message = h("p", { class: "notice", hidden: true });
    this.notices.append(this.banner, this.message);
  }

  start() {
    document.documentElement.lang = language;
    document.getElementById("skip").textContent = t("skip");
    document.getElementById("skip").addEventListener("click", (event) => {
      event.preventDefault();
      this.main.focus();
    });
    document.getElementById("foot").textContent = t("footer");
    this.#showTop();
    addEventListener("hashchange", () => this.show({ isWalk: true }));
    this.reload();
  }

  // ---- What the parts of the page call ----

  tell(text, kind = "info") {
    this.message.textContent = text;
    this.message.className = `notice ${kind}`;
    this.message.hidden = false;
  }

  loggedIn(name) {
    this.user = name;
    this.#showTop();
    this.tell(name === null ? t("loggedOut") : t("loggedIn", { name }));
    this.reload();
  }

  startTrial(trial) {
    this.trial = trial;
    this.message.hidden = true;
    this.notices.append(trial.element);
    trial.start();
  }

  trialEnded(text, kind) {
    this.trial = null;
    this.tell(text, kind);
    this.main.focus({ preventScroll: true });
    this.reload();
  }

  /** Reads the host again, as often as it takes. */
  async reload() {
    clearTimeout(this.again);
    this.run = (this.run ?? 0) + 1;
    const run = this.run;
    if (!this.host) this.#showText(location.hostname, t("loading"));
    try {
      const host = await readHost(this.client, (count) => this.#progress(count));
      if (run !== this.run) return;
      this.host = host;
      this.#answers();
      this.#showTop();
      await this.show();
    } catch (error) {
      if (run === this.run) this.#failed(error);
    }
  }

  // ---- The view ----

  /** Shows what the URL says. After a walk the heading gets the focus, so that a screen reader begins there. */
  async show({ isWalk = false } = {}) {
    if (!this.host) return;
    const [, name, rest] = /^#\/(\w*)\/?(.*)$/.exec(location.hash) ?? [null, "", ""];
    const ticket = (this.ticket = (this.ticket ?? 0) + 1);
    try {
      const view = name === "graph" ? await this.#graph(rest) : name === "interface" ? interfaceView(this, decodeURIComponent(rest)) : overview(this);
      if (ticket !== this.ticket) return view.stop?.();
      this.#place(view, isWalk);
      this.#markCurrent(name === "graph" ? "graph" : "overview");
    } catch (error) {
      if (ticket === this.ticket) this.#failed(error);
    }
  }

  async #graph(rest) {
    const path = rest === "" ? (await this.client.instanceNames(SYSTEM))[0] : pathIn(rest);
    if (!path) return overview(this);
    return graphView(this, path);
  }

  #place(view, isWalk) {
    this.view?.stop?.();
    this.view = view;
    const heading = h("h1", { tabindex: -1 }, view.title);
    this.main.replaceChildren(heading, view.element);
    document.title = `${view.title} – zorvacimd`;
    view.start?.();
    if (!isWalk) return;
    scrollTo(0, 0);
    heading.focus();
  }

  #showText(title, ...content) {
    this.view?.stop?.();
    this.view = null;
    this.main.replaceChildren(h("h1", {}, title), h("p", {}, content));
  }

  async #progress(count) {
    if (this.host || count === 0) return;
    this.main.querySelector("p").textContent = t("loadingMany", { count: countText(count) });
    await breathe();
  }

  #showTop() {
    const link = (name, href) => h("a", { href, "data-view": name }, t(name));
    const login = this.user === null
      ? h("button", { type: "button", onclick: () => openLogin(this) }, t("logIn"))
      : h("button", { type: "button", onclick: () => this.#logOut() }, t("logOut"));
    document.getElementById("top").replaceChildren(
      h("a", { class: "brand", href: "#/" }, this.host?.name ?? location.hostname),
      h("nav", { "aria-label": t("navigation") }, link("overview", "#/"), link("graph", "#/graph")),
      h("span", { class: "who" }, this.user ?? t("anonymous")), login,
      h("button", { type: "button", onclick: () => this.reload() }, t("refresh")),
      h("span", { class: "time" }, this.host ? t("asOf", { time: timeText(this.host.readAt) }) : ""));
    this.#markCurrent(/^#\/graph/.test(location.hash) ? "graph" : "overview");
  }

  #markCurrent(name) {
    for (const link of document.querySelectorAll("#top [data-view]")) {
      if (link.dataset.view === name) link.setAttribute("aria-current", "page");
      else link.removeAttribute("aria-current");
    }
  }

  #logOut() {
    this.client.login(null);
    this.loggedIn(null);
  }

  // ---- The server ----

  #answers() {
    if (this.banner.hidden) return;
    this.banner.hidden = true;
    if (this.message.hidden) this.tell(t("back_again"));  // what a change came to is not replaced
  }

  #failed(error) {
    if (error.status === 401) {
      this.#showText(location.hostname, t("needsLogin"));
      return openLogin(this);
    }
    const isLost = error.isLost === true;
    this.banner.textContent = !isLost ? t("failed", { why: error.message }) : this.host ? t("lost", { time: timeText(this.host.readAt) }) : t("lostFirst");
    this.banner.hidden = false;
    if (isLost) this.again = setTimeout(() => this.reload(), RETRY_MILLISECONDS);
  }
}

new App().start();
