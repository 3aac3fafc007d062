#include "platform/property_list_io.h"

#include <fcntl.h>
#include <plist/plist.h>
#include <unistd.h>

#include <cerrno>

#include <cmath>
#include <cstdlib>
#include <limits>
#include <memory>
#include <utility>

namespace lumeris::plist {
namespace {

struct PlistFree {
  void operator()(void* node) const { plist_free(static_cast<plist_t>(node)); }
};
using NodePtr = std::unique_ptr<void, PlistFree>;

// Frees a buffer that libplist allocated with malloc (plist_get_key_val, plist_dict_next_item).
struct MallocFree {
  void operator()(char* p) const { std::free(p); }
};

constexpr double kMinDateSeconds = std::numeric_limits<std::int32_t>::min();
constexpr double kMaxDateSeconds = std::numeric_limits<std::int32_t>::max();

NodePtr ToNode(const Value& value) {
  switch (value.type()) {
    case Value::Type::kString:
      return NodePtr(plist_new_string(value.AsString()->c_str()));
    case Value::Type::kInteger:
      // libplist keeps integers as uint64; the two's-complement bits of a negative value are
      // written as the signed 8-byte integer they stand for.
      return NodePtr(plist_new_uint(static_cast<std::uint64_t>(*value.AsInteger())));
    case Value::Type::kReal:
      return NodePtr(plist_new_real(*value.AsReal()));
    case Value::Type::kBool:
      return NodePtr(plist_new_bool(*value.AsBool() ? 1 : 0));
    case Value::Type::kDate: {
      double seconds = value.AsDate()->seconds_since_2001;
      if (std::isnan(seconds)) seconds = 0;
      seconds = std::fmin(std::fmax(seconds, kMinDateSeconds), kMaxDateSeconds);
      double whole = std::floor(seconds);
      auto usec = static_cast<std::int64_t>(std::llround((seconds - whole) * 1e6));
      if (usec >= 1000000 && whole < kMaxDateSeconds) {
        whole += 1;
        usec -= 1000000;
      } else if (usec >= 1000000) {
        usec = 999999;
      }
      return NodePtr(plist_new_date(static_cast<std::int32_t>(whole), static_cast<std::int32_t>(usec)));
    }
    case Value::Type::kData: {
      const Data& data = *value.AsData();
      return NodePtr(plist_new_data(reinterpret_cast<const char*>(data.data()), data.size()));
    }
    case Value::Type::kArray: {
      NodePtr array(plist_new_array());
      for (const Value& item : *value.AsArray()) plist_array_append_item(array.get(), ToNode(item).release());
      return array;
    }
    case Value::Type::kDictionary: {
      NodePtr dict(plist_new_dict());
      for (const auto& [key, item] : *value.AsDictionary()) {
        plist_dict_set_item(dict.get(), key.c_str(), ToNode(item).release());
      }
      return dict;
    }
  }
  return NodePtr(plist_new_string(""));
}

std::optional<Value> FromNode(plist_t node, int depth) {
  if (node == nullptr || depth > kMaxPropertyListDepth) return std::nullopt;
  switch (plist_get_node_type(node)) {
    case PLIST_STRING: {
      std::uint64_t length = 0;
      const char* text = plist_get_string_ptr(node, &length);
      return Value(text ? std::string(text, length) : std::string());
    }
    case PLIST_UINT: {
      std::uint64_t bits = 0;
      plist_get_uint_val(node, &bits);
      return Value(static_cast<std::int64_t>(bits));
    }
    case PLIST_REAL: {
      double real = 0;
      plist_get_real_val(node, &real);
      return Value(real);
    }
    case PLIST_BOOLEAN: {
      std::uint8_t flag = 0;
      plist_get_bool_val(node, &flag);
      return Value(flag != 0);
    }
    case PLIST_DATE: {
      std::int32_t sec = 0;
      std::int32_t usec = 0;
      plist_get_date_val(node, &sec, &usec);
      // libplist splits a negative binary date by truncation and keeps the fraction's
      // magnitude only (-1.25 reads as sec -1, usec 250000), so the fraction of a negative
      // date counts towards the past.
      const double fraction = static_cast<double>(usec) / 1e6;
      return Value(Date{sec < 0 ? static_cast<double>(sec) - fraction : static_cast<double>(sec) + fraction});
    }
    case PLIST_DATA: {
      std::uint64_t length = 0;
      const char* bytes = plist_get_data_ptr(node, &length);
      const auto* begin = reinterpret_cast<const std::uint8_t*>(bytes);
      return Value(bytes ? Data(begin, begin + length) : Data());
    }
    case PLIST_ARRAY: {
      Array array;
      const std::uint32_t size = plist_array_get_size(node);
      array.reserve(size);
      for (std::uint32_t i = 0; i < size; ++i) {
        std::optional<Value> item = FromNode(plist_array_get_item(node, i), depth + 1);
        if (!item) return std::nullopt;
        array.push_back(std::move(*item));
      }
      return Value(std::move(array));
    }
    case PLIST_DICT: {
      Dictionary dict;
      plist_dict_iter it = nullptr;
      plist_dict_new_iter(node, &it);
      if (it == nullptr) return Value(std::move(dict));
      std::unique_ptr<void, decltype(&std::free)> iter_owner(it, &std::free);
      while (true) {
        char* raw_key = nullptr;
        plist_t item_node = nullptr;
        plist_dict_next_item(node, it, &raw_key, &item_node);
        std::unique_ptr<char, MallocFree> key(raw_key);
        if (item_node == nullptr) break;
        std::optional<Value> item = FromNode(item_node, depth + 1);
        if (!item || !key) return std::nullopt;
        dict.insert_or_assign(std::string(key.get()), std::move(*item));
      }
      return Value(std::move(dict));
    }
    default:  // keys outside a dictionary, UIDs, nodes of no type
      return std::nullopt;
  }
}

}  // namespace

std::optional<Value> ParsePropertyList(std::span<const std::uint8_t> bytes) {
  if (bytes.empty() || bytes.size() > std::numeric_limits<std::uint32_t>::max()) return std::nullopt;
  plist_t root = nullptr;
  plist_from_memory(reinterpret_cast<const char*>(bytes.data()), static_cast<std::uint32_t>(bytes.size()), &root);
  NodePtr owner(root);
  return FromNode(root, 0);
}

std::optional<Value> ReadPropertyListFile(const std::filesystem::path& path) {
  const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) return std::nullopt;
  std::vector<std::uint8_t> bytes;
  std::uint8_t buffer[64 * 1024];
  bool ok = true;
  while (true) {
    const ssize_t n = ::read(fd, buffer, sizeof buffer);
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) ok = false;
    if (n <= 0) break;
    bytes.insert(bytes.end(), buffer, buffer + n);
  }
  ::close(fd);
  if (!ok) return std::nullopt;
  return ParsePropertyList(bytes);
}

std::vector<std::uint8_t> SerializeBinaryPropertyList(const Value& value) {
  NodePtr root = ToNode(value);
  char* buffer = nullptr;
  std::uint32_t length = 0;
  plist_to_bin(root.get(), &buffer, &length);
  std::vector<std::uint8_t> bytes(reinterpret_cast<std::uint8_t*>(buffer),
                                  reinterpret_cast<std::uint8_t*>(buffer) + (buffer ? length : 0));
  plist_to_bin_free(buffer);
  return bytes;
}

std::string SerializeXmlPropertyList(const Value& value) {
  NodePtr root = ToNode(value);
  char* buffer = nullptr;
  std::uint32_t length = 0;
  plist_to_xml(root.get(), &buffer, &length);
  std::string xml(buffer ? buffer : "", buffer ? length : 0);
  plist_to_xml_free(buffer);
  return xml;
}

}  // namespace lumeris::plist
