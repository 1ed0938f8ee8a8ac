#include "platform/lumo.h"

#include <algorithm>

namespace lumo {
namespace {

const object& nullObject() {
  static const auto* const null = new object;  // never destroyed: other threads outlive exit
  return *null;
}

}  // namespace

dict::dict(std::initializer_list<entry> entries) : items(entries) {}

void dict::set(std::string_view key, object value) {
  const auto found = std::ranges::find(items, key, &entry::first);
  if (found != items.end()) {
    found->second = std::move(value);
  } else {
    items.emplace_back(key, std::move(value));
  }
}

const object& dict::get(std::string_view key) const {
  const auto found = std::ranges::find(items, key, &entry::first);
  return found != items.end() ? found->second : nullObject();
}

const object& object::get(std::string_view key) const {
  const auto* const entries = as<dict>();
  return entries ? entries->get(key) : nullObject();
}

std::string dyn_cast_or_default(const object& value, std::string_view otherwise) {
  const auto* const text = value.as<std::string>();
  return text ? *text : std::string(otherwise);
}

}  // namespace lumo
