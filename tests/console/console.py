#!/usr/bin/env python3
"""Uses the console of a real zorvacimd in a real browser, Debian's Chromium, and looks for what people would complain of.

    console.py BUILD SHOTS [CASE...]    BUILD: the folder with bin/; SHOTS: where the screenshots go; exits 1 if a case fails

Browser and servers are in a network namespace of their own, with nothing but loopback in it. That needs root; without, it is skipped.
"""
import json
import os
import pathlib
import subprocess
import sys
import tempfile
import time
import traceback

from server import PASSWORDS, THIS_HOST, DnsServer, Server, USUAL, host, interface, large_host, usual_host
from webdriver import Browser

HERE = pathlib.Path(__file__).resolve().parent
ACCESSIBLE = (HERE / "accessible.js").read_text(encoding="utf-8")
SKIPPED = 77
MANY = 10_000
MOST_ROWS = 100  # in the document, however many interfaces there are
TIME_PASSES = "const real = Date.now; Date.now = () => real() + 1000000;"
ETH0 = "#/interface/Computer%25eth0"
VIEWS = {"overview": "#/", "interface": ETH0, "graph": "#/graph"}
LOADED = "return document.querySelector('main h1') !== null && document.querySelector('main .card') !== null;"

CASES = []


def case(function):
    CASES.append(function)
    return function


class Test:
    """What a case has: servers that it asks for, and a browser, which all end with it."""

    def __init__(self, build, shots):
        self.build, self.shots = build, shots
        self.folder = tempfile.TemporaryDirectory(prefix="zorva-console-")
        self.servers, self.browsers = [], []
        self.figures = []

    def server(self, tree=None, **more):
        folder = pathlib.Path(self.folder.name) / f"server{len(self.servers)}"
        self.servers.append(Server(self.build, folder, tree or usual_host(), **more))
        return self.servers[-1]

    def browser(self, **more):
        self.browsers.append(Browser(**more))
        return self.browsers[-1]

    def editable(self):
        """A server on which eth0 has a settings file, and where nobody needs to log in; and a browser that shows eth0."""
        server = self.server(anonymous="operate")
        server.control("ifcfg", "init", "eth0")
        browser = self.browser()
        show(browser, server.plain + ETH0)
        return server, browser

    def close(self):
        for each in self.browsers:
            each.close()
        for each in self.servers:
            each.stop()
        self.folder.cleanup()


def show(browser, url):
    browser.open("about:blank")
    browser.open(url)
    browser.wait(LOADED, "the view")


def expect(condition, text):
    if not condition:
        raise AssertionError(text)


def expect_equal(found, wanted):
    expect(found == wanted, f"found {found!r} instead of {wanted!r}")


def expect_accessible(browser, where):
    wrong = browser.run(ACCESSIBLE)
    expect(not wrong, f"{where}: " + "; ".join(wrong))


def expect_no_complaints(browser):
    expect_equal(browser.complaints(), [])


def edit(browser, servers=None, domain=None):
    """Fills in the dialog and goes on to its preview."""
    browser.click_text("Change servers and domain")
    browser.wait("return document.querySelector('dialog textarea') !== null;", "the form")
    if servers is not None:
        browser.type("dialog textarea", "\n".join(servers))
    if domain is not None:
        browser.type("dialog input", domain)
    browser.click_text("Preview", "dialog")


def apply_on_trial(browser, servers):
    edit(browser, servers)
    browser.wait_text("This would change", "dialog")
    browser.click_text("Apply", "dialog")
    browser.wait("return document.querySelector('.trial') !== null;", "the trial")


# ---- Reading ----


def expect_rows_of_zorvactl(server, browser):
    """Returns the names of the interfaces."""
    rows = browser.run("return [...document.querySelectorAll('.rows .row')].map((row) => [...row.children].map((cell) => cell.innerText.trim()));")
    shown = {row[0]: row for row in rows}
    document = json.loads(server.control("show", "--all", "--output", "json"))
    expect_equal(sorted(shown), sorted(each["name"] for each in document["interfaces"]))
    for each in document["interfaces"]:
        wanted = [each["name"], each["state_word"], " ".join(each["servers"]) or "–", each["domain_name"] or "–", " ".join(each["suffixes"]) or "–"]
        expect_equal(shown[each["name"]], [*wanted, each["from"] or "–"])
    return sorted(shown)


@case
def overview_says_what_zorvactl_says(test):
    server, browser = test.server(), test.browser()
    show(browser, server.plain)
    expect_rows_of_zorvactl(server, browser)
    for text in ("198.51.100.2 is never asked", "vpn0 has 2001:DB8:0:7:0::53 twice", "The suffixes are from the host"):
        browser.wait_text(text)
    expect_no_complaints(browser)


@case
def real_host_is_shown_and_seen_to_change(test):
    server, browser = test.server(THIS_HOST), test.browser()
    subprocess.run(["ip", "link", "add", "lan0", "type", "veth", "peer", "name", "lan1"], check=True)
    try:
        show(browser, server.plain)
        expect("lan0" in expect_rows_of_zorvactl(server, browser), "the interface is missing")
    finally:
        subprocess.run(["ip", "link", "delete", "lan0"], check=True)
    browser.click_text("Refresh")
    browser.wait("return !document.querySelector('main').innerText.includes('lan0');", "the end of the interface")


@case
def interface_says_where_each_setting_comes_from(test):
    server, browser = test.server(), test.browser()
    sources = "return [...document.querySelectorAll('.settings tbody tr')].map((row) => [...row.children].map((cell) => cell.innerText));"
    show(browser, server.plain + ETH0)
    expect_equal(browser.run(sources)[2], ["DNSServerAddresses", "NetworkManager", "192.0.2.53\n2001:db8::53"])
    server.control("ifcfg", "init", "eth0")
    browser.click_text("Refresh")
    browser.wait_text("ifcfg-eth0", ".settings")
    expect_equal(browser.run(sources)[2][1], "ifcfg-eth0")
    browser.wait_text("Servers of the owner")


CHECKS = "return [...document.querySelectorAll('.checks tbody tr')].map((row) => [...row.children].map((cell) => cell.innerText));"


@case
def checks_say_what_zorvactl_check_says(test):
    good, wrong = DnsServer(), DnsServer(code=3)
    tree = host(*(interface(name, **{**USUAL, "dns_suffixes": [suffix]}, dns_server_addresses=["127.0.0.1"], dns_servers_in_full=[dns.address])
                  for name, suffix, dns in [("eth0", "example.org", good), ("eth1", "example.net", wrong)]))
    server, browser = test.server(tree), test.browser()
    show(browser, server.plain)
    browser.wait_text("Refresh asks again", "#checks")
    rows = browser.run(CHECKS)
    expect_equal([[row[0], *row[2:]] for row in rows[:2]], [[wrong.address, "NXDOMAIN", "eth1"], [good.address, "NOERROR", "eth0"]])
    expect_equal(rows[2:], [["example.net", "does not resolve", "eth1"], ["example.org", "resolves", "eth0"]])
    found = json.loads(server.control("check", "--output", "json", check=False))
    expect_equal({each["server"]: each["code"] for each in found["servers"]}, {row[0]: row[2] for row in rows[:2]})
    expect_equal({each["suffix"]: each["resolves"] for each in found["suffixes"]}, {row[0]: row[1] == "resolves" for row in rows[2:]})
    expect_accessible(browser, "checks")
    expect_no_complaints(browser)
    server.write_tree(host(interface("eth0", **USUAL, dns_server_addresses=["127.0.0.1"], dns_servers_in_full=[good.address])))
    browser.click_text("Refresh")
    browser.wait("return !document.querySelector('#checks').innerText.includes('NXDOMAIN');", "answers of the servers that are left")


@case
def checks_of_a_host_without_servers_say_so(test):
    server, browser = test.server(host(interface("eth0", **USUAL))), test.browser()
    show(browser, server.plain)
    browser.wait_text("There is no DNS server to ask", "#checks")


@case
def filter_finds_interfaces(test):
    server, browser = test.server(), test.browser()
    show(browser, server.plain)
    browser.type("input[type=search]", "storage")
    browser.wait_text("1 of 4", ".count")
    expect_equal(browser.run("return document.querySelectorAll('.rows .row').length;"), 1)
    browser.type("input[type=search]", "no such thing")
    browser.wait_text("No interface matches", ".count")


@case
def texts_of_the_host_are_no_markup(test):
    name = "<b onclick=alert(1)>&amp;\"'"
    server = test.server(host(interface(name, domain_name="<script>x", dns_server_addresses=["<i>192.0.2.1</i>"], enabled_state=1)))
    browser = test.browser()
    show(browser, server.plain)
    browser.wait_text(name, ".rows")
    browser.run("document.querySelector('.rows a').click();")
    browser.wait_text(name, "h1")
    expect_equal(browser.run("return document.querySelectorAll('main b, main i, main script').length;"), 0)
    expect_no_complaints(browser)


# ---- Changing ----


@case
def change_is_kept_after_confirmation(test):
    server, browser = test.editable()
    edit(browser, ["192.0.2.1", "192.0.2.2"], "new.example.org")
    browser.wait_text("192.0.2.53\n2001:db8::53", "dialog .preview")
    expect_equal(server.servers_of("eth0"), ["192.0.2.53", "2001:db8::53"])
    expect_accessible(browser, "the preview")
    browser.screenshot(test.shots / "preview.png")
    browser.click_text("Apply", "dialog")
    browser.wait("return document.querySelector('.trial') !== null;", "the trial")
    expect_equal(server.servers_of("eth0"), ["192.0.2.1", "192.0.2.2"])
    browser.wait_text("It is taken back in", ".trial")
    browser.wait_text("ifcfg-eth0", ".settings")
    expect_accessible(browser, "the trial")
    browser.screenshot(test.shots / "trial.png")
    expect_equal(browser.run("return document.activeElement.textContent;"), "Keep")
    browser.press("Enter")
    browser.wait_text("Kept.", "#notices")
    browser.wait_text("new.example.org", ".settings")
    expect_equal(server.servers_of("eth0"), ["192.0.2.1", "192.0.2.2"])
    expect_no_complaints(browser)


@case
def suffixes_of_the_host_are_changed(test):
    server, browser = test.editable()
    show(browser, server.plain)
    browser.click_text("Change the suffixes")
    browser.wait("return document.querySelector('dialog textarea') !== null;", "the form")
    browser.type("dialog textarea", "one.example.org\ntwo.example.org")
    browser.run("document.querySelector('dialog select').value = '0';")
    browser.click_text("Preview", "dialog")
    browser.wait_text("This would change", "dialog")
    browser.click_text("Apply", "dialog")
    browser.wait_text("Stored.", "#notices")
    expect_equal(server.control("suffixes", "show").split(), ["one.example.org", "two.example.org"])


@case
def change_without_confirmation_is_taken_back(test):
    server, browser = test.editable()
    apply_on_trial(browser, ["192.0.2.1"])
    expect_equal(server.servers_of("eth0"), ["192.0.2.1"])
    browser.run(TIME_PASSES)
    browser.wait_text("Rolled back", "#notices")
    expect_equal(server.servers_of("eth0"), ["192.0.2.53", "2001:db8::53"])


@case
def change_is_taken_back_at_once(test):
    server, browser = test.editable()
    apply_on_trial(browser, [])
    expect_equal(server.servers_of("eth0"), [])
    browser.click_text("Roll back now")
    browser.wait_text("Rolled back", "#notices")
    expect_equal(server.servers_of("eth0"), ["192.0.2.53", "2001:db8::53"])


@case
def change_is_taken_back_when_the_page_is_left(test):
    server, browser = test.editable()
    apply_on_trial(browser, ["192.0.2.1"])
    browser.open("about:blank")
    deadline = time.monotonic() + 10
    while server.servers_of("eth0") != ["192.0.2.53", "2001:db8::53"]:
        expect(time.monotonic() < deadline, f"the servers are still {server.servers_of('eth0')}")
        time.sleep(0.2)


@case
def change_of_somebody_else_is_not_taken_back(test):
    server, browser = test.editable()
    apply_on_trial(browser, ["192.0.2.1"])
    server.control("dns", "set", "eth0", "192.0.2.9")
    browser.click_text("Roll back now")
    browser.wait_text("somebody else has changed DNSServerAddresses", "#notices")
    expect_equal(server.servers_of("eth0"), ["192.0.2.9"])


@case
def wrong_values_are_refused_before_they_are_sent(test):
    server, browser = test.editable()
    cases = [(["192.0.2.300"], None, "'192.0.2.300' is no IP address"), (["224.0.0.1"], None, "multicast"), (["::"], None, "unspecified"),
             (["192.0.2.1", "::ffff:192.0.2.1"], None, "given twice"), (None, "two..dots", "is no domain name")]
    for servers, domain, why in cases:
        edit(browser, servers, domain)
        browser.wait_text(why, "dialog .problem")
        expect_equal(browser.run("return document.activeElement.getAttribute('aria-invalid');"), "true")
        browser.click_text("Cancel", "dialog")
    expect("ModifyInstance" not in (server.folder / "log").read_text(), "something was sent")


@case
def change_that_cannot_be_stored_is_refused_with_the_reason(test):
    server, browser = test.server(anonymous="operate"), test.browser()
    show(browser, server.plain + ETH0)
    edit(browser, ["192.0.2.1"])
    browser.wait_text("would not be stored: ifcfg-eth0 does not exist", "dialog")
    browser.click_text("Apply", "dialog")
    browser.wait_text("'zorvactl ifcfg init eth0' makes it, then repeat this", "dialog .problem")
    expect_accessible(browser, "the refusal")
    expect_equal(server.servers_of("eth0"), ["192.0.2.53", "2001:db8::53"])


@case
def change_of_a_client_that_may_only_read_is_denied(test):
    server, browser = test.server(), test.browser()
    server.control("ifcfg", "init", "eth0")
    show(browser, server.plain + ETH0)
    edit(browser, ["192.0.2.1"])
    browser.click_text("Apply", "dialog")
    browser.wait_text("You may not change this", "dialog .problem")
    expect_equal(server.servers_of("eth0"), ["192.0.2.53", "2001:db8::53"])


# ---- Connection and login ----


@case
def lost_connection_is_said_and_mended(test):
    server, browser = test.server(), test.browser()
    show(browser, server.plain)
    server.stop()
    browser.click_text("Refresh")
    browser.wait_text("The server does not answer. What is shown is as of", "#notices")
    expect_accessible(browser, "without a server")
    browser.screenshot(test.shots / "lost.png")
    expect("eth0" in browser.text("main"), "what was read is gone")
    server.start()
    browser.wait_text("The server answers again", "#notices")
    expect_equal(browser.run("return document.querySelector('.notice.error').hidden;"), True)


@case
def trial_ends_when_the_server_is_back(test):
    server, browser = test.editable()
    apply_on_trial(browser, ["192.0.2.1"])
    server.stop()
    browser.run(TIME_PASSES)
    browser.wait_text("goes on trying to write the former values back", "#notices")
    expect_equal(server.servers_of("eth0"), ["192.0.2.1"])
    server.start()
    browser.wait_text("Rolled back", "#notices")
    expect_equal(server.servers_of("eth0"), ["192.0.2.53", "2001:db8::53"])


def log_in(browser, user, password):
    browser.type("dialog input[name=user]", user)
    browser.type("dialog input[name=password]", password)
    browser.press("Enter")


@case
def login_makes_a_change_possible(test):
    server, browser = test.server(), test.browser()
    server.control("ifcfg", "init", "eth0")
    show(browser, server.secure + ETH0)
    browser.click_text("Log in")
    expect_accessible(browser, "the login")
    browser.screenshot(test.shots / "login.png")
    log_in(browser, "operator", "wrong")
    browser.wait_text("did not take this login", "dialog .problem")
    time.sleep(1)  # after a wrong login the server takes no other of this address for a while
    log_in(browser, "operator", PASSWORDS["operator"])
    browser.wait_text("Logged in as operator", "#notices")
    apply_on_trial(browser, ["192.0.2.1"])
    browser.click_text("Keep")
    browser.wait_text("Kept.", "#notices")
    expect_equal(server.servers_of("eth0"), ["192.0.2.1"])
    expect("user=\"operator\"" in (server.folder / "log").read_text(), "the log does not say who it was")
    expect_equal(browser.run("return [Object.keys(localStorage).length, Object.keys(sessionStorage).length, document.cookie];"), [0, 0, ""])
    browser.click_text("Log out")
    browser.wait_text("not logged in", "#top")


@case
def server_that_asks_for_a_login_gets_one(test):
    server, browser = test.server(anonymous="none"), test.browser()
    browser.open(server.secure)
    browser.wait_text("The server asks for a login", "main")
    browser.wait("return document.querySelector('dialog input[name=user]') !== null;", "the login")
    log_in(browser, "reader", PASSWORDS["reader"])
    browser.wait_text("eth0", "main")


@case
def password_is_not_sent_without_tls(test):
    server, browser = test.server(), test.browser()
    show(browser, server.plain)
    browser.click_text("Log in")
    browser.wait_text("over HTTPS only", "dialog")
    expect_equal(browser.run("return document.querySelectorAll('input[type=password]').length;"), 0)


# ---- Language, sight, keyboard ----


@case
def german_browser_gets_german(test):
    server, browser = test.server(), test.browser(language="de-AT")
    show(browser, server.plain)
    browser.wait_text("DNS-Client-Konfiguration von host1", "h1")
    browser.wait_text("Aktiv", ".rows")
    expect_equal(browser.run("return document.documentElement.lang;"), "de")
    expect_equal(browser.run_async("const done = arguments[0]; import('/console/texts.js').then((texts) => done(texts.lacking()));"), [])
    expect_accessible(browser, "German")
    browser.screenshot(test.shots / "overview-de.png")
    french = test.browser(language="fr")
    show(french, server.plain)
    french.wait_text("DNS client configuration of host1", "h1")


@case
def views_can_be_used_by_everybody(test):
    server = test.server()
    for scheme in ("light", "dark"):
        browser = test.browser(scheme=scheme)
        for name, place in VIEWS.items():
            show(browser, server.plain + place)
            for width in (1280, 400):
                browser.resize(width)
                time.sleep(0.3)  # the picture is drawn anew
                browser.screenshot(test.shots / f"{name}-{scheme}-{width}.png")
                expect_accessible(browser, f"{name}, {scheme}, {width} px")
            browser.resize(1280)
        expect_no_complaints(browser)
        browser.close()
        test.browsers.remove(browser)


FOCUSED = """const element = document.activeElement;
if (element === document.body) return null;
const style = getComputedStyle(element.querySelector(":scope > rect") ?? element);
const isVisible = (style.outlineStyle !== "none" && parseFloat(style.outlineWidth) >= 2) || parseFloat(style.strokeWidth) >= 3;
const all = [...document.querySelectorAll("a[href], button:enabled, input, summary")].filter((each) => each.checkVisibility());
return { at: all.indexOf(element), all: all.length, isVisible, text: element.textContent.trim() };"""


@case
def every_control_is_reached_by_the_keyboard(test):
    server, browser = test.server(), test.browser()
    for place in VIEWS.values():
        show(browser, server.plain + place)
        order = []
        while not order or (order[-1]["at"] < order[-1]["all"] - 1 and len(order) < 100):
            browser.press("Tab")
            found = browser.run(FOCUSED)
            expect(found is not None, f"{place}: the focus is lost after {order}")
            order.append(found)
        expect_equal([each["at"] for each in order], list(range(order[-1]["all"])))
        unseen = [each["text"] for each in order if not each["isVisible"]]
        expect(not unseen, f"{place}: the focus cannot be seen on {unseen}")


@case
def dialog_holds_the_focus_and_gives_it_back(test):
    _, browser = test.editable()
    browser.click_text("Change servers and domain")
    browser.wait("return document.activeElement.tagName === 'TEXTAREA';", "the focus in the form")
    for _ in range(12):
        browser.press("Tab")
        expect(browser.run("const at = document.activeElement; return at === document.body || at.closest('dialog') !== null;"), "the focus left the dialog")
    browser.press("Escape")
    browser.wait("return document.querySelector('dialog') === null;", "the end of the dialog")
    expect_equal(browser.run("return document.activeElement.textContent;"), "Change servers and domain")


@case
def graph_is_walked_by_the_keyboard(test):
    server, browser = test.server(), test.browser()
    show(browser, server.plain + "#/graph")
    browser.wait_text("Associations of host1", "h1")
    browser.run("document.querySelector('.graph a').focus();")
    first = browser.run("return document.activeElement.getAttribute('aria-label');")
    browser.press("ArrowDown")
    expect(browser.run("return document.activeElement.getAttribute('aria-label');") != first, "the arrow key does not move")
    browser.press("ArrowUp")
    walked = []
    for _ in range(3):
        label = browser.run("return document.activeElement.getAttribute('aria-label') ?? '';")
        name = label.split(": ", 1)[1].split(" ", 1)[1]
        browser.press("Enter")
        browser.wait_text(f"Associations of {name}", "h1")
        expect_equal(browser.run("return document.activeElement.tagName;"), "H1")
        walked.append(name)
        browser.run("const links = document.querySelectorAll('.graph a'); links[links.length - 1].focus();")
    expect(len(set(walked)) > 1, f"the walk stays at {walked}")
    test.figures.append("walked: " + " → ".join(walked))
    browser.click_text("The same as a table")
    expect_accessible(browser, "the table of the graph")
    expect_no_complaints(browser)


@case
def far_ends_are_the_associations_that_zorvactl_has(test):
    server, browser = test.server(), test.browser()
    show(browser, server.plain + ETH0)
    browser.click_text("Show in the graph")
    browser.wait_text("Associations of eth0", "h1")
    shown = browser.run("return document.querySelectorAll('.graph .node:not(.focus)').length;")
    url = f"http://localhost:{server.port}/root/cimv2"
    names = server.control("--url", url, "rin", 'ZORVA_DNSProtocolEndPoint.Name="eth0"').strip().splitlines()
    expect_equal(shown, len(names))
    browser.click(".graph a")
    browser.wait("return !document.querySelector('h1').textContent.includes('eth0');", "the far end")


# ---- Safety of the page ----


@case
def page_takes_nothing_from_elsewhere(test):
    server, browser = test.server(), test.browser()
    show(browser, server.plain)
    browser.run("const script = document.createElement('script'); script.textContent = 'window.intruder = 1'; document.body.append(script);")
    browser.run("const image = document.createElement('img'); image.src = 'http://127.0.0.1:9/x'; document.body.append(image);")
    time.sleep(0.5)
    expect_equal(browser.run("return window.intruder ?? null;"), None)
    refused = [each for each in browser.complaints() if "Content Security Policy" in each]
    expect_equal(len(refused), 2)
    loaded = browser.run("return performance.getEntriesByType('resource').map((each) => new URL(each.name).origin);")
    expect_equal({each for each in loaded if "127.0.0.1:9" not in each}, {server.plain.rstrip("/")})


# ---- Many interfaces ----

SCROLL = """const done = arguments[0];
const frames = [];
let most = 0, last = performance.now(), step = 0;
const next = () => {
  const now = performance.now();
  frames.push(now - last);
  last = now;
  most = Math.max(most, document.querySelectorAll(".rows .row").length);
  step += 1;
  if (step > 120) {
    frames.sort((a, b) => a - b);
    done({ most, longest: frames.at(-1), median: frames[60] });
    return;
  }
  scrollTo(0, (document.documentElement.scrollHeight - innerHeight) * (step / 120));
  requestAnimationFrame(next);
};
requestAnimationFrame(next);"""

WATCH = """window.longest = 0;
new PerformanceObserver((list) => { for (const each of list.getEntries()) window.longest = Math.max(window.longest, each.duration); })
  .observe({ type: "longtask", buffered: true });"""


@case
def ten_thousand_interfaces_scroll(test):
    server, browser = test.server(large_host(MANY)), test.browser()
    begin = time.monotonic()
    browser.open(server.plain)
    browser.run(WATCH)
    browser.wait_text(f"{MANY:,} of {MANY:,}", ".count")
    test.figures.append(f"{MANY} interfaces shown after {time.monotonic() - begin:.1f} s, longest task {browser.run('return window.longest;'):.0f} ms")
    expect(browser.run("return document.querySelectorAll('.rows .row').length;") < MOST_ROWS, "all rows are in the document")
    scroll = browser.run_async(SCROLL)
    test.figures.append(f"scrolling: at most {scroll['most']} rows in the document, frames of {scroll['median']:.0f} ms, the longest {scroll['longest']:.0f} ms")
    expect(scroll["most"] < MOST_ROWS, f"{scroll['most']} rows are in the document")
    expect(scroll["longest"] < 1000, f"a frame took {scroll['longest']} ms")
    browser.wait(f"return document.querySelector('.rows').innerText.includes('veth{MANY - 1}');", "the last interface")
    expect_equal(browser.run("return document.querySelector('.table').getAttribute('aria-rowcount');"), str(MANY + 1))
    browser.type("input[type=search]", "veth4711")
    browser.wait_text(f"1 of {MANY:,}", ".count")
    browser.click_text("veth4711")
    browser.wait_text("veth4711", "h1")
    expect_no_complaints(browser)


@case
def keyboard_walks_beyond_the_rows_that_are_there(test):
    server, browser = test.server(large_host(300)), test.browser()
    show(browser, server.plain)
    browser.run("document.querySelector('.rows a').focus();")
    browser.press(*["ArrowDown"] * 120)
    expect_equal(browser.run("return document.activeElement.textContent;"), "veth120")


@case
def system_of_many_interfaces_shows_some_and_goes_on(test):
    server, browser = test.server(large_host(2000)), test.browser()
    show(browser, server.plain + "#/graph")
    browser.wait_text("24 shown; there are more", "main")
    browser.click_text("Show more")
    browser.wait_text("48 shown; there are more", "main")
    expect_accessible(browser, "the graph of many")


def run(build, shots, names):
    failed = []
    for each in CASES:
        if names and each.__name__ not in names:
            continue
        begin = time.monotonic()
        test = Test(build, shots)
        try:
            each(test)
            verdict = "passed"
        except Exception:  # the next case runs all the same
            failed.append(each.__name__)
            verdict = "FAILED\n" + traceback.format_exc()
        finally:
            test.close()
        print(f"{each.__name__}: {verdict} ({time.monotonic() - begin:.1f} s)", flush=True)
        for figure in test.figures:
            print(f"    {figure}", flush=True)
    print(f"{len(failed)} of the cases failed: {', '.join(failed)}" if failed else "all cases passed")
    return 1 if failed else 0


def main():
    if len(sys.argv) < 3:
        print(__doc__, file=sys.stderr)
        return 2
    if os.environ.get("ZORVA_CONSOLE_NAMESPACE") != "own":
        if os.geteuid() != 0 or subprocess.run(["unshare", "--net", "true"], capture_output=True, check=False).returncode != 0:
            print("skipped: it needs root and network namespaces")
            return SKIPPED
        os.environ["ZORVA_CONSOLE_NAMESPACE"] = "own"
        os.execvp("unshare", ["unshare", "--net", sys.executable, *sys.argv])
    subprocess.run(["ip", "link", "set", "lo", "up"], check=True)
    shots = pathlib.Path(sys.argv[2])
    shots.mkdir(parents=True, exist_ok=True)
    return run(pathlib.Path(sys.argv[1]).resolve(), shots, sys.argv[3:])


if __name__ == "__main__":
    sys.exit(main())
