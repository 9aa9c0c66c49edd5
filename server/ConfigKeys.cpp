// The keys of zorvacimd.toml. Config.cpp reads them; the installed sample and zorvacimd.toml(5) are made of them.

#include "server/Config.h"

namespace zorva::server {

namespace {

using util::TomlKey;
using util::TomlType;

constexpr int kLongestSeconds = 24 * 60 * 60;

constexpr TomlKey kListen[] = {
    {.name = "addresses",
     .type = TomlType::Texts,
     .standard = R"(["127.0.0.1", "::1"])",
     .example = R"(["127.0.0.1"])",
     .meaning =
         "The loopback addresses for plain HTTP. Without this key the host may lack one of the two. From the next "
         "start on."},
    {.name = "port",
     .type = TomlType::Number,
     .standard = "5988",
     .example = "15988",
     .meaning = "The port for plain HTTP; 0 takes one that is free, and the server prints it. From the next start on.",
     .least = 0,
     .most = 65535},
    {.name = "socket",
     .type = TomlType::Path,
     .standard = R"("/run/zorvacimd/cim.sock")",
     .example = R"("")",
     .meaning =
         "A Unix socket that speaks HTTP; empty: none. Without this key it is made where the server may write in "
         "that directory. All users may connect, and the kernel says who they are. From the next start on."},
    {.name = "names",
     .type = TomlType::Texts,
     .example = R"(["host1.example.org"])",
     .meaning = "Names of this host that it does not know itself: clients may use them in the header field Host. There "
                "are none by default."},
};

constexpr TomlKey kTls[] = {
    {.name = "certificate",
     .type = TomlType::Path,
     .standard = R"("")",
     .example = R"("/etc/zorvagent/tls/server.crt")",
     .meaning = "The server's certificate in PEM, with the chain after it. Empty: no HTTPS."},
    {.name = "key",
     .type = TomlType::Path,
     .standard = R"("")",
     .example = R"("/etc/zorvagent/tls/server.key")",
     .meaning = "Its private key in PEM, in a file that not all users may read."},
    {.name = "addresses",
     .type = TomlType::Texts,
     .standard = R"(["127.0.0.1", "::1"])",
     .example = R"(["0.0.0.0", "::"])",
     .meaning = "The addresses for HTTPS, TLS 1.2 and 1.3. One that other hosts reach needs a way to log in: users, or "
                "`client_ca`. From the next start on."},
    {.name = "port",
     .type = TomlType::Number,
     .standard = "5989",
     .example = "15989",
     .meaning = "The port for HTTPS; 0 takes one that is free. From the next start on.",
     .least = 0,
     .most = 65535},
    {.name = "client_ca",
     .type = TomlType::Path,
     .standard = R"("")",
     .example = R"("/etc/zorvagent/tls/clients.crt")",
     .meaning =
         "Authorities in PEM. Clients are asked for a certificate of one of them and need not have one. One that "
         "has expired, is of another authority or is not for clients is refused with the status 403."},
};

constexpr TomlKey kLimits[] = {
    {.name = "body_kib",
     .type = TomlType::Number,
     .standard = "4096",
     .example = "1024",
     .meaning = "The size of one request in KiB.",
     .least = 1,
     .most = 1024 * 1024},
    {.name = "bodies_mib",
     .type = TomlType::Number,
     .standard = "64",
     .example = "16",
     .meaning = "The size in MiB of all requests together that are still arriving; the slowest gives way.",
     .least = 1,
     .most = 16 * 1024},
    {.name = "header_kib",
     .type = TomlType::Number,
     .standard = "32",
     .example = "16",
     .meaning = "The size of request line and header fields in KiB. From the next start on.",
     .least = 4,
     .most = 1024},
    {.name = "nesting",
     .type = TomlType::Number,
     .standard = "128",
     .example = "64",
     .meaning = "How deep elements of XML may be nested. From the next start on.",
     .least = 16,
     .most = 1000},
    {.name = "connections",
     .type = TomlType::Number,
     .standard = "1000",
     .example = "200",
     .meaning =
         "Connections that are open at once. If all are taken, one that never had a response gives way, else the "
         "one that has been idle for longest.",
     .least = 1,
     .most = 100'000},
    {.name = "requests",
     .type = TomlType::Number,
     .standard = "256",
     .example = "64",
     .meaning = "Requests that are in work at once. If all places are taken, a client that does not read its response "
                "gives way, or the request gets the status 503.",
     .least = 1,
     .most = 10'000},
    {.name = "workers",
     .type = TomlType::Number,
     .standard = "32",
     .example = "8",
     .meaning = "Requests that run at once. One that waits for its client does not count.",
     .least = 1,
     .most = 1000},
    {.name = "arrival_seconds",
     .type = TomlType::Number,
     .standard = "30",
     .example = "10",
     .meaning = "The time for a request to arrive.",
     .least = 1,
     .most = kLongestSeconds},
    {.name = "idle_seconds",
     .type = TomlType::Number,
     .standard = "60",
     .example = "10",
     .meaning = "The time between two requests of a connection.",
     .least = 1,
     .most = kLongestSeconds},
    {.name = "provider_seconds",
     .type = TomlType::Number,
     .standard = "60",
     .example = "120",
     .meaning = "The time for the work on a request. A provider that needs longer is logged, and its client gets an "
                "error.",
     .least = 1,
     .most = kLongestSeconds},
    {.name = "client_seconds",
     .type = TomlType::Number,
     .standard = "20",
     .example = "60",
     .meaning = "The time in which a client may read nothing of its response.",
     .least = 1,
     .most = kLongestSeconds},
    {.name = "drain_seconds",
     .type = TomlType::Number,
     .standard = "10",
     .example = "30",
     .meaning = "The time for requests in work when the server ends.",
     .least = 1,
     .most = kLongestSeconds},
};

constexpr TomlKey kHttp[] = {
    {.name = "threads",
     .type = TomlType::Number,
     .standard = "2",
     .example = "4",
     .meaning = "Threads for input and output; other threads wait for providers. From the next start on.",
     .least = 1,
     .most = 64},
    {.name = "gzip",
     .type = TomlType::Switch,
     .standard = "true",
     .example = "false",
     .meaning = "Whether responses are compressed for clients that accept it."},
    {.name = "console",
     .type = TomlType::Switch,
     .standard = "true",
     .example = "false",
     .meaning = "Whether a browser that opens the server's URL gets the console, a page that shows and changes the "
                "settings. From the next start on."},
};

constexpr TomlKey kPull[] = {
    {.name = "contexts",
     .type = TomlType::Number,
     .standard = "100",
     .example = "20",
     .meaning = "Enumerations that are open at once; the oldest gives way. 0: none can be opened.",
     .least = 0,
     .most = 10'000},
    {.name = "client_contexts",
     .type = TomlType::Number,
     .standard = "25",
     .example = "5",
     .meaning = "Of these, those of one client, which is a user of this host.",
     .least = 1,
     .most = 10'000},
    {.name = "default_seconds",
     .type = TomlType::Number,
     .standard = "60",
     .example = "30",
     .meaning = "How long one stays open without a pull if its client does not say. Not more than `longest_seconds`.",
     .least = 1,
     .most = kLongestSeconds},
    {.name = "longest_seconds",
     .type = TomlType::Number,
     .standard = "600",
     .example = "3600",
     .meaning = "The longest time that a client may ask for.",
     .least = 1,
     .most = kLongestSeconds},
    {.name = "memory_mib",
     .type = TomlType::Number,
     .standard = "64",
     .example = "16",
     .meaning = "The memory of all of them in MiB.",
     .least = 1,
     .most = 16 * 1024},
};

constexpr TomlKey kAgent[] = {
    {.name = "config",
     .type = TomlType::Path,
     .standard = R"("")",
     .example = R"("/etc/zorvagent/agent.toml")",
     .meaning = "The agent's configuration. Empty: the file that the variable ZORVAGENT_CONFIG names, else "
                "</etc/zorvagent/agent.toml>. From the next start on."},
    {.name = "provider_dir",
     .type = TomlType::Path,
     .standard = R"("")",
     .example = R"("/opt/zorva/lib")",
     .meaning = "The directory of the provider libraries. Empty: the one that belongs to the program. From the next "
                "start on."},
};

constexpr TomlKey kAccess[] = {
    {.name = "users",
     .type = TomlType::Path,
     .standard = R"("/etc/zorvagent/users")",
     .example = R"("users")",
     .meaning = "The file of users, which `zorvactl user` writes. If it does not exist, there are no users."},
    {.name = "anonymous",
     .standard = R"("read")",
     .example = R"("none")",
     .meaning = "What clients on loopback addresses may do without a login. With `operate` every user of this host may "
                "change settings; the log says so at the start.",
     .words = "read|operate|none"},
    {.name = "group",
     .standard = R"("zorva")",
     .example = R"("adm")",
     .meaning = "The local group whose members may change settings through the Unix socket. root may always."},
    {.name = "socket",
     .standard = R"("read")",
     .example = R"("none")",
     .meaning = "What all other local users may do through the Unix socket.",
     .words = "read|none"},
};

constexpr TomlKey kAudit[] = {
    {.name = "file",
     .type = TomlType::Path,
     .standard = R"("")",
     .example = R"("/var/log/zorvacimd/audit.log")",
     .meaning = "The file of these lines. Empty: they are among the lines of the log."},
};

constexpr TomlKey kMetrics[] = {
    {.name = "check_interval",
     .type = TomlType::Number,
     .standard = "0",
     .example = "60",
     .meaning = "How often, in seconds, each DNS server of this host is asked a question for these values; 0: never. A "
                "thread of its own asks, and no scrape waits for it.",
     .least = 0,
     .most = kLongestSeconds},
};

constexpr TomlKey kWatch[] = {
    {.name = "clients",
     .type = TomlType::Number,
     .standard = "32",
     .example = "4",
     .meaning = "Clients that watch at once, as `zorvactl watch` does with a server. One more gets the status 503. 0: "
                "nobody may.",
     .least = 0,
     .most = 1000},
};

constexpr TomlKey kLog[] = {
    {.name = "level",
     .type = TomlType::Number,
     .standard = "5000",
     .example = "4500",
     .meaning = "Lines below this level are dropped: 4500 a line for each request, 5000 changes and what was refused, "
                "6000 errors.",
     .least = 0,
     .most = 100'000},
    {.name = "target",
     .type = TomlType::Path,
     .standard = R"("")",
     .example = R"("syslog")",
     .meaning =
         "Where the lines go, those of the providers included: `stderr`, `syslog`, `off`, or the path of a file. "
         "Empty: as the agent's configuration says."},
};

constexpr util::TomlSection kSections[] = {
    {"listen", "Plain HTTP, which is for this host only.", kListen},
    {"tls",
     "HTTPS. `zorvacimd --make-certificate` makes a certificate where there is none. SIGHUP reads the files "
     "again, for new connections.",
     kTls},
    {"limits", "What one client, and all of them together, may take.", kLimits},
    {"http", "The transport.", kHttp},
    {"pull", "Enumerations that a client pulls piece by piece. This table counts from the next start on.", kPull},
    {"agent", "The agent and the providers.", kAgent},
    {"access", "Who may do what: `read`, `operate` (also changes and methods) or `none`.", kAccess},
    {"audit", "A line for each change that a client makes or tries, and for each refusal.", kAudit},
    {"metrics", "What Prometheus reads at `/metrics`.", kMetrics},
    {"watch", "Changes of the host, which the server reports at `/watch` as they happen.", kWatch},
    {"log", "The log.", kLog},
};

}  // namespace

util::TomlSections configKeys() { return kSections; }

}  // namespace zorva::server
