#include "cimom/ServiceHeaders.h"

#include <algorithm>

#include "broker/objects/PathText.h"
#include "cimxml/HeaderFields.h"
#include "schema/Schema.h"
#include "util/Names.h"
#include "util/Text.h"

namespace zorva::cimom {

namespace {

using util::sameName;

constexpr std::string_view kMapping = "http://www.dmtf.org/cim/mapping/http/v1.0";

const std::string* find(const http::HttpRequest& request, std::string_view name) noexcept {
  for (const auto& [known, value] : request.headers) {
    if (sameName(known, name)) return &value;
  }
  return nullptr;
}

std::string textOf(const http::HttpRequest& request, std::string_view name) {
  const std::string* value = find(request, name);
  return value != nullptr ? std::string(util::trimmed(*value)) : std::string();
}

auto refusal(int status, std::string cimError, std::string message) {
  return unexpected(HttpRefusal{status, std::move(cimError), std::move(message)});
}

auto mismatch(std::string message) { return refusal(400, "header-mismatch", std::move(message)); }

/// The number that `Man: http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=73` declares; nothing if it declares none.
std::optional<std::string> declaredPrefix(const http::HttpRequest& request) {
  const std::string man = textOf(request, "Man");
  const std::size_t mapping = man.find(kMapping);
  if (mapping == std::string::npos) return std::nullopt;
  std::string_view rest = std::string_view(man).substr(mapping + kMapping.size());
  if (rest.starts_with('"')) rest.remove_prefix(1);
  const std::size_t equals = rest.find("ns");
  if (util::trimmed(rest.substr(0, equals)) != ";") return std::nullopt;
  rest = util::trimmed(rest.substr(equals + 2));
  if (!rest.starts_with('=')) return std::nullopt;
  rest = util::trimmed(rest.substr(1));
  const std::string_view digits = rest.substr(0, rest.find_first_not_of("0123456789"));
  if (digits.empty() || digits.size() > 8) return std::nullopt;
  return std::string(digits);
}

/// One of CIM's own fields: at most once, percent-encoded or not.
Expected<std::optional<std::string>, HttpRefusal> take(const http::HttpRequest& request, const CimHeaders& headers,
                                                       std::string_view name) {
  std::optional<std::string> value;
  const std::string prefixed = headers.prefix.empty() ? std::string() : headers.prefix + "-" + std::string(name);
  for (const auto& [known, text] : request.headers) {
    if (!sameName(known, name) && (prefixed.empty() || !sameName(known, prefixed))) continue;
    if (value) return mismatch("the header " + std::string(name) + " is given twice");
    value = cimxml::strictFieldText(util::trimmed(text));
    if (!value) return mismatch("the header " + std::string(name) + " is not UTF-8 in percent-encoding");
  }
  return value;
}

Expected<void, HttpRefusal> checkVersion(const std::optional<std::string>& version) {
  if (!version || version->starts_with("1.")) return {};
  return refusal(501, "unsupported-protocol-version", "the header CIMProtocolVersion must be 1.x");
}

/// Whether header and body have the same key values, as far as the schema can say.
bool sameKeys(const broker::Broker& broker, const broker::ObjectPath& a, const broker::ObjectPath& b) {
  const auto one = broker.canonicalPath(a);
  const auto other = broker.canonicalPath(b);
  // The operation itself reports best what is wrong with a path.
  if (!one || !other) return true;
  if (one->keys.size() != other->keys.size()) return false;
  for (std::size_t i = 0; i < one->keys.size(); ++i) {
    if (one->keys[i].name != other->keys[i].name) return false;
    const bool isReference = one->keys[i].value.type == schema::Type::Reference;
    if (!isReference && one->keys[i].value != other->keys[i].value) return false;
  }
  return true;
}

Expected<void, HttpRefusal> checkObject(const std::string& object, const cimxml::Call& call,
                                        const broker::Broker& broker) {
  if (!call.isExtrinsic) {
    if (schema::sameNamespace(object, call.target.nameSpace)) return {};
    return mismatch("the header CIMObject is " + broker::quotedText(object.substr(0, 200)) +
                    ", but the body has the namespace " + broker::quotedText(call.target.nameSpace.substr(0, 200)));
  }
  const auto path = broker::parsePathText(object);
  if (!path) {
    return mismatch("the header CIMObject is no object path: at byte " + std::to_string(path.error().position) + ", " +
                    path.error().message);
  }
  const bool isSame = schema::sameNamespace(path->nameSpace, call.target.nameSpace) &&
                      sameName(path->className, call.target.className) &&
                      (call.onClass || sameKeys(broker, *path, call.target));
  if (isSame) return {};
  return mismatch("the header CIMObject names another object than the body: " +
                  broker::quotedText(object.substr(0, 200)));
}

}  // namespace

Expected<CimHeaders, HttpRefusal> readHeaders(const http::HttpRequest& request) {
  CimHeaders headers;
  headers.isExtended = sameName(request.method, "M-POST");
  std::optional<std::string> prefix = declaredPrefix(request);
  if (headers.isExtended && !prefix) {
    return refusal(510, "", "M-POST needs the header Man: " + std::string(kMapping) + " ; ns=NN");
  }
  headers.prefix = std::move(prefix).value_or("");
  headers.host = textOf(request, "Host");
  headers.acceptLanguage = textOf(request, "Accept-Language");
  headers.contentLanguage = textOf(request, "Content-Language");
  std::optional<std::string> operation;
  std::optional<std::string> batch;
  std::optional<std::string> version;
  const std::pair<const char*, std::optional<std::string>*> fields[] = {{"CIMOperation", &operation},
                                                                        {"CIMBatch", &batch},
                                                                        {"CIMProtocolVersion", &version},
                                                                        {"CIMMethod", &headers.method},
                                                                        {"CIMObject", &headers.object}};
  for (const auto& [name, value] : fields) {
    auto taken = take(request, headers, name);
    if (!taken) return unexpected(std::move(taken.error()));
    *value = std::move(*taken);
  }
  if (auto checked = checkVersion(version); !checked) return unexpected(std::move(checked.error()));
  headers.isBatch = batch.has_value();
  if (!operation && find(request, "CIMExport") != nullptr) {
    return refusal(501, "unsupported-operation", "indications are not taken here");
  }
  if (!operation) return mismatch("the header CIMOperation is missing: this is no CIM request");
  if (!sameName(*operation, "MethodCall")) return mismatch("the header CIMOperation must be MethodCall");
  return headers;
}

Expected<void, HttpRefusal> checkHeaders(const CimHeaders& headers, const cimxml::CimRequest& request,
                                         const broker::Broker& broker) {
  if (request.isMultiple) {
    if (!headers.method && !headers.object) return {};
    return mismatch("the headers CIMMethod and CIMObject go with a single request, but the body is a MULTIREQ");
  }
  if (headers.isBatch) return mismatch("the header CIMBatch needs a MULTIREQ, but the body is a SIMPLEREQ");
  const cimxml::Call& call = request.calls.front();
  if (!headers.method) return mismatch("the header CIMMethod is missing");
  if (!headers.object) return mismatch("the header CIMObject is missing");
  if (!sameName(*headers.method, call.name)) {
    return mismatch("the header CIMMethod is " + broker::quotedText(headers.method->substr(0, 200)) +
                    ", but the body has " + broker::quotedText(call.name.substr(0, 200)));
  }
  return checkObject(*headers.object, call, broker);
}

http::HeaderList responseHeaders(const CimHeaders& headers) {
  http::HeaderList fields{{"Content-Type", "application/xml; charset=\"utf-8\""}};
  if (!headers.isExtended) {
    fields.emplace_back("CIMOperation", "MethodResponse");
    return fields;
  }
  fields.emplace_back("Ext", "");
  fields.emplace_back("Cache-Control", "no-cache");
  fields.emplace_back("Man", std::string(kMapping) + " ; ns=" + headers.prefix);
  fields.emplace_back(headers.prefix + "-CIMOperation", "MethodResponse");
  return fields;
}

}  // namespace zorva::cimom
