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
  const lumo::object text("t");
  EXPECT_EQ(*object.get("inner").get("text").as<std::string>(), "t");
  for (const auto* const missing : {&outer.get("no"), &object.get("no"), &text.get("no"),
                                    &object.get("inner").get("text").get("no")}) {
    EXPECT_FALSE(missing->isDict() || missing->as<std::string>() || missing->as<bool>() ||
                 missing->as<std::int64_t>());
    EXPECT_EQ(lumo::dyn_cast_or_default(*missing, "other"), "other");
  }
  EXPECT_EQ(lumo::dyn_cast_or_default(lumo::object(true), "other"), "other");
  EXPECT_EQ(lumo::dyn_cast_or_default(inner.get("text"), "other"), "t");
}

}  // namespace
