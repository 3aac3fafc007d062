// A property-list value: a string (UTF-8), integer, real, boolean, date, data, array or
// dictionary, as held in preference files, Info.plist files and strings tables.
//
//   plist::Value v = plist::Dictionary{{"Name", "Sorvendi"}, {"Count", 3}};
//   if (const std::int64_t* count = v.Find("Count") ? v.Find("Count")->AsInteger() : nullptr) ...
//
// A Value is a plain copyable value type (copies are deep). Typed accessors return nullptr when
// the value holds another type, so a wrong-typed value reads as absent; the pointers they return
// are owned by the Value and stay valid until it is modified or destroyed.
//
// Thread-safety: as for std::map / std::vector: concurrent const access is safe, any mutation
// needs exclusive access.
#pragma once

#include <compare>
#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace lumeris::plist {

// A point in time, as seconds since 2001-01-01 00:00:00 UTC (the property-list epoch).
struct Date {
  double seconds_since_2001 = 0;
  friend bool operator==(const Date&, const Date&) = default;
};

using Data = std::vector<std::uint8_t>;
class Value;
using Array = std::vector<Value>;
using Dictionary = std::map<std::string, Value, std::less<>>;  // keys are UTF-8

class Value {
 public:
  enum class Type { kString, kInteger, kReal, kBool, kDate, kData, kArray, kDictionary };

  Value();  // an empty string
  Value(std::string value);
  Value(const char* value);
  Value(std::int64_t value);
  Value(int value);
  Value(double value);
  Value(bool value);
  Value(Date value);
  Value(Data value);
  Value(Array value);
  Value(Dictionary value);

  Type type() const;

  // Typed access: nullptr when the value is of another type.
  const std::string* AsString() const;
  std::string* AsString();
  const std::int64_t* AsInteger() const;
  const double* AsReal() const;
  const bool* AsBool() const;
  const Date* AsDate() const;
  const Data* AsData() const;
  const Array* AsArray() const;
  Array* AsArray();
  const Dictionary* AsDictionary() const;
  Dictionary* AsDictionary();

  // Dictionary member; nullptr when this is not a dictionary or has no such key.
  const Value* Find(std::string_view key) const;

  // Deep equality: same type and equal contents (an integer never equals a real).
  friend bool operator==(const Value& a, const Value& b);

 private:
  std::variant<std::string, std::int64_t, double, bool, Date, Data, Array, Dictionary> value_;
};

}  // namespace lumeris::plist
