#include "frontend/ReadBack.h"

#include <gtest/gtest.h>

namespace zorva::frontend {
namespace {

TEST(ReadBack, NamesEachChangeThatDidNotStick) {
  broker::Instance now;
  now.properties.push_back({"A", broker::Value::text("old")});
  now.properties.push_back({"B", broker::Value::textArray({"x", "y"})});
  const auto reason = [](const broker::Instance&, const broker::Property& change) { return "no " + change.name; };
  const broker::Status status = checkChanges(now,
                                             {{"A", broker::Value::text("new")},
                                              {"b", broker::Value::textArray({"x", "", "y"})},
                                              {"C", broker::Value::text("c")},
                                              {"D", broker::Value::text("")}},
                                             reason);
  EXPECT_EQ(status.rc, 1);
  EXPECT_EQ(status.message, "A was not stored: no A; C was not stored: no C");
  EXPECT_TRUE(checkChanges(now, {{"A", broker::Value::text("old")}}, reason).ok());
}

}  // namespace
}  // namespace zorva::frontend
