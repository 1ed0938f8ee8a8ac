#include "platform/lumo.h"

#include <gtest/gtest.h>

namespace {

TEST(Dictionary, KeepsTheOrderOfItsKeysAndReadsWhatIsMissingAsTheNullObject) {
  lumo::dict inner;
  inner.set("text", "t");
  lumo::dict outer;
  outer.set("inner", "old");
  outer.set("a", true);
  outer.set("inner", inner);
  ASSERT_EQ(outer.entries().size(), 2);
  EXPECT_EQ(outer.entries()[0].key, "inner");
  const lumo::object object(outer);
  EXPECT_EQ(lumo::dyn_cast_or_default(object.get("inner").get("text"), "other"), "t");
  for (const auto* const none : {&object.get("no"), &object.get("inner").get("text").get("no")}) {
    EXPECT_FALSE(none->isDict() || none->as<std::string>() || none->as<bool>() ||
                 none->as<std::int64_t>());
    EXPECT_EQ(lumo::dyn_cast_or_default(*none, "other"), "other");
  }
}

}  // namespace
