#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

/// The values of requests and replies.
namespace lumo {

class object;

/// A key and its value.
using entry = std::pair<std::string, object>;

/// Maps texts to values, in the order in which the keys were first set. A reference to a value is
/// valid until the dictionary is changed or destroyed.
class dict {
 public:
  dict() = default;

  /// Has `entries`, of which no two have the same key.
  dict(std::initializer_list<entry> entries);

  /// Sets the value of `key`. A key that is set again keeps its place.
  void set(std::string_view key, object value);

  /// The value of `key`, or the null object when there is none.
  const object& get(std::string_view key) const;

  const std::vector<entry>& entries() const { return items; }

 private:
  std::vector<entry> items;
};

/// Nothing (null), or a text, a boolean, a 64-bit integer or a dictionary.
class object {
 public:
  object() = default;
  object(const char* text) : value(std::string(text)) {}
  object(std::string text) : value(std::move(text)) {}
  object(bool flag) : value(flag) {}
  object(std::int64_t number) : value(number) {}
  object(dict entries) : value(std::move(entries)) {}

  bool isDict() const { return as<dict>() != nullptr; }

  /// The value of `key` when this is a dictionary that has it, else the null object.
  const object& get(std::string_view key) const;

  /// The value as a `Type` (`std::string`, `bool`, `std::int64_t` or `dict`), owned by this
  /// object; null when it is of another type.
  template <class Type>
  const Type* as() const {
    return std::get_if<Type>(&value);
  }

 private:
  std::variant<std::monostate, std::string, bool, std::int64_t, dict> value;
};

/// The text that `value` holds, or `otherwise` when it holds no text.
std::string dyn_cast_or_default(const object& value, std::string_view otherwise);

}  // namespace lumo
