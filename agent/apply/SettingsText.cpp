#include "agent/apply/SettingsText.h"

#include <algorithm>

#include "agent/config/Config.h"
#include "agent/tree/IpAddress.h"
#include "util/Escape.h"

namespace zorva::agent {

std::string inOneLine(const std::string& text) {
  constexpr std::size_t kLongest = 255;
  std::string line;
  util::appendEscaped(line, text.substr(0, kLongest));
  return line;
}

std::string canonicalAddress(const std::string& address) { return textOfAddress(bytesOfAddress(address)); }

std::string canonicalServer(const std::string& server) {
  const std::string address = canonicalAddress(withoutZone(server));
  return address.empty() ? address : address + server.substr(withoutZone(server).size());
}

std::string withoutZone(const std::string& server) { return server.substr(0, server.find('%')); }

std::string zoneOf(const std::string& server) {
  const std::size_t percent = server.find('%');
  return percent == std::string::npos ? std::string() : server.substr(percent + 1);
}

std::string foreignZone(const std::string& interface, const StringList& servers) {
  for (const std::string& server : servers) {
    const std::string zone = zoneOf(server);
    if (zone.empty() || zone == interface) continue;
    return inOneLine(interface) + ": server " + inOneLine(server) + " is on another link; name it for " +
           inOneLine(zone);
  }
  return {};
}

std::string withoutFinalDot(const std::string& domain) {
  return domain.size() > 1 && domain.ends_with('.') ? domain.substr(0, domain.size() - 1) : domain;
}

bool holds(const StringList& list, const std::string& value) {
  return std::find(list.begin(), list.end(), value) != list.end();
}

void addOnce(StringList& list, const std::string& value) {
  if (!holds(list, value)) list.push_back(value);
}

Expected<JsonValue, std::string> stateIn(const std::string& saved) {
  try {
    return parseJson(saved, "the state before the change");
  } catch (const ConfigError& error) {
    return unexpected(std::string(error.what()));
  }
}

StringList textsIn(const JsonValue& object, const std::string& name) {
  StringList texts;
  if (const JsonValue* list = object.find(name); list != nullptr) {
    for (const JsonValue& item : list->items) texts.push_back(item.text);
  }
  return texts;
}

std::string textIn(const JsonValue& object, const std::string& name) {
  const JsonValue* text = object.find(name);
  return text == nullptr ? std::string() : text->text;
}

std::uint64_t numberIn(const JsonValue& object, const std::string& name) {
  const JsonValue* number = object.find(name);
  return number == nullptr ? 0 : number->number;
}

}  // namespace zorva::agent
