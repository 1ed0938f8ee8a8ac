#include "platform/lumo.h"

#include <gtest/gtest.h>

namespace {

TEST(Dictionary, KeepsTheOrderInWhichKeysWereFirstSet) {
  lumo::dict dict;
  dict.set("b", "old");
  dict.set("a", true);
  dict.set("b", std::int64_t{7});
  ASSERT_EQ(dict.entries().size(), 2);
  EXPECT_EQ(dict.entries()[0].key, "b");
  EXPECT_EQ(*dict.entries()[0].value.as<std::int64_t>(), 7);
  EXPECT_EQ(dict.entries()[1].key, "a");
}

TEST(Dictionary, ReadsWhatIsMissingAsTheNullObject) {
  lumo::dict inner;
  inner.set("text", "t");
  lumo::dict outer;
  outer.set("inner", inner);
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
