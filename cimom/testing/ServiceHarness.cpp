#include "cimom/testing/ServiceHarness.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>

#include "broker/testing/TestClasses.h"
#include "cimxml/ElementWriter.h"
#include "cimxml/XmlText.h"
#include "cimxml/testing/Grammar.h"
#include "util/Names.h"

namespace zorva::cimom::testing {

void CollectingSink::begin(int code, const http::HeaderList& fields) {
  EXPECT_EQ(status, 0) << "begun twice";
  status = code;
  headers = fields;
}

void CollectingSink::write(std::string_view text) {
  EXPECT_TRUE(begun());
  EXPECT_FALSE(failure.has_value());
  if (goneAfter != 0 && pieces == goneAfter) throw http::ClientGone("gone");
  body += text;
  ++pieces;
  largestPiece = std::max(largestPiece, text.size());
}

void CollectingSink::fail(std::uint32_t cimStatus, std::string_view description) {
  EXPECT_TRUE(begun());
  failure = {cimStatus, std::string(description)};
}

std::string CollectingSink::header(std::string_view name) const {
  for (const auto& [known, value] : headers) {
    if (util::sameName(known, name)) return value;
  }
  return {};
}

std::string parameter(const std::string& name, const std::string& value) {
  return "<IPARAMVALUE NAME=\"" + name + "\">" + value + "</IPARAMVALUE>";
}

std::string text(const std::string& name, const std::string& value) {
  std::string escaped;
  cimxml::appendEscaped(escaped, value);
  return parameter(name, "<VALUE>" + escaped + "</VALUE>");
}

std::string className(const std::string& name, const std::string& value) {
  return parameter(name, "<CLASSNAME NAME=\"" + value + "\"/>");
}

std::string instanceName(const std::string& className, const std::vector<std::pair<std::string, std::string>>& keys) {
  std::string name = "<INSTANCENAME CLASSNAME=\"" + className + "\">";
  for (const auto& [key, value] : keys) {
    name += "<KEYBINDING NAME=\"" + key + "\"><KEYVALUE>" + value + "</KEYVALUE></KEYBINDING>";
  }
  return name + "</INSTANCENAME>";
}

std::string names(const std::string& name, const std::vector<std::string>& values) {
  std::string list;
  for (const std::string& value : values) list += "<VALUE>" + value + "</VALUE>";
  return parameter(name, "<VALUE.ARRAY>" + list + "</VALUE.ARRAY>");
}

std::string localNamespace(const std::string& nameSpace) {
  std::string path;
  cimxml::appendLocalNamespacePath(path, nameSpace);
  return path;
}

std::string intrinsic(const std::string& operation, const std::string& parameters, const std::string& nameSpace) {
  return "<SIMPLEREQ><IMETHODCALL NAME=\"" + operation + "\">" + localNamespace(nameSpace) + parameters +
         "</IMETHODCALL></SIMPLEREQ>";
}

std::string extrinsic(const std::string& method, const std::string& instance, const std::string& parameters,
                      const std::string& nameSpace) {
  return "<SIMPLEREQ><METHODCALL NAME=\"" + method + "\"><LOCALINSTANCEPATH>" + localNamespace(nameSpace) + instance +
         "</LOCALINSTANCEPATH>" + parameters + "</METHODCALL></SIMPLEREQ>";
}

std::string message(const std::string& content) {
  return R"(<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="42" )"
         R"(PROTOCOLVERSION="1.0">)" +
         content + "</MESSAGE></CIM>";
}

http::HttpRequest post(const std::string& body, http::HeaderList headers) {
  return {"POST", "/cimom", std::move(headers), body, false, "user 7", "192.0.2.1:4711"};
}

http::HttpRequest request(const std::string& operation, const std::string& parameters, const std::string& nameSpace) {
  return post(message(intrinsic(operation, parameters, nameSpace)), {{"Host", "this.example.org:5988"},
                                                                     {"CIMOperation", "MethodCall"},
                                                                     {"CIMMethod", operation},
                                                                     {"CIMObject", nameSpace}});
}

TestService::TestService(ServiceOptions options) {
  broker::BrokerOptions made;
  made.registry = broker::ProviderRegistry();
  const char* library = "zorvabrokertestprovider";
  using broker::AssociationMi;
  using broker::InstanceMi;
  made.registry.add({"T_Thing", "Thing", library, InstanceMi | broker::MethodMi});
  made.registry.add({"T_SpecialThing", "Thing", library, InstanceMi});
  made.registry.add({"T_Other", "Other", library, InstanceMi});
  made.registry.add({"T_Trouble", "Trouble", library, InstanceMi});
  made.registry.add({"T_Absent", "Absent", "no-such-library", InstanceMi});
  made.registry.add({"T_ThingOther", "Link", library, InstanceMi | AssociationMi});
  made.registry.addNameSpace("root/other");
  made.providerDirectory = ZORVA_LIB_DIR;
  made.log = log();
  broker_.emplace(broker::testing::testClasses(), std::move(made));
  options.hostName = "this";
  options.log = log();
  options.audit = [this](const access::AuditRecord& record) {
    const std::lock_guard lock(mutex_);
    changes_.push_back(access::auditLine(record));
  };
  service_.emplace(*broker_, std::move(options));
}

broker::LogHook TestService::log() {
  return [this](broker::LogLevel, std::string_view line) {
    const std::lock_guard lock(mutex_);
    lines_.emplace_back(line);
  };
}

CollectingSink TestService::ask(const http::HttpRequest& asked) {
  CollectingSink sink;
  service_->handle(asked, sink);
  if (sink.status == 200 && !sink.failure) {
    EXPECT_EQ(cimxml::testing::grammarProblem(sink.body), "") << sink.body;
  }
  return sink;
}

std::string TestService::ask(const std::string& operation, const std::string& parameters,
                             const std::string& nameSpace) {
  const CollectingSink sink = ask(request(operation, parameters, nameSpace));
  EXPECT_EQ(sink.status, 200) << sink.body;
  EXPECT_EQ(sink.header("CIMOperation"), "MethodResponse");
  return sink.body;
}

std::vector<std::string> TestService::changes() {
  const std::lock_guard lock(mutex_);
  return changes_;
}

std::vector<std::string> TestService::lines() {
  const std::lock_guard lock(mutex_);
  return lines_;
}

}  // namespace zorva::cimom::testing
