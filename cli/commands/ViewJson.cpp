#include "cli/commands/ViewJson.h"

#include "broker/objects/PathText.h"
#include "cli/commands/CheckText.h"
#include "cli/output/JsonDocument.h"
#include "cli/output/Text.h"

namespace zorva::cli {

namespace {

Json ofClassRows(const std::vector<ClassRow>& rows) {
  Json list = Json::array();
  for (const ClassRow& row : rows) {
    Json entry;
    entry["class"] = row.name;
    if (!row.provider.empty()) {
      entry["provider"] = row.provider;
      entry["library"] = row.library;
    }
    entry["instances"] = row.count ? Json(*row.count) : Json(nullptr);
    if (!row.problem.empty()) entry["problem"] = asUtf8(row.problem);
    list.push_back(std::move(entry));
  }
  return list;
}

Json ofSetting(const SettingRow& row, bool hasSources) {
  Json entry;
  entry["setting"] = row.setting;
  entry["value"] = row.isList ? jsonOfTexts(row.values) : Json(asUtf8(row.values.empty() ? "" : row.values.front()));
  if (hasSources) entry["from"] = row.source == SettingSource::None ? Json(nullptr) : Json(sourceName(row.source));
  return entry;
}

template <typename Row, typename Convert>
Json ofRows(const std::vector<Row>& rows, Convert convert) {
  Json list = Json::array();
  for (const Row& row : rows) list.push_back(convert(row));
  return list;
}

Json orNull(const std::string& text) { return text.empty() ? Json(nullptr) : Json(asUtf8(text)); }

/// The fields that the tree has under the same names; null where nobody says.
void addFacts(Json& entry, const OwnerFacts& facts) {
  entry["dns_owner"] = orNull(facts.owner);
  entry["dns_profile"] = orNull(facts.profile);
  entry["dns_origin"] = orNull(facts.origin);
  entry["dns_servers_in_full"] = jsonOfTexts(facts.serversInFull);
  entry["dns_routing_domains"] = jsonOfTexts(facts.routingDomains);
  entry["dns_default_route"] = orNull(facts.defaultRoute);
  entry["dns_over_tls"] = orNull(facts.dnsOverTls);
  entry["dnssec"] = orNull(facts.dnssec);
  entry["llmnr"] = orNull(facts.llmnr);
  entry["multicast_dns"] = orNull(facts.multicastDns);
}

Json ofSettings(const std::vector<SettingRow>& rows, bool hasSources) {
  return ofRows(rows, [hasSources](const SettingRow& row) { return ofSetting(row, hasSources); });
}

Json ofInterface(const InterfaceRow& row, bool hasSources) {
  Json entry;
  entry["name"] = asUtf8(row.name);
  entry["system"] = asUtf8(row.system);
  entry["state"] = row.stateNumber ? Json(*row.stateNumber) : Json(nullptr);
  entry["state_word"] = row.hasStateWord() ? Json(asUtf8(row.state)) : Json(nullptr);
  entry["from"] = hasSources ? orNull(row.from()) : Json(nullptr);
  entry["servers"] = jsonOfTexts(row.servers);
  entry["domain_name"] = asUtf8(row.domainName);
  entry["suffixes"] = jsonOfTexts(row.suffixes);
  entry["host_name"] = asUtf8(row.hostName);
  entry["endpoint_domain_name"] = asUtf8(row.endpointDomain);
  entry["host_servers"] = row.source == SettingSource::File ? jsonOfTexts(row.hostServers) : Json(nullptr);
  addFacts(entry, row.facts);
  entry["settings"] = ofSettings(row.settings, hasSources);
  return entry;
}

Json ofHost(const HostRow& host, bool hasSources) {
  Json entry;
  entry["interface"] = orNull(host.interface);
  entry["place"] = orNull(host.place());
  entry["suffixes"] = jsonOfTexts(host.suffixes);
  entry["dns_server_addresses"] = jsonOfTexts(host.servers);
  entry["dns_suffixes"] = jsonOfTexts(host.ownSuffixes);
  addFacts(entry, host.facts);
  entry["resolver_servers"] = jsonOfTexts(host.resolverServers);
  entry["resolver_servers_not_asked"] = jsonOfTexts(host.resolverNotAsked);
  entry["resolver_search"] = jsonOfTexts(host.resolverSearch);
  entry["resolver_options"] = jsonOfTexts(host.resolverOptions);
  entry["settings"] = ofSettings(host.settings, hasSources);
  return entry;
}

}  // namespace

namespace {

Json ofReading(const BmcReading& bmc) {
  Json entry;
  entry["read_at"] = bmc.at;
  entry["age"] = bmc.age;
  entry["is_unknown"] = bmc.isUnknown;
  entry["problem"] = orNull(bmc.problem);
  return entry;
}

}  // namespace

std::string hostViewJson(const HostView& view) {
  Json json;
  json["system"] = asUtf8(view.systemName);
  json["interfaces"] =
      ofRows(view.interfaces, [&](const InterfaceRow& row) { return ofInterface(row, view.hasSources); });
  json["host"] = ofHost(view.host, view.hasSources);
  json["service_processor"] = view.bmc ? ofReading(*view.bmc) : Json(nullptr);
  return documentText(json);
}

namespace {

const char* outcomeWord(dns::Answer::Kind kind) noexcept {
  switch (kind) {
    case dns::Answer::Kind::Response:
      return "response";
    case dns::Answer::Kind::Malformed:
      return "malformed";
    case dns::Answer::Kind::Unreachable:
      return "unreachable";
    case dns::Answer::Kind::None:
      break;
  }
  return "no answer";
}

Json ofCheckedServer(const dns::CheckedServer& server) {
  const bool isResponse = server.answer.kind == dns::Answer::Kind::Response;
  Json entry;
  entry["server"] = asUtf8(server.server);
  entry["used_by"] = jsonOfTexts(server.usedBy);
  entry["never_asked_by"] = jsonOfTexts(server.neverAskedBy);
  entry["outcome"] = outcomeWord(server.answer.kind);
  entry["code"] = isResponse ? Json(dns::codeName(server.answer.response.code)) : Json(nullptr);
  entry["time_ms"] = isResponse ? Json(static_cast<double>(server.answer.time.count()) / 1000) : Json(nullptr);
  entry["problem"] = orNull(server.answer.problem);
  return entry;
}

}  // namespace

std::string checkJson(const dns::CheckResult& result) {
  Json json;
  std::vector<std::string> problems;
  json["question"] = Json{{"name", result.question.name}, {"type", dns::typeName(result.question.type)}};
  json["servers"] = ofRows(result.servers, ofCheckedServer);
  json["suffixes"] = ofRows(result.suffixes, [](const dns::CheckedSuffix& suffix) {
    Json entry;
    entry["suffix"] = asUtf8(suffix.suffix);
    entry["used_by"] = jsonOfTexts(suffix.usedBy);
    entry["resolves"] = suffix.resolves ? Json(*suffix.resolves) : Json(nullptr);
    return entry;
  });
  for (const dns::CheckProblem& problem : result.problems) problems.push_back(checkProblemText(problem));
  json["problems"] = jsonOfTexts(problems);
  return documentText(json);
}

std::string settingFileJson(const std::string& path, const std::vector<SettingLine>& lines) {
  Json json;
  json["file"] = asUtf8(path);
  json["lines"] = ofRows(lines, [](const SettingLine& line) {
    return Json{{"key", asUtf8(line.key)}, {"value", asUtf8(line.value)}};
  });
  return documentText(json);
}

std::string listedFilesJson(const std::vector<ListedFile>& files) {
  return documentText(ofRows(files, [](const ListedFile& file) {
    Json entry;
    entry["file"] = asUtf8(file.path);
    entry["interface"] = asUtf8(file.interface);
    entry["exists"] = !file.isOrphan;
    entry["keys"] = jsonOfTexts(file.keys);
    entry["problem"] = orNull(file.problem);
    return entry;
  }));
}

std::string overlayJson(const std::vector<OverlayRow>& rows) {
  return documentText(ofRows(rows, [](const OverlayRow& row) {
    Json entry;
    entry["node"] = asUtf8(row.path);
    entry["property"] = row.property;
    entry["value"] = row.isList ? jsonOfTexts(row.values) : Json(asUtf8(row.values.empty() ? "" : row.values.front()));
    return entry;
  }));
}

std::string countJson(const char* name, std::size_t count) { return documentText(Json{{name, count}}); }

std::string applyResultsJson(const std::vector<zorva::agent::ApplyResult>& results) {
  return documentText(ofRows(results, [](const zorva::agent::ApplyResult& result) {
    Json entry;
    entry["interface"] = asUtf8(result.interface);
    entry["owner"] = asUtf8(result.owner);
    entry["profile"] = asUtf8(result.profile);
    entry["changes"] = ofRows(result.changes, [](const zorva::agent::PropertyChange& change) {
      return Json{
          {"property", change.property}, {"before", jsonOfTexts(change.before)}, {"after", jsonOfTexts(change.after)}};
    });
    if (!result.problem.empty()) entry["problem"] = asUtf8(result.problem);
    if (!result.note.empty()) entry["note"] = asUtf8(result.note);
    return entry;
  }));
}

std::string graphJson(const Graph& graph) {
  Json json;
  json["objects"] = ofRows(graph.objects, [](const GraphObject& object) {
    Json entry;
    entry["path"] = asUtf8(broker::pathText(object.path));
    if (!object.problem.empty()) entry["problem"] = asUtf8(object.problem);
    return entry;
  });
  json["associations"] = ofRows(graph.associations, [](const GraphAssociation& each) {
    Json entry;
    entry["class"] = each.className;
    for (const GraphEnd* end : {&each.from, &each.to}) entry[end->role] = end->object;
    return entry;
  });
  return documentText(json);
}

std::string usersJson(const std::vector<const access::User*>& users) {
  return documentText(ofRows(users, [](const access::User* user) {
    Json entry;
    entry["name"] = user->name;
    entry["role"] = access::wordOf(user->grants.everywhere());
    entry["namespaces"] = Json::object();
    for (const auto& [name, role] : user->grants.byNameSpace()) entry["namespaces"][name] = access::wordOf(role);
    entry["has_password"] = user->hash != access::kNoPassword;
    entry["fingerprints"] = jsonOfTexts(user->fingerprints);
    entry["subject"] = orNull(user->subject);
    return entry;
  }));
}

std::string classRowsJson(const std::vector<ClassRow>& rows) { return documentText(ofClassRows(rows)); }

}  // namespace zorva::cli
