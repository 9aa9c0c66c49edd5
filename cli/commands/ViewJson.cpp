#include "cli/commands/ViewJson.h"

#include <nlohmann/json.hpp>

#include "broker/objects/PathText.h"
#include "cli/output/Text.h"

namespace zorva::cli {

namespace {

using Json = nlohmann::ordered_json;

std::string dumped(const Json& json) { return json.dump(2); }

Json ofTexts(const std::vector<std::string>& texts) {
  Json list = Json::array();
  for (const std::string& text : texts) list.push_back(asUtf8(text));
  return list;
}

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

Json ofEndpoint(const EndpointRow& row) {
  Json entry;
  entry["name"] = asUtf8(row.name);
  entry["system"] = asUtf8(row.system);
  entry["state"] = row.stateNumber ? Json(*row.stateNumber) : Json(nullptr);
  entry["host_name"] = asUtf8(row.hostName);
  entry["domain_name"] = asUtf8(row.domainName);
  entry["suffixes"] = ofTexts(row.suffixes);
  return entry;
}

Json ofSetting(const SettingRow& row, bool hasSources) {
  Json entry;
  entry["interface"] = asUtf8(row.interface);
  entry["setting"] = row.setting;
  entry["value"] = row.isList ? ofTexts(row.values) : Json(asUtf8(row.values.empty() ? "" : row.values.front()));
  if (hasSources) entry["from"] = row.source == SettingSource::None ? Json(nullptr) : Json(sourceName(row.source));
  return entry;
}

template <typename Row, typename Convert>
Json ofRows(const std::vector<Row>& rows, Convert convert) {
  Json list = Json::array();
  for (const Row& row : rows) list.push_back(convert(row));
  return list;
}

}  // namespace

std::string hostViewJson(const HostView& view) {
  Json json;
  json["system"] = asUtf8(view.systemName);
  json["endpoints"] = ofRows(view.endpoints, ofEndpoint);
  json["servers"] = ofRows(view.servers, [](const ServerRow& row) {
    return Json{{"order", row.order}, {"address", asUtf8(row.address)}};
  });
  const auto setting = [&view](const SettingRow& row) { return ofSetting(row, view.hasSources); };
  json["interface_settings"] = ofRows(view.interfaceSettings, setting);
  json["host_settings"] = ofRows(view.hostSettings, setting);
  json["classes"] = ofClassRows(view.classes);
  return dumped(json);
}

std::string settingFileJson(const std::string& path, const std::vector<SettingLine>& lines) {
  Json json;
  json["file"] = asUtf8(path);
  json["lines"] = ofRows(lines, [](const SettingLine& line) {
    return Json{{"key", asUtf8(line.key)}, {"value", asUtf8(line.value)}};
  });
  return dumped(json);
}

std::string overlayJson(const std::vector<OverlayRow>& rows) {
  return dumped(ofRows(rows, [](const OverlayRow& row) {
    Json entry;
    entry["node"] = asUtf8(row.path);
    entry["property"] = row.property;
    entry["value"] = row.isList ? ofTexts(row.values) : Json(asUtf8(row.values.empty() ? "" : row.values.front()));
    return entry;
  }));
}

std::string applyResultsJson(const std::vector<zorva::agent::ApplyResult>& results) {
  return dumped(ofRows(results, [](const zorva::agent::ApplyResult& result) {
    Json entry;
    entry["interface"] = asUtf8(result.interface);
    entry["owner"] = asUtf8(result.owner);
    entry["profile"] = asUtf8(result.profile);
    entry["changes"] = ofRows(result.changes, [](const zorva::agent::PropertyChange& change) {
      return Json{{"property", change.property}, {"before", ofTexts(change.before)}, {"after", ofTexts(change.after)}};
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
  return dumped(json);
}

std::string classRowsJson(const std::vector<ClassRow>& rows) { return dumped(ofClassRows(rows)); }

}  // namespace zorva::cli
