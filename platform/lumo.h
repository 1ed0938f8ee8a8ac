#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

/// The values that requests and replies are made of. Plain data, without errors.
namespace lumo {

class object;
struct entry;

/// Text keys with their values, in the order in which the keys were first set. It owns the values:
/// a reference to one is valid until the dictionary is changed or goes away.
class dict {
 public:
  dict();
  dict(const dict&);
  dict(dict&&) noexcept;
  dict& operator=(const dict&);
  dict& operator=(dict&&) noexcept;
  ~dict();

  /// Sets the value under `key`; a value that stood there is replaced and keeps its place.
  void set(std::string_view key, object value);

  /// The value under `key`, or the null object when there is none.
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

  /// The value under `key` when this is a dictionary that has it, else the null object.
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

struct entry {
  std::string key;
  object value;
};

/// The text that `value` holds, or `otherwise` when it holds no text.
std::string dyn_cast_or_default(const object& value, std::string_view otherwise);

}  // namespace lumo
