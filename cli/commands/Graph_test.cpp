#include "cli/commands/Graph.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace zorva::cli {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

GraphObject object(const std::string& name, const std::string& problem = {}) {
  return {{"h", "root/cimv2", "C", {{"Name", broker::Value::text(name)}}}, problem};
}

/// a - b - c, c - a, and b to an object that does not exist.
Graph ring() {
  Graph graph;
  graph.objects = {object("a"), object("b"), object("c"), {{"h", "root/cimv2", "D", {}}, "it has no keys"}};
  graph.associations = {{"AB", {"From", 0}, {"To", 1}},
                        {"BC", {"From", 1}, {"To", 2}},
                        {"CA", {"From", 2}, {"To", 0}},
                        {"BD", {"From", 1}, {"To", 3}}};
  return graph;
}

TEST(GraphText, ShowsEachAssociationOnceUnderTheObjectThatIsNearest) {
  EXPECT_EQ(graphText(ring(), {}),
            "C.Name=\"a\"\n"
            "  AB -> To  C b\n"
            "    BC -> To  C c (below)\n"
            "    BD -> To  D (cannot be fetched)\n"
            "  CA -> From  C c\n"
            "\n"
            "4 objects, 4 associations\n"
            "\n"
            "References whose far end cannot be fetched:\n"
            "  BD.To = D: it has no keys (beside C b)\n");
}

TEST(GraphText, ShowsAnObjectThatNothingLeadsTo) {
  Graph graph;
  graph.objects = {object("a"), object("b")};
  EXPECT_EQ(graphText(graph, {}),
            "C.Name=\"a\"\nC.Name=\"b\"\n\n2 objects, 0 associations\nEvery reference leads to an object.\n");
}

TEST(GraphText, EndsWhereAnObjectIsAssociatedWithItself) {
  Graph graph;
  graph.objects = {object("a")};
  graph.associations = {{"A", {"From", 0}, {"To", 0}}};
  EXPECT_THAT(graphText(graph, {}), HasSubstr("  A -> To  C a (above)\n"));
}

TEST(GraphText, TakesAChainOfAHundredThousandObjects) {
  Graph graph;
  for (std::size_t i = 0; i < 100000; ++i) {
    graph.objects.push_back(object(std::to_string(i)));
    if (i > 0) graph.associations.push_back({"A", {"From", i - 1}, {"To", i}});
  }
  EXPECT_THAT(graphText(graph, {}), HasSubstr("C 99999\n"));
}

TEST(GraphText, EscapesNames) {
  Graph graph;
  graph.objects = {object("a\x1B[0m")};
  EXPECT_EQ(graphText(graph, {}).find('\x1B'), std::string::npos);
}

TEST(DanglingReferences, NameTheAssociationTheRoleAndTheReason) {
  EXPECT_THAT(danglingReferences(ring()), ElementsAre("BD.To = D: it has no keys (beside C b)"));
}

TEST(GraphDot, EscapesLabels) {
  Graph graph;
  graph.objects = {object("a\"]; evil \\ \n")};
  EXPECT_THAT(graphDot(graph), HasSubstr(R"(o0 [label="C a\"]; evil \\ \\n"];)"));
}

TEST(GraphDot, HasAnEdgeForEachAssociation) {
  const std::string dot = graphDot(ring());
  EXPECT_THAT(dot, HasSubstr(R"(o0 -> o1 [label="AB", taillabel="From", headlabel="To"];)"));
  EXPECT_THAT(dot, HasSubstr(R"(o3 [label="D", style=dashed, tooltip="it has no keys"];)"));
}

TEST(ObjectLabel, IsTheClassAndTheKeyThatIdentifiesInstances) {
  EXPECT_EQ(objectLabel({"", "", "C", {{"SystemName", broker::Value::text("h")}, {"Name", broker::Value::text("n")}}}),
            "C n");
  EXPECT_EQ(objectLabel({"", "", "C", {{"InstanceID", broker::Value::text("i")}}}), "C i");
  EXPECT_EQ(objectLabel({"", "", "C", {{"K", broker::Value::text("v")}}}), R"(C.K="v")");
}

}  // namespace
}  // namespace zorva::cli
