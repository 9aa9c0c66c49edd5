#!/usr/bin/env python3
"""Does what docs/tutorial.md says, on two hosts of its own, and compares the screen with what the page shows.

    tutorial.py BUILD             BUILD: the folder with bin/; exits 1 and prints the log and the difference
    tutorial.py BUILD --log       prints the log in any case
    tutorial.py BUILD --update    writes what the hosts showed into the page, for a person to read

The hosts are network, mount, process and name namespaces, joined by a pair of interfaces named eth0. Each has files of its own
in /etc, /var/lib and /run, and the page's DNS servers answer. It needs root, and is skipped without.

How the page is read:
    host1# COMMAND               the command is typed on host1, at a terminal; up to the next prompt follows what it shows
    <!-- host1: FILE -->         the next block is the content of this file on host1
    <!-- leave running -->       the command of the next block goes on; what is shown comes first
Stand-ins, for what is different each time:
    SHA-256                      that of the page counts for the real one, in commands and files as well
    dates and times              every date is the same, and so are all numbers of "ms" and of "s"; columns may be wider for them
"""
import fcntl
import os
import pathlib
import pty
import re
import select
import shutil
import socket
import struct
import subprocess
import sys
import tempfile
import termios
import time

ROOT = pathlib.Path(__file__).resolve().parent.parent
PAGE = ROOT / "docs" / "tutorial.md"
SKIPPED = 77
LONGEST = 20  # seconds that a command may take
COLUMNS = 100
DNS_SERVERS = ["192.0.2.53", "192.0.2.54"]
ADDRESSES = {"host1": "192.0.2.1", "host2": "192.0.2.2"}

# What the person at the terminal types, and where.
ANSWERS = [(re.compile(r"(assword of .*|The same again): $"), "correct horse\n"), (re.compile("Press Enter within "), "\n"),
           (re.compile(r"\[y/N\]: $"), "y\n")]
FINGERPRINT = re.compile(r"\b[0-9a-f]{64}\b")
SAME = [(re.compile(r"\b(\d{4}-\d\d-\d\d|[A-Z][a-z]{2} +\d+ \d\d:\d\d:\d\d \d{4} GMT)"), "DATE"),
        (re.compile(r"\b\d+(\.\d+)? (ms|s)\b"), "TIME"), (re.compile("   +"), "  ")]

DIES_ALONG = ["setpriv", "--pdeathsig", "KILL"]  # however this test ends

# Parts the mounts of a host from the machine's. $1: an empty folder, $2: the host's name.
ENTER = r"""
set -e
mount --make-rprivate /
mount -t tmpfs tmpfs "$1"
for place in etc var/lib; do
  mkdir -p "$1/$place" "$1/work/$place"
  mount -t overlay overlay -o "lowerdir=/$place,upperdir=$1/$place,workdir=$1/work/$place" "/$place"
done
mount -t tmpfs tmpfs /run
mount -t sysfs -o ro sysfs /sys
mkdir "$1/home"
rm -rf /etc/resolv.conf /etc/zorvagent /var/lib/zorvagent
hostname "$2"
printf '%s\n' "$2" >/etc/hostname
echo 0 >/proc/sys/net/ipv6/conf/all/disable_ipv6
printf 'nameserver 192.0.2.53\nsearch example.org\n' >/etc/resolv.conf
printf '127.0.0.1 localhost\n192.0.2.1 host1.example.org host1\n192.0.2.2 host2.example.org host2\n' >/etc/hosts
ip link set lo up
echo ready
exec sleep 600
"""


class Failure(Exception):
    pass


def screen(text):
    """What a terminal has after this was written to it: carriage returns and the erasing of a line count."""
    lines = []
    for line in text.replace("\r\n", "\n").split("\n"):
        shown = ""
        for part in line.split("\r"):
            erased = "\033[K" in part
            part = part.replace("\033[K", "")
            shown = part if erased else part + shown[len(part):]
        lines.append(shown.rstrip())
    while lines and not lines[-1]:
        lines.pop()
    return lines


class Terminal:
    """A command on a host, at a terminal."""

    def __init__(self, process, words):
        self.text, self.answered = "", 0
        pid, self.file = pty.fork()
        if pid == 0:
            fcntl.ioctl(0, termios.TIOCSWINSZ, struct.pack("HHHH", 50, COLUMNS, 0, 0))
            os.execvp("nsenter", ["nsenter", "--target", str(process), "--all", *words])
        self.pid = pid

    def read(self, until):
        """Reads until that moment; False at the end of the command."""
        if not select.select([self.file], [], [], max(0, until - time.monotonic()))[0]:
            return True
        try:
            self.text += os.read(self.file, 65536).decode(errors="replace")
        except OSError:
            return False
        for question, answer in ANSWERS:
            if question.search(self.text, self.answered):
                self.answered = len(self.text)
                os.write(self.file, answer.encode())
        return True

    def finish(self):
        until = time.monotonic() + LONGEST
        while self.read(until):
            if time.monotonic() > until:
                raise Failure(f"it does not end; its screen is:\n{self.text}")
        status = os.waitstatus_to_exitcode(os.waitpid(self.pid, 0)[1])
        if status not in (0, 1):  # the page also shows what is refused
            raise Failure(f"its exit status is {status}; its screen is:\n{self.text}")

    def wait_for(self, wanted):
        until = time.monotonic() + LONGEST / 2
        while not wanted(screen(self.text)) and time.monotonic() < until:
            if not self.read(min(until, time.monotonic() + 0.5)):
                break


class Host:
    def __init__(self, name, folder, build):
        self.home = folder / "home"
        folder.mkdir()
        self.process = subprocess.Popen(
            [*DIES_ALONG, "unshare", "--mount", "--net", "--uts", "--ipc", "--pid", "--fork", "--kill-child", "--mount-proc",
             "sh", "-c", ENTER, "sh", str(folder), name], stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True)
        if self.process.stdout.readline() != "ready\n":
            raise RuntimeError(self.process.stderr.read().strip())
        children = pathlib.Path(f"/proc/{self.process.pid}/task/{self.process.pid}/children").read_text(encoding="ascii")
        self.inside = int(children.split()[0])
        self.environment = ["env", "-i", f"PATH={build}/bin:{os.environ['PATH']}", "TERM=dumb", f"HOME={self.home}", "LANG=C.UTF-8"]

    def run(self, *words, **more):
        words = ["nsenter", "--target", str(self.inside), "--all", *words]
        return subprocess.run(words, check=True, capture_output=True, text=True, **more)

    def type(self, command):
        return Terminal(self.inside, [*self.environment, "bash", "-c", f'cd "$HOME" && {command}'])

    def write(self, path, text):
        self.run("sh", "-c", 'cd "$1" && mkdir -p "$(dirname "$2")" && cat >"$2"', "sh", str(self.home), path, input=text)

    def close(self):
        self.process.kill()
        self.process.wait()


class Hosts:
    def __init__(self, build):
        self.folder = tempfile.TemporaryDirectory()
        self.hosts, self.answerer = {}, None
        try:
            for name in ADDRESSES:
                self.hosts[name] = Host(name, pathlib.Path(self.folder.name) / name, build)
            self.join()
        except BaseException:
            self.__exit__()
            raise

    def join(self):
        one, two = (self.hosts[name].inside for name in ADDRESSES)
        # Without the process namespace of host1, where host2's process has no number.
        pair = f"ip link add eth0 type veth peer name eth0 netns {two}"
        subprocess.run(["nsenter", "--target", str(one), "--net", *pair.split()], check=True, capture_output=True, text=True)
        for name, address in ADDRESSES.items():
            self.hosts[name].run("ip", "address", "add", f"{address}/24", "dev", "eth0")
            self.hosts[name].run("ip", "link", "set", "eth0", "addrgenmode", "none")
            self.hosts[name].run("ip", "link", "set", "eth0", "up")
        # The kernel says only some time later that the other end is there.
        for name in ADDRESSES:
            waits = "until grep -q up /sys/class/net/eth0/operstate; do sleep 0.05; done"
            self.hosts[name].run("timeout", "10", "sh", "-c", waits)
        # Packets for the DNS servers end on host2, which shows no address of theirs.
        for address in DNS_SERVERS:
            self.hosts["host2"].run("ip", "route", "add", "local", address, "dev", "lo", "table", "local")
        itself = [sys.executable, __file__, "--answer"]
        self.answerer = subprocess.Popen([*DIES_ALONG, "nsenter", "--target", str(two), "--net", *itself], stdout=subprocess.PIPE)
        self.answerer.stdout.readline()

    def __enter__(self):
        return self

    def __exit__(self, *_):
        if self.answerer:
            self.answerer.kill()
            self.answerer.wait()
        for host in self.hosts.values():
            host.close()
        self.folder.cleanup()


def answer():
    """The DNS servers: they know every name."""
    servers = []
    for address in DNS_SERVERS:
        servers.append(socket.socket(socket.AF_INET, socket.SOCK_DGRAM))
        servers[-1].bind((address, 53))
    print("ready", flush=True)
    while True:
        for server in select.select(servers, [], [])[0]:
            question, client = server.recvfrom(512)
            server.sendto(question[:2] + b"\x81\x80" + question[4:], client)


class Block:
    def __init__(self, page, match):
        self.mark, self.body = match[1] or "", match[2]
        self.start, self.end = match.span(2)
        self.line = page.count("\n", 0, self.start) + 1

    def steps(self):
        """The commands of a block: host, command, what it shows."""
        if self.mark not in ("", "leave running"):
            raise Failure(f"there is no such mark: {self.mark}")
        steps = []
        for text in self.body.splitlines():
            prompt = re.match(r"(host\d)# (.*)", text)
            if prompt:
                steps.append((prompt[1], prompt[2], []))
            elif steps:
                steps[-1][2].append(text)
            else:
                raise Failure("the block begins without a prompt, and no mark says what it is")
        return steps


def blocks(page):
    pattern = re.compile(r"(?:^<!-- (.*?) -->\n)?^```\w*\n(.*?)^```$", re.MULTILINE | re.DOTALL)
    found = [Block(page, match) for match in pattern.finditer(page)]
    marks = [block.mark for block in found if block.mark]
    if not found or page.count("```") != 2 * len(found) or page.count("<!--") != len(marks):
        raise Failure("a block of code or a mark is not where a line begins, or has no end")
    return found


class Reader:
    """The person who does what the page says."""

    def __init__(self, hosts):
        self.hosts, self.real, self.log = hosts, {}, []

    def with_real(self, text):
        return FINGERPRINT.sub(lambda match: self.real.get(match[0], match[0]), text)

    def learn(self, expected, shown):
        """What is shown first counts: another SHA-256 later is a difference, on the page as on the screen."""
        for page, real in zip(FINGERPRINT.findall("\n".join(expected)), FINGERPRINT.findall("\n".join(shown))):
            if page not in self.real and real not in self.real.values():
                self.real[page] = real

    def comparable(self, lines):
        """Lines with the stand-ins for what differs."""
        text = self.with_real("\n".join(lines))
        for pattern, stand_in in SAME:
            text = pattern.sub(stand_in, text)
        return text.rstrip().split("\n")

    def as_page(self, shown):
        """What was shown, with the page's SHA-256."""
        page = {real: name for name, real in self.real.items()}
        return [FINGERPRINT.sub(lambda match: page.get(match[0], match[0]), line) for line in shown]

    def do(self, block):
        """Does what a block says and returns it as it was shown."""
        place = re.fullmatch(r"(host\d): (.*)", block.mark)
        if place:
            self.hosts[place[1]].write(place[2], self.with_real(block.body))
            self.log.append(f"{place[1]}: wrote {place[2]}")
            return block.body
        lines = []
        for host, command, expected in block.steps():
            lines += [f"{host}# {command}", *self.as_page(self.type(block, host, command, expected))]
        return "\n".join(lines) + "\n"

    def type(self, block, host, command, expected):
        self.log.append(f"{host}# {command}")
        terminal = self.hosts[host].type(self.with_real(command))
        if block.mark == "leave running":
            terminal.wait_for(lambda lines: lines and self.comparable(lines) == self.comparable(expected))
        else:
            terminal.finish()
        shown = screen(terminal.text)
        self.learn(expected, shown)
        self.log += shown
        return shown

    def differs(self, old, new):
        return self.comparable(old.splitlines()) != self.comparable(new.splitlines())


def follow(page, hosts):
    """Does the whole page. Returns the page as it was shown, the log, and the differences."""
    reader, parts, differences, position = Reader(hosts), [], [], 0
    for block in blocks(page):
        try:
            shown = reader.do(block)
        except Failure as failure:
            differences.append(f"line {block.line}: {failure}")
            break
        if not reader.differs(block.body, shown):
            shown = block.body
        else:
            differences.append(f"line {block.line}: the page shows\n{block.body}and the hosts showed\n{shown}")
        parts += [page[position:block.start], shown]
        position = block.end
    return "".join([*parts, page[position:]]), reader.log, differences


def missing():
    """What this machine lacks, or nothing."""
    if os.geteuid() != 0:
        return "root is needed to make two private hosts"
    programs = [name for name in ("unshare", "nsenter", "setpriv", "ip", "hostname", "wbemcli") if not shutil.which(name)]
    return f"there is no {programs[0]}" if programs else ""


def main(build, *options):
    why = missing()
    if why:
        print(f"skipped: {why}")
        return SKIPPED
    try:
        hosts = Hosts(pathlib.Path(build).resolve())
    except (RuntimeError, subprocess.CalledProcessError) as error:
        print(f"skipped: no private hosts can be made here: {getattr(error, 'stderr', '') or error}")
        return SKIPPED
    with hosts:
        page, log, differences = follow(PAGE.read_text(encoding="utf-8"), hosts.hosts)
    if "--update" in options:
        PAGE.write_text(page, encoding="utf-8")
    if "--log" in options or differences:
        print("\n".join(log))
    for each in differences:
        print(f"\n{PAGE.name}, {each}")
    return 1 if differences else 0


if __name__ == "__main__":
    if sys.argv[1:] == ["--answer"]:
        answer()
    sys.exit(main(*sys.argv[1:]))
