#include "agent/tree/TreeJson.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>
#include <thread>

#include "agent/Agent.h"
#include "agent/sources/FileSource.h"
#include "agent/testing/TemporaryDirectory.h"
#include "agent/testing/Trees.h"

namespace zorva::agent {
namespace {

using testing::TemporaryDirectory;
using namespace ZV::NodeLexicon;

constexpr const char* kExample = R"({
  "version": 1,
  "system_name": "host1",
  "nodes": [
    {
      "type": "System",
      "name": "system",
      "description": "Computer",
      "children": [
        {
          "type": "Port",
          "name": "eth0",
          "description": "",
          "children": [
            {
              "type": "NetworkIPConfig",
              "name": "ip",
              "description": "",
              "properties": {
                "name": "eth0",
                "host_name": "host1",
                "domain_name": "example.org",
                "dns_suffixes": [
                  "example.org"
                ],
                "dns_server_addresses": [
                  "192.0.2.53",
                  "2001:db8::53"
                ],
                "protocol_if_type": 4097,
                "enabled_state": 1,
                "addresses": [
                  {
                    "address": "192.0.2.10",
                    "prefix_length": 24,
                    "origin": "static"
                  }
                ]
              }
            }
          ]
        }
      ]
    }
  ]
}
)";

// The error of a document.
std::string wrong(const std::string& text) {
  try {
    testing::treeFromJson(text, "tree.json");
  } catch (const ConfigError& error) {
    EXPECT_EQ(std::string(error.what()).find('\n'), std::string::npos) << "an error is one line";
    return error.what();
  }
  return "nothing";
}

// A document of one node, which has these members besides type and name.
std::string nodeWith(const std::string& members) {
  return "{\"nodes\": [\n{\"type\": \"NetworkIPConfig\", \"name\": \"ip\",\n" + members + "}]}";
}

TEST(TreeJson, TheDocumentIsWrittenAsItWasRead) {
  EXPECT_EQ(treeToJson(*testing::treeFromJson(kExample, "tree.json")), kExample);
}

TEST(TreeJson, EveryPropertyIsRead) {
  const auto tree = testing::treeFromJson(kExample, "tree.json");
  EXPECT_EQ(tree->systemName(), "host1");
  const Node* node = tree->find("/system/eth0/ip");
  ASSERT_NE(node, nullptr);
  EXPECT_EQ(node->type(), NodeType::NetworkIPConfig);
  EXPECT_EQ(*node->text(PROP_NAME), "eth0");
  EXPECT_EQ(*node->text(PROP_HOST_NAME), "host1");
  EXPECT_EQ(*node->text(PROP_DOMAIN_NAME), "example.org");
  EXPECT_EQ(*node->list(PROP_DNS_SUFFIXES), (StringList{"example.org"}));
  EXPECT_EQ(*node->list(PROP_DNS_SERVER_ADDRESSES), (StringList{"192.0.2.53", "2001:db8::53"}));
  EXPECT_EQ(*node->number(PROP_PROTOCOL_IF_TYPE), 4097U);
  EXPECT_EQ(*node->number(PROP_ENABLED_STATE), 1U);
  EXPECT_EQ(node->addresses(), (AddressList{{"192.0.2.10", 24, AddressOrigin::Static}}));
}

TEST(TreeJson, APropertyThatIsLeftOutIsAbsentAndAnEmptyOneIsNot) {
  const auto tree = testing::treeFromJson(nodeWith(R"("properties": {"name": "", "dns_suffixes": []})"), "tree.json");
  const Node* node = tree->find("/ip");
  ASSERT_NE(node, nullptr);
  EXPECT_EQ(*node->text(PROP_NAME), "");
  EXPECT_TRUE(node->list(PROP_DNS_SUFFIXES)->empty());
  EXPECT_EQ(node->text(PROP_HOST_NAME), nullptr);
  EXPECT_EQ(node->list(PROP_DNS_SERVER_ADDRESSES), nullptr);
}

TEST(TreeJson, AnEmptyObjectIsATreeOfTheRootAlone) {
  const auto tree = testing::treeFromJson("{}", "tree.json");
  EXPECT_EQ(tree->nodes().size(), 1U);
  EXPECT_EQ(tree->systemName(), "");
}

TEST(TreeJson, EveryByteComesBackAsItWas) {
  for (int first = 1; first < 256; ++first) {
    if (first == '/') continue;
    const std::string name{static_cast<char>(first), 'x', '\xF0', '\x9F'};
    TreeBuilder builder(name);
    builder.add(0, NodeType::Port, name, name);
    const auto back = testing::treeFromJson(treeToJson(*builder.finish()), "tree.json");
    EXPECT_EQ(back->systemName(), name);
    ASSERT_EQ(back->nodes().size(), 2U);
    EXPECT_EQ(back->nodes()[1].name(), name);
    EXPECT_EQ(back->nodes()[1].description(), name);
  }
}

TEST(TreeJson, CharactersOfThePrivatePlaneThatMeanBytesAreReadBackToo) {
  const std::string name = "\xF4\x8E\xBB\xBF";  // U+10EEFF
  TreeBuilder builder(name);
  EXPECT_EQ(testing::treeFromJson(treeToJson(*builder.finish()), "tree.json")->systemName(), name);
}

TEST(TreeJson, NulInATextComesBack) {
  const std::string text("a\0b", 3);
  TreeBuilder builder(text);
  EXPECT_EQ(testing::treeFromJson(treeToJson(*builder.finish()), "tree.json")->systemName(), text);
}

TEST(TreeJson, WhatIsNoJsonIsNamedWithItsLine) {
  EXPECT_TRUE(wrong("").starts_with("tree.json:1: ")) << wrong("");
  EXPECT_TRUE(wrong("{\n\n,").starts_with("tree.json:3: ")) << wrong("{\n\n,");
  EXPECT_TRUE(wrong("{\"a\": \"\xFF\"}").starts_with("tree.json:1: ")) << wrong("{\"a\": \"\xFF\"}");
  EXPECT_TRUE(wrong("{} {}").starts_with("tree.json:1: "));
  EXPECT_TRUE(wrong("{\"system_name\": \"\\ud800\"}").starts_with("tree.json:1: "));
  EXPECT_TRUE(wrong(std::string("\0", 1)).starts_with("tree.json:1: "));
}

TEST(TreeJson, UnknownKeysAreNamed) {
  EXPECT_EQ(wrong("{\n\"nods\": []}"), "tree.json:2: nods: is not a known key; did you mean nodes?");
  EXPECT_EQ(wrong(nodeWith("\"childern\": []")),
            "tree.json:3: nodes[0].childern: is not a known key; did you mean children?");
  EXPECT_EQ(wrong(nodeWith("\"properties\": {\n\"nmae\": 1}")),
            "tree.json:4: nodes[0].properties.nmae: is not a known property; did you mean name?");
}

TEST(TreeJson, WrongTypesAreNamed) {
  EXPECT_EQ(wrong("[]"), "tree.json:1: expected an object");
  EXPECT_EQ(wrong("{\"nodes\": {}}"), "tree.json:1: nodes: expected a list");
  EXPECT_EQ(wrong("{\"nodes\": [1]}"), "tree.json:1: nodes[0]: expected an object");
  EXPECT_EQ(wrong("{\"system_name\": null}"), "tree.json:1: system_name: expected a text");
  for (const char* version : {"2", "\"1\"", "0", "null"}) {
    EXPECT_EQ(wrong(std::string("{\"version\": ") + version + "}"),
              "tree.json:1: version: expected 1, the one that is known here");
  }
  EXPECT_EQ(wrong(nodeWith("\"description\": 1")), "tree.json:3: nodes[0].description: expected a text");
  EXPECT_EQ(wrong(nodeWith("\"properties\": []")), "tree.json:3: nodes[0].properties: expected an object");
  EXPECT_EQ(wrong(nodeWith("\"properties\": {\"name\": 1\n}")),
            "tree.json:3: nodes[0].properties.name: expected a text");
  EXPECT_EQ(wrong(nodeWith("\"properties\": {\"dns_suffixes\": [\"a\",\nnull]}")),
            "tree.json:4: nodes[0].properties.dns_suffixes[1]: expected a text");
}

TEST(TreeJson, NumbersMustFit) {
  const std::string expected =
      "tree.json:3: nodes[0].properties.enabled_state: expected a whole number from 0 to 4294967295";
  for (const char* number : {"-1", "1.5", "4294967296", "1e99", "18446744073709551616", "true", "\"1\""}) {
    EXPECT_EQ(wrong(nodeWith(std::string("\"properties\": {\"enabled_state\": ") + number + "\n}")), expected);
  }
}

TEST(TreeJson, AMissingKeyIsNamed) {
  EXPECT_EQ(wrong("{\"nodes\": [\n{\"type\": \"Port\"}]}"), "tree.json:2: nodes[0].name: is missing");
  EXPECT_EQ(wrong("{\"nodes\": [\n{\"name\": \"x\"}]}"), "tree.json:2: nodes[0].type: is missing");
}

TEST(TreeJson, UnknownTypesAndNamesThatCannotBeInAPathAreNamed) {
  EXPECT_EQ(wrong(R"({"nodes": [{"type": "port", "name": "x"}]})"),
            "tree.json:1: nodes[0].type: expected \"System\", \"Port\" or \"NetworkIPConfig\"");
  EXPECT_EQ(wrong(R"({"nodes": [{"type": "Port", "name": "a/b"}]})"),
            "tree.json:1: nodes[0].name: a node's name must not be empty nor hold \"/\" or NUL");
  EXPECT_EQ(wrong("{\"nodes\": [{\"type\": \"Port\", \"name\": \"x\"},\n{\"type\": \"Port\", \"name\": \"x\"}]}"),
            "tree.json:2: nodes[1].name: is the name of a sibling too");
}

TEST(TreeJson, AKeyThatOccursTwiceIsNamed) {
  EXPECT_EQ(wrong("{\"nodes\": [],\n\"nodes\": []}"), "tree.json:1: nodes: is given twice in one object");
}

TEST(TreeJson, AddressesMustBeAddresses) {
  const auto wrongAddress = [](const std::string& address) {
    return wrong(nodeWith("\"properties\": {\"addresses\": [" + address + "]}"));
  };
  const std::string place = "tree.json:3: nodes[0].properties.addresses[0]";
  EXPECT_EQ(wrongAddress(R"({"address": "192.0.2.300", "prefix_length": 24})"),
            place + ".address: expected an IPv4 or IPv6 address");
  EXPECT_EQ(wrongAddress(R"({"address": "192.0.2.3", "prefix_length": 33})"),
            place + ".prefix_length: expected a whole number from 0 to 32");
  EXPECT_EQ(wrongAddress(R"({"address": "::1", "prefix_length": 129})"),
            place + ".prefix_length: expected a whole number from 0 to 128");
  EXPECT_EQ(wrongAddress(R"({"address": "::1"})"), place + ".prefix_length: is missing");
  EXPECT_EQ(wrongAddress(R"({"address": "::1", "prefix_length": 128, "origin": "DHCP"})"),
            place + ".origin: expected \"static\", \"dhcp\", \"slaac\", \"link-local\" or \"unknown\"");
}

TEST(TreeJson, DeepDocumentsAreRefused) {
  EXPECT_EQ(wrong(std::string(1000000, '[')), "tree.json:1: lists and objects are nested more than 32 deep");
  std::string deep;
  for (int i = 0; i < 100000; ++i) deep += "{\"nodes\":";
  EXPECT_EQ(wrong(deep), "tree.json:1: lists and objects are nested more than 32 deep");
}

TEST(TreeJson, ADocumentOfMillionsOfValuesIsRefused) {
  std::string many = "[0";
  for (int i = 0; i < 1000000; ++i) many += ",0";
  EXPECT_EQ(wrong(many + "]"), "tree.json:1: has more than 1000000 values");
}

TEST(TreeJson, KeysOfHostileTextStayOnTheirLine) {
  EXPECT_EQ(wrong(R"({"a\nb\u001b[2J": 1})"), "tree.json:1: a\\nb\\x1b[2J: is not a known key");
}

TEST(FileSource, ReadsTheTreeAgainWhenTheFileChanges) {
  const TemporaryDirectory directory;
  FileSource source(directory.write("tree.json", R"({"system_name": "first"})"));
  EXPECT_TRUE(source.changed());
  std::this_thread::sleep_for(std::chrono::milliseconds(20));  // after the tick in which the file was made
  EXPECT_EQ(source.read()->systemName(), "first");
  EXPECT_FALSE(source.changed());
  directory.write("tree.json", R"({"system_name": "second"})");
  EXPECT_TRUE(source.changed());
  EXPECT_EQ(source.read()->systemName(), "second");
}

TEST(FileSource, AFileThatIsNotThereOrNoFileIsNamed) {
  const TemporaryDirectory directory;
  const auto problem = [](const std::string& path) -> std::string {
    try {
      FileSource(path).read();
    } catch (const ConfigError& error) {
      return error.what();
    }
    return "nothing";
  };
  EXPECT_EQ(problem(directory / "absent.json"), directory / "absent.json: cannot be read: No such file or directory");
  EXPECT_EQ(problem("/dev/zero"), "/dev/zero: cannot be read: not a regular file");
}

TEST(FileSource, AFileThatComesLaterIsFound) {
  const TemporaryDirectory directory;
  FileSource source(directory / "tree.json");
  EXPECT_THROW(source.read(), ConfigError);
  directory.write("tree.json", R"({"system_name": "here"})");
  ASSERT_TRUE(source.changed());
  EXPECT_EQ(source.read()->systemName(), "here");
}

TEST(FileSource, ALargeFileIsRefused) {
  const TemporaryDirectory directory;
  const std::string path = directory.write("tree.json", "{}");
  ASSERT_EQ(::truncate(path.c_str(), (off_t{64} << 20) + 1), 0);
  EXPECT_THROW(FileSource(path).read(), ConfigError);
}

}  // namespace
}  // namespace zorva::agent
