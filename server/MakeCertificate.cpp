#include "server/MakeCertificate.h"

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <string>
#include <vector>

#include "server/CertificateInUse.h"
#include "server/SelfSigned.h"
#include "util/InstalledPlaces.h"
#include "util/Names.h"
#include "util/ServiceHost.h"

namespace zorva::server {

namespace {

constexpr unsigned int kForAll = 0644;
constexpr unsigned int kForGroup = 0640;

/// A certificate has only names in ASCII.
bool isPlain(const std::string& name) {
  return !name.empty() && std::all_of(name.begin(), name.end(), [](char c) { return c > ' ' && c < 0x7F; });
}

/// By what clients reach this host: its names first.
std::vector<std::string> namesOf(const Config& config) {
  std::vector<std::string> names;
  const auto add = [&](const std::vector<std::string>& more) {
    for (const std::string& each : more) {
      const auto isSame = [&](const auto& known) { return util::sameName(known, each); };
      if (isPlain(each) && std::none_of(names.begin(), names.end(), isSame)) names.push_back(each);
    }
  };
  add(util::ownNames());
  add(config.names);
  add({"127.0.0.1", "::1"});
  add(util::ownAddresses());
  return names;
}

std::string listed(const std::vector<std::string>& names) {
  std::string text;
  for (const std::string& each : names) text += (text.empty() ? "" : " ") + each;
  return text;
}

std::string nextSteps(const Config& config, const http::TlsFiles& files, const std::string& host,
                      const std::string& fingerprint) {
  std::string text = "\nNext:\n";
  if (config.tls.certificate.empty()) {
    const std::string file = config.file.empty() ? util::installedPlaces().config + "zorvacimd.toml" : config.file;
    text += "  name the files in " + file + ":\n    [tls]\n    certificate = \"" + files.certificate +
            "\"\n    key = \"" + files.key +
            "\"\n    addresses = [\"0.0.0.0\", \"::\"]    # without this line, only this host reaches it\n";
  }
  return text +
         "  make a user: zorvactl user add NAME\n  systemctl restart zorvacimd\n  on another host: zorvactl --url "
         "https://NAME@" +
         host + ":" + std::to_string(config.tlsPort) + "/root/cimv2 --fingerprint " + fingerprint + " show\n";
}

}  // namespace

void makeCertificate(const Config& config) {
  http::TlsFiles files = config.tls;
  const std::string tls = util::installedPlaces().config + "tls/";
  if (files.certificate.empty()) files = {tls + "server.crt", tls + "server.key", {}};
  const std::vector<std::string> names = namesOf(config);
  const std::time_t now = std::time(nullptr);
  const SelfSigned made = makeSelfSigned(names, now);
  writeNewFiles({{files.key, made.key, kForGroup, "zorva"}, {files.certificate, made.certificate, kForAll, {}}});
  const auto identity = http::TlsIdentity::load(files);
  const std::string text = "certificate: " + files.certificate + ", until " + dateText(identity->validUntil()) +
                           "\nkey: " + files.key + "\nfor: " + listed(names) +
                           "\nSHA-256 fingerprint: " + made.fingerprint + "\n" +
                           nextSteps(config, files, names.front(), made.fingerprint);
  std::fputs(text.c_str(), stdout);
}

}  // namespace zorva::server
