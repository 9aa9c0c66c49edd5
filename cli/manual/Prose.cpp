#include "cli/manual/Prose.h"

#include <algorithm>

namespace zorva::cli {

namespace {

constexpr std::string_view kProgram = R"(
`zorvactl` loads the CIM providers of the DNS client profile into its own process and asks them what a CIM client would ask a
server: which DNS clients, servers and settings this host has, and how they are associated. No server is needed; with `--url`
the same is asked of a CIM server.

Changes are stored in the agent's data directory: a setting in its interface's file, a value of an endpoint in the overlay of
the tree. `zorvactl apply` brings them to the host, and with `apply = "host"` in `agent.toml`(5) each change is brought there
at once. A user who may not write to the data directory changes settings through the server of this host, if it answers at
its socket.

Each command has a page of its own, such as `zorvactl-show`(1), which `zorvactl help show` prints too. A value that begins
with "-" goes after `--`: `zorvactl domain eth0 -- -x.example.org`.

## OPTIONS
= `--quiet`
On success there are no results, warnings or notes.

= `--log-level`
5000 are warnings.

= `--provider-dir`
Without it they are looked for beside the program, and where its package has them.

= `--url`
It speaks CIM-XML over HTTP (DSP0200). The port may be left out (5988, or 5989 for https), and so may the namespace
(root/cimv2). `unix:` may have a path and a namespace: unix:/run/x.sock#interop. A password in the URL is refused, because all
users of this host would see it, and so is a user without https. This needs libcurl. The commands about files of this host
(`tree`, `ifcfg`, `overlay`, `apply`, `confirm`, `revert`, `user`) and `check` refuse it, and `show` cannot tell who owns an
interface or where a setting comes from.

= `--hosts`
See SEVERAL HOSTS.

= `--password-file`
The password is the first line. Only its owner may be able to read the file.

= `--ca`
The file is PEM. They must have signed the certificate for the name in the URL.

= `--fingerprint`
It has 64 hexadecimal digits, with colons or without; `zorvacimd --make-certificate` prints them on the server. Signer, names and dates
of the certificate do not matter then. A certificate that is not trusted is shown with its SHA-256, subject and dates, and
nothing is sent to a server that has it.

= `--timeout`
Up to 3600. Without it, one server is waited for while it sends anything within 2 minutes.

## PATHS
A path is a class with keys:

    ZORVA_DNSProtocolEndPoint.Name="eth0",SystemName="host1"

Names are taken in any case. A host before it, as in //host1/root/cimv2:CLASS, must be this one. Keys may be left out where
the rest names one instance, and a class above the object's own will do. Within the quotes, \" and \\ mean these characters;
a reference is a path in quotes. Quote the whole for the shell.

## SEVERAL HOSTS
With `--hosts` or more than one `--url` the command runs with each server, with 32 at once. Each line of a file has a URL, or a
name for https://<NAME>:5989/root/cimv2, and may have the SHA-256 of the server's certificate after it. The rest of a line
after "#" is a comment. The user and the password are the same on all hosts, unless a URL names another user.

The results are one table, whose first column is HOST, or with `--output json` one array of objects: "host" is the name of
the host, "result" what the command prints for it alone, or an element of that if it is an array. Warnings and failures name
their host. If one host failed, the exit status is 1.

Changes are shown first, with what would change where. They are made with `--yes`, or if the person at the terminal agrees.
Else nothing is changed and the exit status is 1. The commands that take several hosts are `show`, `classes`, the CIM
operations, `dns`, `domain` and `suffixes`.

## EXIT STATUS
= `0`
Done.

= `1`
The operation failed, or something that was asked for was not stored; why is on standard error. For `check`: something is
wrong.

= `2`
Wrong usage, or a wrong configuration or tree file.

## ENVIRONMENT
= `ZORVAGENT_CONFIG`
The agent's configuration, where no `--config` is given.

= `ZORVACTL_PASSWORD_FILE`
The file with the password, where no `--password-file` is given.

= `ZORVACTL_SOCKET`
The socket of the server of this host, in place of </run/zorvacimd/cim.sock>.

= `NO_COLOR`
Where it is set and not empty, nothing is coloured. Colours are shown on terminals only.

## FILES
= </etc/zorvagent/agent.toml>
The agent's configuration, `agent.toml`(5).

= </etc/zorvagent/users>
The users of the server.

= </var/lib/zorvagent/ifcfg-INTERFACE>
The file of settings of an interface, in the agent's data directory.

## SEE ALSO
`agent.toml`(5), `zorvacimd`(8)
)";

constexpr std::string_view kShow = R"(
A row for each interface: its state, servers, domain and suffixes, and who says so (FROM): the owner of the interface's DNS
settings with its profile or file, as in "NetworkManager, profile lan"; the interface's file of settings (<ifcfg-NAME>) or
<overlay.json> where they replace what the owner says; `host` where no owner is known. Then what belongs to the host: whom
programs ask, and which file holds the suffixes. On a terminal a row is one line; what is too long is cut, or ends in "and 3
more". Interfaces without servers, suffixes or settings of their own are left out if there are others.

With names, all of these interfaces: also default route, DNS over TLS, DNSSEC, routing domains, each server with its port and
name, and where each setting comes from (`file`, the interface's file; `host`, the host itself; `set`, a value of the tree
that was set). With `--output json` all interfaces have all of this as fields.

What cannot be asked is shown as "-", and a warning tells why. Another warning names files of settings whose interfaces are
gone.
)";

constexpr std::string_view kCheck = R"(
Asks each DNS server of the interfaces and of the host's resolver, or those of some interfaces alone, with a query over UDP of
its own, all at the same time. The host's resolver takes no part. The question is for the SOA record of the root, or for the
address of a name. Shows the time and the answer of each, and which suffixes resolve. A server with a port of its own is asked
at that port.

It reports servers that do not answer within two seconds, that cannot be reached, or whose answer is not NOERROR; servers that
no program ever asks, because they are named twice or after the first three of </etc/resolv.conf>; and suffixes that do not
exist for the servers that are asked for them. If there is any of this, the exit status is 1.
)";

constexpr std::string_view kWatch = R"(
A line for each change while the command runs: when it was seen, the interface, the property, its old and its new value, and
who has set it, in brackets. It runs until it is interrupted, its output is closed, or after `--count` changes. A line on
standard error says that it has begun.

Properties have the names of `zorvactl tree --output json`. "interface" is one that came or went. A property such as
"ifcfg.DNSSERVERS" is a line in the file of settings of the interface. "-" is no interface, no value, or nobody known. Who has
set it is the owner of the interface's DNS settings ("NetworkManager"), a file (<ifcfg-NAME>, <overlay.json>,
</etc/resolv.conf>), `kernel` or `BMC`. Through a server of this project it is the user who made the change by that server
("anonymous" without a login), where there was such a user moments before.

The command sleeps in the kernel until an interface, a file, the message bus or the name of the host changes. Several changes
within a twentieth of a second may be seen as one. With `--url` the server reports: a `zorvacimd`, to clients that may read.

## JSON
With `--json`, or `--output json`, each line is an object with "version", "time" (RFC 3339, UTC), "system", "interface",
"property", "old", "new" and "by". What is not known or is no value is null.
)";

constexpr std::string_view kTree = R"(
Shows what the agent has read of this host, as the providers see it. Values that were set and replace the host's own are
marked. With `--output json` it is a document that the agent reads back as a tree file (`agent.toml`(5)).
)";

constexpr std::string_view kClasses = R"(
Lists the classes, who provides them, and how many instances there are. The time to count an association may grow with the
square of the number of interfaces. So above 500 interfaces associations are counted only with `--all`.
)";

constexpr std::string_view kGraph = R"(
Shows all objects and how they are associated, or those that can be reached from one; at the end, the references whose far end
cannot be fetched. `--output dot` writes it for Graphviz, `--output svg` draws it where Graphviz is installed. Of more than 1000
objects only the first few are asked for their associations; with `--all` each of them is.
)";

constexpr std::string_view kEnumerate = R"(
Asks for all instances of a class and of the classes below it, and shows all their properties or some of them.
)";

constexpr std::string_view kNames = R"(
Asks for the object paths of all instances of a class and of the classes below it.
)";

constexpr std::string_view kGet = R"(
Shows one instance. Keys may be left out of the path where the rest names one; see PATHS in `zorvactl`(1).
)";

constexpr std::string_view kAssociators = R"(
Shows the objects that an object is associated with, by all associations or by some.
)";

constexpr std::string_view kAssociatorNames = R"(
Shows the object paths of the objects that an object is associated with, by all associations or by some.
)";

constexpr std::string_view kReferences = R"(
Shows the associations of an object, each with the paths of its two ends.
)";

constexpr std::string_view kReferenceNames = R"(
Shows the object paths of the associations of an object.
)";

constexpr std::string_view kModify = R"(
Changes properties. The instance is read first and sent back with the changes in it, so that other settings stay. A name that
is repeated makes an array, <NAME>= is the empty value, <NAME>=null is NULL.

Afterwards the instance is read again: a change that was not stored is a failure, which names the property, the reason, and
what to do. A property that cannot be changed is refused before anything is written.

## OPTIONS
= `--only`
The providers here and `zorvacimd`(8) leave the others alone all the same.
)";

constexpr std::string_view kInvoke = R"(
Calls a method, and shows its answer and its results. The methods of the DNS endpoint check and answer, and change nothing;
so the exit status is 1 even where the answer is 0.
)";

constexpr std::string_view kIfcfg = R"(
An interface's file of settings, <ifcfg-INTERFACE> in the agent's data directory, replaces what the host says of the keys that
it has. The providers read settings there, and changes go there. An interface without a file has what the host says.

## COMMANDS
= `init`
The file is written whole or not at all. Run by root it makes the agent's data directory where that is missing and has its
usual name.

= `list`
A file whose interface is gone is an orphan: nothing reads it.

= `remove`
It also removes the file of an interface that is gone.

= `adopt`
This is for an interface that got another name. One that has a file keeps it: that is an error, and so is an <OLD> that is
still there.

## FILES
= </var/lib/zorvagent/ifcfg-INTERFACE>
The file, where `data_dir` of `agent.toml`(5) is not set.
)";

constexpr std::string_view kDns = R"(
Shows or changes the DNS servers of an interface. It changes `ZORVA_DNSSettingData` as a CIM client would, so the
interface needs a file of settings, which `zorvactl ifcfg init` makes. An address that is given twice, a multicast address and the
unspecified address are refused.

## SEE ALSO
`zorvactl-ifcfg`(1), `zorvactl-apply`(1)
)";

constexpr std::string_view kDomain = R"(
Sets the DNS domain of an interface, which needs a file of settings. What is no domain name is refused.

## SEE ALSO
`zorvactl-ifcfg`(1), `zorvactl-apply`(1)
)";

constexpr std::string_view kSuffixes = R"(
Shows or changes the DNS suffixes of the host. They are in the file of the first interface; a note says which one that is. What
is no host name, or is given twice, is refused.

## SEE ALSO
`zorvactl-ifcfg`(1), `zorvactl-apply`(1)
)";

constexpr std::string_view kOverlay = R"(
Values of the tree that were set through an endpoint replace what the host says, until they are taken back or applied. They
are in <overlay.json> in the agent's data directory.
)";

constexpr std::string_view kApply = R"(
Brings the stored settings of these interfaces, or of all that have any, to the host: through NetworkManager, systemd-networkd
or systemd-resolved, whichever owns the interface's DNS settings, or to </etc/resolv.conf> where nobody does. It prints what
changed, property by property. A second run changes nothing and says so.

Each interface is applied whole or not at all; what its owner refuses, or does not take, is an error that names the owner. An
owner that is being restarted is waited for, ten seconds at most. It needs root, but for `--dry-run`.

## OPTIONS
= `--confirm`
A person confirms with Enter, or with `zorvactl confirm`. It is also taken back when the command or its terminal ends before.

= `--automatic`
This is for the service that runs it after each change of the data directory.

## SEE ALSO
`zorvactl-revert`(1), `zorvactl-confirm`(1), `agent.toml`(5)
)";

constexpr std::string_view kConfirm = R"(
Keeps the settings that `zorvactl apply --confirm` has on trial. Without it they are taken back when their time is over.

## SEE ALSO
`zorvactl-apply`(1)
)";

constexpr std::string_view kRevert = R"(
Gives the owner of each interface back what it had before the first change, or lets it learn its settings again where it had
none of its own. If the interface has another owner by now, a note says so. The stored settings stay.

## SEE ALSO
`zorvactl-apply`(1)
)";

constexpr std::string_view kUser = R"(
Keeps the file of users of `zorvacimd`(8) on this host. It is the one that </etc/zorvagent/zorvacimd.toml> names, or
</etc/zorvagent/users>. A running server reads it by itself. `zorvacimd`(8) describes the file and the roles.

A password is asked for twice at the terminal; where standard input is no terminal, it is a line of that. It has at least 8
characters.

## COMMANDS
= `add`
The role is `read` unless `--role` says otherwise.

= `role`
All roles of the user are replaced.

## SEE ALSO
`zorvacimd`(8), `zorvacimd.toml`(5)
)";

constexpr std::string_view kCompletion = R"(
Prints the script that completes commands, options, interfaces, classes, object paths, methods, properties and files. The
script asks `zorvactl` itself, so that it knows what this host has. The packages install it where each shell looks for it.
)";

constexpr std::string_view kHelp = R"(
Prints the manual page of a command, as text in the width of the terminal; of `agent.toml` that of the agent's configuration.
Without a name it is the list of commands, as `zorvactl --help`.
)";

constexpr std::string_view kRegister = R"(
Gives the providers to another CIM server of this host, the Small Footprint CIM Broker or OpenPegasus. Links to the libraries, the
classes and the registration are put where that server looks, all of them or none, and the commands to run then are printed. A file
of somebody else is never replaced.

## EXAMPLES
    zorvactl register sfcb --dry-run
    zorvactl register sfcb
    zorvactl register pegasus --remove
)";

constexpr Prose kAll[] = {
    {"", kProgram},
    {"show", kShow},
    {"check", kCheck},
    {"watch", kWatch},
    {"tree", kTree},
    {"classes", kClasses},
    {"graph", kGraph},
    {"enumerate", kEnumerate},
    {"names", kNames},
    {"get", kGet},
    {"associators", kAssociators},
    {"associator-names", kAssociatorNames},
    {"references", kReferences},
    {"reference-names", kReferenceNames},
    {"modify", kModify},
    {"invoke", kInvoke},
    {"ifcfg", kIfcfg},
    {"dns", kDns},
    {"domain", kDomain},
    {"suffixes", kSuffixes},
    {"overlay", kOverlay},
    {"apply", kApply},
    {"confirm", kConfirm},
    {"revert", kRevert},
    {"user", kUser},
    {"register", kRegister},
    {"completion", kCompletion},
    {"help", kHelp},
};

}  // namespace

std::span<const Prose> allProse() { return kAll; }

std::string_view proseOf(std::string_view command) {
  const auto found =
      std::find_if(std::begin(kAll), std::end(kAll), [&](const Prose& each) { return each.command == command; });
  return found == std::end(kAll) ? std::string_view() : found->text;
}

const std::string_view kAgentConfigProse = R"(
The configuration of the agent, which `zorvactl`(1), `zorvacimd`(8) and the providers in any other CIM server read when they
start. It is </etc/zorvagent/agent.toml>, or the file that the variable `ZORVAGENT_CONFIG` names. If
</etc/zorvagent/agent.toml> does not exist, every key has its default; a file that the variable names must exist. It is TOML
1.0, of at most 256 KiB.

Every key is optional. An unknown key or a wrong value is an error that names file, line and key; `zorvactl tree` shows it. A
path that is not absolute is taken from the directory of the file.

## FILES
= </etc/zorvagent/agent.toml>
The configuration. The package installs it with every key commented out, but for `apply`.

= </var/lib/zorvagent/>
The data directory.

## EXAMPLES
A host that is described in a file:

    [tree]
    source = "file"
    file = "tree.json"

## SEE ALSO
`zorvactl`(1), `zorvactl-apply`(1), `zorvactl-tree`(1), `zorvacimd`(8), `zorvacimd.toml`(5)
)";

}  // namespace zorva::cli
