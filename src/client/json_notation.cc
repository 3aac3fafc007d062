#include "client/json_notation.h"

#include <charconv>
#include <cmath>
#include <limits>

#include "client/cli_base64.h"

namespace lumeris::cli {
namespace {

template <typename Integer>
std::optional<Integer> ParseDecimal(const std::string& text) {
  Integer number = 0;
  const char* end = text.data() + text.size();
  auto [stop, status] = std::from_chars(text.data(), end, number);
  if (status != std::errc() || stop != end || text.empty()) return std::nullopt;
  return number;
}

}  // namespace

std::string_view TagOf(const nlohmann::json& json) {
  if (!json.is_object() || json.size() != 1) return {};
  const std::string& key = json.begin().key();
  return key.starts_with("$") ? std::string_view(key) : std::string_view();
}

nlohmann::json Tagged(std::string_view tag, nlohmann::json value) {
  nlohmann::json object = nlohmann::json::object();
  object[std::string(tag)] = std::move(value);
  return object;
}

bool IsBytesTag(std::string_view tag) { return tag == kBase64Tag || tag == kHexTag || tag == kDataTag; }

std::optional<std::vector<std::uint8_t>> BytesFromTag(std::string_view tag, const nlohmann::json& text,
                                                      std::string* error, std::string* note) {
  const auto fail = [error](const char* reason) {
    if (error) *error = reason;
    return std::nullopt;
  };
  if (!text.is_string()) return fail("expects text");
  const std::string& value = text.get_ref<const std::string&>();
  if (tag == kBase64Tag) {
    if (auto bytes = DecodeBase64(value)) return bytes;
    return fail("expects padded base64 text");
  }
  if (tag == kHexTag) {
    if (auto bytes = DecodeHex(value)) return bytes;
    return fail("expects an even number of hexadecimal digits");
  }
  std::optional<std::vector<std::uint8_t>> hex = DecodeHex(value);
  std::optional<std::vector<std::uint8_t>> base64 = DecodeBase64(value);
  if (hex) {
    if (base64 && !value.empty() && note) {
      *note = "{\"$data\": \"" + value + "\"} was read as hexadecimal; write {\"$hex\": ...} or {\"$base64\": ...} "
              "to say which is meant";
    }
    return hex;
  }
  if (base64) return base64;
  return fail("expects hexadecimal digits or padded base64 text");
}

nlohmann::json BytesJson(const std::vector<std::uint8_t>& bytes) { return Tagged(kBase64Tag, EncodeBase64(bytes)); }

std::optional<double> DoubleFromTag(const nlohmann::json& value) {
  if (value.is_number()) return value.get<double>();
  if (!value.is_string()) return std::nullopt;
  const std::string& text = value.get_ref<const std::string&>();
  if (text == "nan") return std::numeric_limits<double>::quiet_NaN();
  if (text == "inf") return std::numeric_limits<double>::infinity();
  if (text == "-inf") return -std::numeric_limits<double>::infinity();
  return std::nullopt;
}

nlohmann::json DoubleJson(double value) {
  if (std::isnan(value)) return Tagged(kDoubleTag, "nan");
  if (std::isinf(value)) return Tagged(kDoubleTag, value > 0 ? "inf" : "-inf");
  return value;
}

std::optional<std::uint64_t> Uint64FromTag(const nlohmann::json& value) {
  if (value.is_number_unsigned()) return value.get<std::uint64_t>();
  if (value.is_string()) return ParseDecimal<std::uint64_t>(value.get_ref<const std::string&>());
  return std::nullopt;
}

std::optional<std::int64_t> Int64FromTag(const nlohmann::json& value) {
  if (value.is_number_unsigned()) {
    const auto number = value.get<std::uint64_t>();
    if (number > std::uint64_t{std::numeric_limits<std::int64_t>::max()}) return std::nullopt;
    return static_cast<std::int64_t>(number);
  }
  if (value.is_number_integer()) return value.get<std::int64_t>();
  if (value.is_string()) return ParseDecimal<std::int64_t>(value.get_ref<const std::string&>());
  return std::nullopt;
}

std::string UnknownTagReason() {
  return "is not a known tag ($base64, $hex, $data, $uint64, $int64, $double, $date, $dictionary); "
         "wrap a literal dictionary in {\"$dictionary\": ...}";
}

std::string DescribePointer(const std::string& pointer) { return pointer.empty() ? "the value" : pointer; }

}  // namespace lumeris::cli
