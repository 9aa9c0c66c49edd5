#include "server/Manual.h"

#include "server/Config.h"

namespace zorva::server {

namespace {

constexpr const char* kConfigOpening =
    "The configuration of zorvacimd; zorvacimd.toml(5) explains it. Every key is optional. A key that is commented out "
    "has its default here. What is not known is an error, which zorvacimd --check-config shows. Options of the command "
    "line win over this file.";

constexpr const char* kConfigProse = R"(
The configuration of `zorvacimd`(8) is </etc/zorvagent/zorvacimd.toml>, or the file that `--config` names. Without it every
key has its default. It is TOML 1.0, of at most 256 KiB.

Every key is optional. An unknown key or a wrong value is an error that names file, line and key. A path that is not absolute
is taken from the directory of the file. Options of the command line win over the file.

SIGHUP reads the file again. Keys whose meaning says "from the next start on" then stay as they were; the others count at
once. If the file is wrong, the log says why and all stays as it was.

    zorvacimd --config zorvacimd.toml --check-config

## FILES
= </etc/zorvagent/zorvacimd.toml>
The configuration. The package installs it with every key commented out.

## EXAMPLES
A server that other hosts reach, for the users of the file of users alone:

    [tls]
    certificate = "/etc/zorvagent/tls/server.crt"
    key = "/etc/zorvagent/tls/server.key"
    addresses = ["0.0.0.0", "::"]
    [access]
    anonymous = "none"

## SEE ALSO
`zorvacimd`(8), `agent.toml`(5), `zorvactl-user`(1)
)";

constexpr const char* kProse = R"(
`zorvacimd` answers CIM operations (DSP0200 1.4, DSP0201 2.4: CIM-XML over HTTP) from the providers of the DNS client profile and
their companions. The classes are in the namespace `root/cimv2`; what the server itself is and which profiles it has, in
`interop` and `root/interop`. Any request path will do.

Plain HTTP is for this host: loopback addresses, and a Unix socket. Clients on loopback addresses may read without a login.
Other hosts use HTTPS, which needs a certificate, and addresses that other hosts reach need a way to log in; without, the
server does not start.

When it has begun to listen on a port of its own choice, or on a terminal, it prints its address.

Options win over the configuration, `zorvacimd.toml`(5).

## OPTIONS
= `--config`
If that does not exist either, every key has its default.

= `--check-config`
It opens the log, the certificate and the provider libraries as a start would, and prints each thing that is wrong. It warns of
a certificate that expires within 30 days. A log file that was not there before is removed again.

= `--make-certificate`
It is for the names and addresses of this host, for a year, with a key of ECDSA P-256. The files are those that `[tls]` names, or
</etc/zorvagent/tls/server.crt> and <server.key>. It replaces no file, and writes both or none. The key is readable by its
owner and the group `zorva`. The SHA-256 fingerprint is that by which clients know the server.

## USERS
`zorvactl user` (see `zorvactl-user`(1)) writes the file of users. It is UTF-8, at most 1 MiB and 10,000 lines; lines that begin
with # are comments. Each other line is a user:

    name:hash:role[:namespace=role[,...]][:fingerprint=HEX...][:subject=DN]

The name has 1 to 64 of the characters A-Z a-z 0-9 . _ @ - and begins with a letter or a digit. The hash is of the password,
by yescrypt (`crypt`(5)); * means that the user has none. The roles are `read` (all that only reads), `operate` (also changes
and methods) and `none`; the first one counts in all namespaces that the line does not name. A fingerprint is SHA-256 of a
client certificate of the user, 64 hexadecimal digits. The subject of a certificate (RFC 4514) comes last, since it may
contain colons.

A login is taken over TLS only. One that was right is remembered for five minutes, or until the user's line changes. After a
login that was wrong, the next ones of that address are refused for a time, which doubles from 0.25 s to 8 s with each
failure. The log has a line for each.

## LIMITS
Where all connections are taken, one that has never had an answer gives way, the one that has been at it for longest first.
Where a client, or all of them together, have as many enumerations open as they may, the one that has waited longest is
closed: of that client, or of the client that has most. Where all places for requests are taken, a client that lets its
response wait gives way, or the request is answered with the status 503. A provider that does not return in time is logged, its
request is answered with an error, and another thread takes the place of the one it holds.

## WEB PAGES
A browser sends requests of every page that it shows, also to this server. So the header `Host` must be a name or an address of
this host: the kernel's name, with and without its domain, localhost, the names that </etc/hosts> gives together with the
kernel's name, the addresses of its interfaces, the names in the certificate (for HTTPS), and `listen.names`. A header `Origin`
must be that of the server itself. Other requests are answered with the status 403 and leave a line in the log. At the Unix
socket any `Host` will do.

## METRICS AND CHANGES
GET of `/metrics` returns what Prometheus reads: DNS servers in their order, drift, what the server does; with
`metrics.check_interval` also which DNS servers answer. GET of `/watch` returns changes of the host as they happen, a JSON
object on each line; `zorvactl watch --url` shows them. Both are for clients that may read.

## SIGNALS
= `SIGHUP`
Read the configuration again and open the log anew. `zorvacimd.toml`(5) says which keys take effect at once; new files of
`[tls]` are for new connections, open ones stay. A configuration or a certificate that is wrong is logged, and the old one stays.
A certificate that expires within 30 days leaves a line in the log at the start and each day.

= `SIGTERM`, `SIGINT`
Take no more connections, finish the requests in work, and end.

## CONSOLE
A browser that opens a URL of the server gets a page that shows the settings and changes them. The page asks the server by CIM-XML, as any
client does, and its user needs the same rights. It logs in over HTTPS only. A client whose header `Accept` does not name text/html gets
a text. `http.console` switches the page off.

## SERVICE MANAGER
It takes sockets that are handed over as `sd_listen_fds`(3) has it, and tells readiness, reload and end as `sd_notify`(3) has it.
A socket whose name is `https` (`FileDescriptorName=`) or whose port is that of `[tls]` speaks HTTPS. The others are Unix
sockets, or must be loopback. If none speaks HTTPS, the server itself opens the addresses of `[tls]`.

## EXIT STATUS
= `0`
It ended as it was told to.

= `1`
It cannot serve.

= `2`
Wrong usage or configuration.

## ENVIRONMENT
= `ZORVAGENT_CONFIG`
The agent's configuration, if neither `--agent-config` nor `agent.config` names one.

## FILES
= </etc/zorvagent/zorvacimd.toml>
the configuration

= </etc/zorvagent/users>
the users and what they may do

= </etc/zorvagent/agent.toml>
the configuration of the agent

= </etc/zorvagent/tls/server.crt>, <server.key>
what `--make-certificate` writes

= </run/zorvacimd/cim.sock>
the Unix socket

## SEE ALSO
`zorvacimd.toml`(5), `agent.toml`(5), `zorvactl`(1), `zorvactl-user`(1)
)";

}  // namespace

manual::ConfigFile serverConfigFile() {
  return {"zorvacimd.toml", "the configuration of the CIM server zorvacimd", kConfigOpening, kConfigProse,
          configKeys()};
}

manual::Page serverPage(const manual::Command& program) {
  manual::Page page = manual::commandPage(program, kProse);
  page.number = 8;
  page.group = "System administration";
  page.summary = "a CIM server for the DNS client configuration of this host";
  return page;
}

void writeManual(const std::string& directory, const manual::Command& program) {
  const manual::ConfigFile config = serverConfigFile();
  manual::writePage(directory, serverPage(program), ZORVA_VERSION);
  manual::writePage(directory, manual::configPage(config), ZORVA_VERSION);
  manual::writeFile(directory + "/" + std::string(config.name), manual::sampleOf(config));
}

}  // namespace zorva::server
