#include "agent/apply/NetworkManagerProfile.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <string_view>
#include <utility>

#include "agent/sources/NetworkManagerValues.h"
#include "agent/tree/IpAddress.h"

namespace zorva::agent {
namespace {

constexpr const char* kConnection = "org.freedesktop.NetworkManager.Settings.Connection";
constexpr std::uint32_t kUnsaved = 0x1;  // NM_SETTINGS_CONNECTION_FLAG_UNSAVED
constexpr std::uint32_t kToDisk = 0x1;   // NM_SETTINGS_UPDATE2_FLAG_TO_DISK

// The settings that replaceDns() replaces, and the old forms of addresses and routes. NetworkManager gives both forms,
// and takes the old one where it gets both, although that has no room for all. "dns-data", which has names beside the
// addresses, is unknown before version 1.42.
constexpr std::array<std::string_view, 6> kNotCopied{"dns",       "dns-data", "dns-search", "ignore-auto-dns",
                                                     "addresses", "routes"};

void readFamily(BusReader& reader, NetworkManagerProfile::Family& family) {
  StringList inFull;
  reader.forEachProperty([&](const std::string& name) {
    if (name == "method") reader.ifText(family.method);
    if (name == "dns") {
      ifAddressNumbers(reader, family.dns.servers);
      ifAddressBytes(reader, family.dns.servers);
    }
    if (name == "dns-data") ifTexts(reader, inFull);
    if (name == "dns-search") ifTexts(reader, family.dns.searches);
    if (name == "ignore-auto-dns") reader.ifVariant("b", [&] { family.dns.ignoresLearned = reader.flag(); });
  });
  if (!inFull.empty()) family.dns.servers = std::move(inFull);
}

void readSettings(BusReader& reader, NetworkManagerProfile& profile) {
  reader.forEachEntry("sa{sv}", [&] {
    const std::string section = reader.text();
    if (section == "ipv4") return readFamily(reader, profile.ipv4);
    if (section == "ipv6") return readFamily(reader, profile.ipv6);
    reader.forEachProperty([&](const std::string& name) {
      if (section != "connection") return;
      if (name == "id") reader.ifText(profile.name);
      if (name == "uuid") reader.ifText(profile.uuid);
    });
  });
}

template <typename Fill>
void writeSetting(BusWriter& writer, const char* name, const char* type, Fill fill) {
  writer.entry("sv", [&] {
    writer.text(name);
    writer.variant(type, fill);
  });
}

void writeTexts(BusWriter& writer, const char* name, const StringList& texts) {
  if (texts.empty()) return;
  writeSetting(writer, name, "as", [&] {
    writer.array("s", [&] {
      for (const std::string& text : texts) writer.text(text);
    });
  });
}

void writeAddress(BusWriter& writer, const std::string& address, bool isIPv4) {
  const std::vector<unsigned char> bytes = bytesOfAddress(address);
  if (!isIPv4) return writer.bytes(bytes);
  std::uint32_t number = 0;
  std::memcpy(&number, bytes.data(), sizeof number);
  writer.number(number);
}

void writeAddresses(BusWriter& writer, const StringList& addresses, bool isIPv4) {
  if (addresses.empty()) return;
  writeSetting(writer, "dns", isIPv4 ? "au" : "aay", [&] {
    writer.array(isIPv4 ? "u" : "ay", [&] {
      for (const std::string& address : addresses) writeAddress(writer, address, isIPv4);
    });
  });
}

void writeDns(BusWriter& writer, const ProfileDns& dns, bool isIPv4) {
  const auto isOfFamily = isIPv4 ? isIPv4Address : isIPv6Address;
  if (std::all_of(dns.servers.begin(), dns.servers.end(), isOfFamily)) {
    writeAddresses(writer, dns.servers, isIPv4);
  } else {
    writeTexts(writer, "dns-data", dns.servers);
  }
  writeTexts(writer, "dns-search", dns.searches);
  if (dns.ignoresLearned) writeSetting(writer, "ignore-auto-dns", "b", [&] { writer.flag(true); });
}

// A family's settings, with others in the place of those of DNS.
void copyFamily(BusReader& reader, BusWriter& writer, const ProfileDns& dns, bool isIPv4) {
  writer.array("{sv}", [&] {
    reader.forEachEntry("sv", [&] {
      const std::string name = reader.text();
      if (std::find(kNotCopied.begin(), kNotCopied.end(), name) != kNotCopied.end()) return reader.skip();
      writer.entry("sv", [&] {
        writer.text(name);
        writer.copy(reader);
      });
    });
    writeDns(writer, dns, isIPv4);
  });
}

void copySettings(BusReader& reader, BusWriter& writer, const NetworkManagerProfile& profile) {
  writer.array("{sa{sv}}", [&] {
    reader.forEachEntry("sa{sv}", [&] {
      const std::string section = reader.text();
      writer.entry("sa{sv}", [&] {
        writer.text(section);
        if (section == "ipv4") return copyFamily(reader, writer, profile.ipv4.dns, true);
        if (section == "ipv6") return copyFamily(reader, writer, profile.ipv6.dns, false);
        writer.copy(reader);
      });
    });
  });
}

}  // namespace

Expected<NetworkManagerProfile, std::string> readProfile(BusCalls& bus, const std::string& path) {
  NetworkManagerProfile profile;
  profile.path = path;
  const BusObject object = networkManagerObject(bus, path);
  auto done = object.readProperties(kConnection, [&](BusReader& reader, const std::string& name) {
    if (name == "Filename") reader.ifText(profile.file);
    if (name == "Flags") reader.ifVariant("u", [&] { profile.isInMemory = (reader.number() & kUnsaved) != 0; });
  });
  if (done) {
    done = object.call(kConnection, "GetSettings", {}, [&](BusReader& reader) { readSettings(reader, profile); });
  }
  if (!done) return unexpected(done.error());
  return profile;
}

Expected<void, std::string> replaceDns(BusCalls& bus, const NetworkManagerProfile& profile) {
  const BusObject object = networkManagerObject(bus, profile.path);
  Expected<void, std::string> updated;
  const auto asked = object.call(kConnection, "GetSettings", {}, [&](BusReader& settings) {
    updated = object.call(kConnection, "Update2", [&](BusWriter& arguments) {
      copySettings(settings, arguments, profile);
      arguments.number(kToDisk);
      arguments.array("{sv}", [] {});  // no further arguments
    });
  });
  return asked ? updated : asked;
}

}  // namespace zorva::agent
