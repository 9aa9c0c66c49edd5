#!/usr/bin/env python3
"""What bash, zsh and fish propose for zorvactl, asked at a terminal of theirs.

    completion.py BUILD-FOLDER

Each shell that is installed runs on a host that is a file. A person's keys are sent to it, and its screen is read.
"""

import json
import os
import pty
import re
import select
import shutil
import subprocess
import sys
import tempfile
import time

SKIPPED = 77

# What is typed before the tab key, and what the shell must then show.
CASES = [
    ("zorvactl confir", "confirm "),
    ("zorvactl dns set et", ["eth0", "eth1"]),
    ("zorvactl ei ZORVA_DNSGeneralS", "ZORVA_DNSGeneralSettingData "),
    ("zorvactl modify --dr", "--dry-run "),
    ("zorvactl show --output js", "json "),
    ("zorvactl show --output=js", "--output=json "),
    ("zorvactl modify ZORVA_DNSSettingData DomainN", "DomainName="),
    ("zorvactl cm ZORVA_DNSProtocolEndPoint SetDNSD", "SetDNSDomain "),
    ("zorvactl --config FOLDER/only-on", "FOLDER/only-one.toml "),
    ("zorvactl help agent", "agent.toml "),
    ("zorvactl gi 'ZORVA_DNSProtocolEndPoint.", ['Name="eth0"', 'Name="eth1"']),
    ("zorvactl gi ZORVA_DNSProtocolEndPoint.", ['Name="eth0"', 'Name="eth1"']),
    ("zorvactl gi 'ZORVA_DNSProtocolEndPoint.Name=\"eth1", 'Name="eth1" '),
]


def tree():
    def port(name):
        properties = {"name": name, "host_name": "host1", "domain_name": "example.org", "enabled_state": 1,
                      "dns_server_addresses": ["192.0.2.53"], "protocol_if_type": 4097}
        node = {"type": "NetworkIPConfig", "name": "ip", "description": "", "properties": properties}
        return {"type": "Port", "name": name, "description": "", "children": [node]}
    system = {"type": "System", "name": "system", "description": "Computer", "children": [port("eth0"), port("eth1")]}
    return {"system_name": "host1", "nodes": [system]}


def write(path, text):
    with open(path, "w", encoding="ascii") as file:
        file.write(text)


class Terminal:
    """A shell at a terminal of its own."""

    def __init__(self, words, environment):
        self.pid, self.fd = pty.fork()
        if self.pid == 0:
            os.execvpe(words[0], words, environment)
        import fcntl, struct, termios
        fcntl.ioctl(self.fd, termios.TIOCSWINSZ, struct.pack("HHHH", 60, 200, 0, 0))

    def type(self, text):
        os.write(self.fd, text.encode())

    def until(self, is_there, seconds=10):
        """The screen's text once is_there() says so; what is there at the end of the time otherwise."""
        text = ""
        end = time.monotonic() + seconds
        while time.monotonic() < end and not is_there(text):
            if select.select([self.fd], [], [], 0.05)[0]:
                try:
                    text += os.read(self.fd, 65536).decode(errors="replace")
                except OSError:
                    break
        # Without colours, movements of the cursor and the breaks of long lines.
        return re.sub(r"\x1b\[[0-9;?]*[a-zA-Z]|\x1b[=>]|[\r\x07\x08]", "", text)

    def close(self):
        os.close(self.fd)
        try:
            os.kill(self.pid, 9)
        except ProcessLookupError:
            pass
        os.waitpid(self.pid, 0)


def at_terminal(words, prepare, environment, folder):
    """Yields for each case what the shell shows after the tab key."""
    terminal = Terminal(words, environment)
    try:
        terminal.type(prepare + "; PS1='> '; echo pre''pared\n")
        terminal.until(lambda text: "prepared" in text)
        for number, (typed, wanted) in enumerate(CASES):
            typed = typed.replace("FOLDER", folder)
            terminal.type(typed + "\t")
            expected = [each.replace("FOLDER", folder) for each in ([wanted] if isinstance(wanted, str) else wanted)]
            yield typed, expected, terminal.until(lambda text: all(as_words(each) in as_words(text) for each in expected))
            # The line is deleted. A signal would flush what is typed after it.
            mark = f"{number} is done"
            terminal.type("\x15echo " + mark.replace("done", "do''ne") + "\n")
            terminal.until(lambda text: mark in text)
    finally:
        terminal.close()


def as_words(text):
    """The shells quote and indent in their own ways."""
    return re.sub(r"[\\'\s\x07\x08]", "", re.sub(r"\x1b\[[0-9;?]*[a-zA-Z]", "", text))


def check_terminal(shell, words, prepare, environment, folder):
    failures = 0
    for typed, expected, shown in at_terminal(words, prepare, environment, folder):
        for each in expected:
            if as_words(each) not in as_words(shown):
                print(f"{shell}: '{typed}' and tab does not lead to '{each}': {shown!r}")
                failures += 1
    return failures


def check_bash(environment, folder):
    prepare = "bind 'set enable-bracketed-paste off'; bind 'set show-all-if-ambiguous on'; bind 'set bell-style none'; source <(zorvactl completion bash)"
    return check_terminal("bash", ["bash", "--norc", "--noprofile", "-i"], prepare, environment, folder)


def check_zsh(environment, folder):
    prepare = ("unsetopt zle_bracketed_paste prompt_cr prompt_sp list_ambiguous; zstyle ':completion:*' list-prompt ''; "
               "autoload -U compinit; compinit -D -u; source <(zorvactl completion zsh)")
    return check_terminal("zsh", ["zsh", "-f", "-i"], prepare, environment, folder)


def check_fish(environment, folder):
    """fish says what it would propose."""
    failures = 0
    for typed, wanted in CASES:
        typed = typed.replace("FOLDER", folder)
        script = "zorvactl completion fish | source; complete -C '" + typed.replace("'", "\\'") + "'"
        run = subprocess.run(["fish", "--no-config", "-c", script], env=environment, capture_output=True, text=True,
                             check=False)
        for each in [wanted] if isinstance(wanted, str) else wanted:
            if as_words(each.replace("FOLDER", folder)) not in as_words(run.stdout):
                print(f"fish: '{typed}' and tab does not lead to '{each}': {run.stdout!r} {run.stderr!r}")
                failures += 1
    return failures


def main():
    build = os.path.abspath(sys.argv[1])
    folder = tempfile.mkdtemp()
    failures = 0
    try:
        write(folder + "/tree.json", json.dumps(tree()))
        write(folder + "/agent.toml", '[agent]\ndata_dir = "data/"\n[tree]\nsource = "file"\nfile = "tree.json"\n')
        write(folder + "/only-one.toml", "")
        environment = {"PATH": build + "/bin:" + os.environ["PATH"], "HOME": folder, "TERM": "xterm",
                       "LC_ALL": "C.UTF-8", "ZORVAGENT_CONFIG": folder + "/agent.toml"}
        environment |= {name: value for name, value in os.environ.items() if name.endswith("SAN_OPTIONS")}
        missing = []
        for shell, check in [("bash", check_bash), ("zsh", check_zsh), ("fish", check_fish)]:
            if shutil.which(shell):
                failures += check(environment, folder)
            else:
                missing.append(shell)
    finally:
        shutil.rmtree(folder)
    if missing and not failures:
        print("skipped: there is no " + " and no ".join(missing))
        return SKIPPED
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
