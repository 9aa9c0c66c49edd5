// The dialog for a login.

import { field, h, newId, openDialog } from "./dom.js";
import { SYSTEM } from "./model.js";
import { t } from "./texts.js";

/** Whether a password that is sent from here is encrypted on its way. */
const isSecure = () => location.protocol === "https:";

export function openLogin(app) {
  const titleId = newId("title");
  const problem = h("p", { class: "problem", role: "alert" });
  const cancel = h("button", { type: "button", onclick: () => dialog.close() }, isSecure() ? t("cancel") : t("close"));
  const dialog = h("dialog", { "aria-labelledby": titleId }, h("h2", { id: titleId }, t("loginTitle")),
    isSecure() ? loginForm(app, problem, cancel, () => dialog.close()) : [h("p", {}, t("loginPlain")), h("div", { class: "buttons" }, cancel)], problem);
  openDialog(dialog);
}

function loginForm(app, problem, cancel, close) {
  const user = h("input", { type: "text", name: "user", autocomplete: "username", autocapitalize: "none", spellcheck: "false" });
  const password = h("input", { type: "password", name: "password", autocomplete: "current-password" });
  const submit = h("button", { type: "submit", class: "primary" }, t("logIn"));
  const send = async (event) => {
    event.preventDefault();
    problem.textContent = "";
    submit.disabled = true;
    const why = await tryLogin(app.client, user.value, password.value);
    submit.disabled = false;
    password.value = "";
    if (why !== null) {
      problem.textContent = t("loginWrong", { why });
      password.focus();
      return;
    }
    close();
    app.loggedIn(user.value);
  };
  return h("form", { onsubmit: send }, field(t("user"), user), field(t("password"), password, t("loginHint")),
    h("div", { class: "buttons" }, cancel, submit));
}

/** Null if the server takes the login; else the reason, and the client is logged in as before. */
async function tryLogin(client, name, password) {
  const before = client.authorization;
  client.login(name, password);
  try {
    await client.instanceNames(SYSTEM);
    return null;
  } catch (error) {
    if (error.code) return null; // it is let in; what it may do is another matter
    client.authorization = before;
    return error.message;
  }
}
