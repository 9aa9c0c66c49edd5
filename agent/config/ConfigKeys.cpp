// The keys of agent.toml. Config.cpp reads them; the installed file and agent.toml(5) are made of them.

#include <iterator>

#include "agent/config/Config.h"

namespace zorva::agent {

namespace {

using util::TomlKey;
using util::TomlType;

constexpr TomlKey kAgent[] = {
    {.name = "data_dir",
     .type = TomlType::Path,
     .standard = R"("/var/lib/zorvagent/")",
     .example = R"("/srv/zorvagent/")",
     .meaning = "The data directory: the files of settings, the values that were set, and what the host had before "
                "they were applied."},
    {.name = "system_name",
     .standard = R"("")",
     .example = R"("host1")",
     .meaning = "The name of this host in CIM. Empty: the name that the kernel has, or that of the tree's file."},
    {.name = "language", .standard = R"("en")", .example = R"("de")", .meaning = "The language of messages."},
};

constexpr TomlKey kTree[] = {
    {.name = "source",
     .standard = R"("host")",
     .example = R"("file")",
     .meaning = "Where the tree comes from: this host, or the file that `file` names.",
     .words = "host|file"},
    {.name = "file",
     .type = TomlType::Path,
     .standard = R"("")",
     .example = R"("tree.json")",
     .meaning = "With `source = \"file\"`: a JSON document as `zorvactl tree --output json` writes it."},
    {.name = "include_loopback",
     .type = TomlType::Switch,
     .standard = "false",
     .example = "true",
     .meaning = "Whether loopback interfaces are in the tree."},
    {.name = "apply",
     .standard = R"("overlay")",
     .example = R"("host")",
     .meaning = "What a change does. With `overlay` it is stored in the data directory, and only `zorvactl apply` "
                "brings it to the host. With `host` it is brought to the host at once; this needs `source = \"host\"`.",
     .words = "overlay|host",
     .installed = R"("host")"},
};

constexpr std::string_view kTargetMeaning =
    "Where the lines go: `stderr`, `syslog`, `off`, or the path of a file, which is made if it is missing.";

constexpr TomlKey kLog[] = {
    {.name = "level",
     .type = TomlType::Number,
     .standard = "6000",
     .example = "4000",
     .meaning = "Lines below this level are dropped: 3000 the way through the providers, 4000 details, 5000 warnings, "
                "6000 errors."},
    {.name = "target",
     .type = TomlType::Path,
     .standard = R"("stderr")",
     .example = R"("syslog")",
     .meaning = kTargetMeaning},
    {.name = "trace_level",
     .type = TomlType::Number,
     .standard = "6000",
     .example = "3000",
     .meaning = "The same for the trace, which has lines of the providers alone, with their place in the source."},
    {.name = "trace_target",
     .type = TomlType::Path,
     .standard = R"("off")",
     .example = R"("/var/log/zorva.trace")",
     .meaning = kTargetMeaning},
};

constexpr int kShortestInterval = 5;
constexpr int kLongestInterval = 86400;

constexpr TomlKey kBmc[] = {
    {.name = "url",
     .standard = R"("")",
     .example = R"("https://192.0.2.20")",
     .meaning = "The Redfish service: `https://HOST` or `https://HOST:PORT`. Empty: the one that the firmware names."},
    {.name = "user",
     .standard = R"("")",
     .example = R"("operator")",
     .meaning = "The login. It needs `password_file`. Empty, without `url`: an account that the service processor "
                "offers over IPMI."},
    {.name = "password_file",
     .type = TomlType::Path,
     .standard = R"("")",
     .example = R"("bmc.password")",
     .meaning = "The file with the password in its first line. Only its owner may use it (0600)."},
    {.name = "ca_file",
     .type = TomlType::Path,
     .standard = R"("")",
     .example = R"("/etc/ssl/bmc.pem")",
     .meaning = "Authorities that may have signed the service's certificate. Empty: those of the system."},
    {.name = "fingerprint",
     .standard = R"("")",
     .example = R"("00112233 44556677 8899aabb ccddeeff 00112233 44556677 8899aabb ccddeeff")",
     .meaning = "The SHA-256 of the certificate itself, in place of `ca_file`; colons and blanks in it do not matter."},
    {.name = "interval",
     .type = TomlType::Number,
     .standard = "60",
     .example = "30",
     .meaning = "Seconds from one reading to the next.",
     .least = kShortestInterval,
     .most = kLongestInterval},
    {.name = "file",
     .type = TomlType::Path,
     .standard = R"("/run/zorvagent/bmc.json")",
     .example = R"("/run/zorvagent/other.json")",
     .meaning = "Where the agent finds what was read. With `source = \"file\"` nothing is read unless this is set."},
};

constexpr util::TomlSection kSections[] = {
    {"agent", "What the agent keeps, and the host's name.", kAgent},
    {"tree", "What the agent reads, and what a change does.", kTree},
    {"log", "The log of the agent and of the providers.", kLog},
    {"bmc", "The service processor, which `zorva-bmc`(8) asks over Redfish.", kBmc},
};

}  // namespace

util::TomlSections configKeys() { return kSections; }

}  // namespace zorva::agent
