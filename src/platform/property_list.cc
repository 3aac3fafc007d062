#include "platform/property_list.h"

#include <utility>

namespace lumeris::plist {

Value::Value() = default;
Value::Value(std::string value) : value_(std::move(value)) {}
Value::Value(const char* value) : value_(std::string(value)) {}
Value::Value(std::int64_t value) : value_(value) {}
Value::Value(int value) : value_(static_cast<std::int64_t>(value)) {}
Value::Value(double value) : value_(value) {}
Value::Value(bool value) : value_(value) {}
Value::Value(Date value) : value_(value) {}
Value::Value(Data value) : value_(std::move(value)) {}
Value::Value(Array value) : value_(std::move(value)) {}
Value::Value(Dictionary value) : value_(std::move(value)) {}

Value::Type Value::type() const { return static_cast<Type>(value_.index()); }

const std::string* Value::AsString() const { return std::get_if<std::string>(&value_); }
std::string* Value::AsString() { return std::get_if<std::string>(&value_); }
const std::int64_t* Value::AsInteger() const { return std::get_if<std::int64_t>(&value_); }
const double* Value::AsReal() const { return std::get_if<double>(&value_); }
const bool* Value::AsBool() const { return std::get_if<bool>(&value_); }
const Date* Value::AsDate() const { return std::get_if<Date>(&value_); }
const Data* Value::AsData() const { return std::get_if<Data>(&value_); }
const Array* Value::AsArray() const { return std::get_if<Array>(&value_); }
Array* Value::AsArray() { return std::get_if<Array>(&value_); }
const Dictionary* Value::AsDictionary() const { return std::get_if<Dictionary>(&value_); }
Dictionary* Value::AsDictionary() { return std::get_if<Dictionary>(&value_); }

const Value* Value::Find(std::string_view key) const {
  const Dictionary* dictionary = AsDictionary();
  if (dictionary == nullptr) return nullptr;
  auto it = dictionary->find(key);
  return it == dictionary->end() ? nullptr : &it->second;
}

bool operator==(const Value& a, const Value& b) { return a.value_ == b.value_; }

}  // namespace lumeris::plist
