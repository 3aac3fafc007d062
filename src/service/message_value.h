// MessageValue: one value of a service message, the request and reply dictionaries and
// everything inside them. It holds exactly the kinds the wire carries: dictionary, array,
// string, uint64, int64, double, bool, data and null.
//
//   MessageValue request = MessageValue::MakeDictionary();
//   request.Set("command", MessageValue::String("search_matched_chars"));
//   request.Set("limit", MessageValue::Uint64(20));
//   const std::string* command = request.GetString("command");   // nullptr when absent
//   uint64_t limit = request.GetUint64("limit");                   // 0 when absent or not uint64
//
// Strings are byte strings: whatever bytes the sender put in a MessagePack str are kept,
// invalid UTF-8 included; they fail only where a caller decodes them as text.
//
// A wrong-typed value reads as absent: GetString() on a key that holds a uint64 returns nullptr,
// GetUint64() on a key that holds a string returns 0. Nothing here throws on bad input.
//
// Thread-safety: a value is a plain regular type (copyable, movable, comparable); concurrent
// reads are safe, a write needs exclusive access.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <ostream>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace lumeris {

class MessageValue {
 public:
  enum class Kind { kNull, kBool, kUint64, kInt64, kDouble, kString, kData, kArray, kDictionary };

  using Bytes = std::vector<std::uint8_t>;
  using Array = std::vector<MessageValue>;
  // Keys are compared as bytes; lookups by std::string_view need no copy.
  using Dictionary = std::map<std::string, MessageValue, std::less<>>;

  // A null value.
  MessageValue() = default;

  static MessageValue Null() { return MessageValue(); }
  static MessageValue Bool(bool value);
  static MessageValue Uint64(std::uint64_t value);
  // A negative integer. A non-negative int64 travels as a uint64 on the wire.
  static MessageValue Int64(std::int64_t value);
  static MessageValue Double(double value);
  static MessageValue String(std::string value);
  static MessageValue Data(Bytes value);
  // Data holding the given bytes (for JSON payloads kept in a std::string).
  static MessageValue DataFromBytes(std::string_view bytes);
  static MessageValue MakeArray(Array elements = {});
  static MessageValue MakeDictionary(Dictionary entries = {});

  Kind kind() const { return static_cast<Kind>(value_.index()); }
  bool is_null() const { return kind() == Kind::kNull; }
  bool is_array() const { return kind() == Kind::kArray; }
  bool is_dictionary() const { return kind() == Kind::kDictionary; }

  // Typed views. Each returns nullptr when the value is of another kind; the pointer stays valid
  // until this value is changed or destroyed.
  const bool* AsBool() const { return std::get_if<bool>(&value_); }
  const std::uint64_t* AsUint64() const { return std::get_if<std::uint64_t>(&value_); }
  const std::int64_t* AsInt64() const { return std::get_if<std::int64_t>(&value_); }
  const double* AsDouble() const { return std::get_if<double>(&value_); }
  const std::string* AsString() const { return std::get_if<std::string>(&value_); }
  const Bytes* AsData() const { return std::get_if<Bytes>(&value_); }
  const Array* AsArray() const { return std::get_if<Array>(&value_); }
  Array* AsArray() { return std::get_if<Array>(&value_); }
  const Dictionary* AsDictionary() const { return std::get_if<Dictionary>(&value_); }
  Dictionary* AsDictionary() { return std::get_if<Dictionary>(&value_); }

  // Dictionary access. On a value that is not a dictionary every getter reads as absent.
  // The value under `key`, or nullptr.
  const MessageValue* Find(std::string_view key) const;
  // The string under `key`, or nullptr when missing or not a string.
  const std::string* GetString(std::string_view key) const;
  // The uint64 under `key`; 0 when missing or not a uint64 (a negative integer is an int64).
  std::uint64_t GetUint64(std::string_view key) const;
  // The data under `key`, or nullptr when missing or not data.
  const Bytes* GetData(std::string_view key) const;

  // Puts `value` under `key`, replacing an earlier value.
  // REQUIRES: is_dictionary(); on any other kind nothing happens.
  void Set(std::string key, MessageValue value);
  // Appends to an array. REQUIRES: is_array(); on any other kind nothing happens.
  void Append(MessageValue value);

  friend bool operator==(const MessageValue& a, const MessageValue& b);

  // A short one-line description for logs and test failures, JSON-like: strings quoted with
  // non-printable bytes escaped, data as <hex>, uint64 plain, int64 with a sign, null as null.
  std::string Describe() const;

 private:
  // The order of the alternatives matches Kind.
  using Storage = std::variant<std::monostate, bool, std::uint64_t, std::int64_t, double,
                               std::string, Bytes, Array, Dictionary>;
  template <typename T, typename Arg>
  static MessageValue Make(Arg&& arg);

  Storage value_;
};

// Lets GoogleTest and logs print values.
std::ostream& operator<<(std::ostream& out, const MessageValue& value);

}  // namespace lumeris
