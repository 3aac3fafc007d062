#include "platform/property_list_io.h"

#include <fcntl.h>
#include <plist/plist.h>
#include <unicode/utf8.h>
#include <unistd.h>

#include <cerrno>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <memory>
#include <utility>

#include "platform/binary_property_list_reader.h"

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

// `seconds` within +/-2^31 s of 2001-01-01 and rounded to whole microseconds (what libplist's
// date keeps); NaN reads as 0.
double ClampedDate(double seconds) {
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
  return whole + static_cast<double>(usec) / 1e6;
}

// Null when `value` holds a string (or key) that the format cannot keep whole.
NodePtr ToNode(const Value& value) {
  switch (value.type()) {
    case Value::Type::kString:
      if (!IsPropertyListText(*value.AsString())) return nullptr;
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
      const double seconds = ClampedDate(value.AsDate()->seconds_since_2001);
      const double whole = std::floor(seconds);
      return NodePtr(plist_new_date(static_cast<std::int32_t>(whole),
                                    static_cast<std::int32_t>(std::llround((seconds - whole) * 1e6))));
    }
    case Value::Type::kData: {
      const Data& data = *value.AsData();
      return NodePtr(plist_new_data(reinterpret_cast<const char*>(data.data()), data.size()));
    }
    case Value::Type::kArray: {
      NodePtr array(plist_new_array());
      for (const Value& item : *value.AsArray()) {
        NodePtr node = ToNode(item);
        if (!node) return nullptr;
        plist_array_append_item(array.get(), node.release());
      }
      return array;
    }
    case Value::Type::kDictionary: {
      NodePtr dict(plist_new_dict());
      for (const auto& [key, item] : *value.AsDictionary()) {
        NodePtr node = IsPropertyListText(key) ? ToNode(item) : nullptr;
        if (!node) return nullptr;
        plist_dict_set_item(dict.get(), key.c_str(), node.release());
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
      // The iterator walks the children in order; plist_array_get_item(i) would start each
      // lookup from the first child, which is quadratic for long lists.
      Array array;
      array.reserve(plist_array_get_size(node));
      plist_array_iter it = nullptr;
      plist_array_new_iter(node, &it);
      if (it == nullptr) return Value(std::move(array));
      std::unique_ptr<void, decltype(&std::free)> iter_owner(it, &std::free);
      while (true) {
        plist_t item_node = nullptr;
        plist_array_next_item(node, it, &item_node);
        if (item_node == nullptr) break;
        std::optional<Value> item = FromNode(item_node, depth + 1);
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


// The binary writer. libplist's own (plist_to_bin) hashes every string by its last few bytes
// into a fixed table to merge duplicates, which makes a list of many entity IDs (which all end
// alike) quadratic: 100,000 entries took seconds. This writer is linear: it writes each object
// once, in document order, without merging duplicates (the format does not require it), and
// libplist reads what it writes.
class BinaryWriter {
 public:
  // False when a string or key is not IsPropertyListText.
  bool Write(const Value& root, std::vector<std::uint8_t>& out) {
    if (!Count(root)) return false;
    ref_size_ = object_count_ <= 0xFF ? 1 : object_count_ <= 0xFFFF ? 2 : 4;
    out_.assign({'b', 'p', 'l', 'i', 's', 't', '0', '0'});
    offsets_.reserve(object_count_);
    WriteObject(root, 0);
    const std::uint64_t table_offset = out_.size();
    const std::uint8_t offset_size = BytesFor(table_offset);
    for (std::uint64_t offset : offsets_) AppendBigEndian(offset, offset_size);
    out_.insert(out_.end(), 6, 0);
    out_.push_back(offset_size);
    out_.push_back(ref_size_);
    AppendBigEndian(object_count_, 8);
    AppendBigEndian(0, 8);  // the root is object 0
    AppendBigEndian(table_offset, 8);
    out = std::move(out_);
    return true;
  }

 private:
  static std::uint8_t BytesFor(std::uint64_t value) {
    return value <= 0xFF ? 1 : value <= 0xFFFF ? 2 : value <= 0xFFFFFFFF ? 4 : 8;
  }

  // Counts the objects (keys included) and checks every string.
  bool Count(const Value& value) {
    ++object_count_;
    if (const std::string* text = value.AsString()) return IsPropertyListText(*text);
    if (const Array* array = value.AsArray()) {
      for (const Value& item : *array) {
        if (!Count(item)) return false;
      }
    } else if (const Dictionary* dict = value.AsDictionary()) {
      for (const auto& [key, item] : *dict) {
        ++object_count_;
        if (!IsPropertyListText(key) || !Count(item)) return false;
      }
    }
    return true;
  }

  void AppendBigEndian(std::uint64_t value, int bytes) {
    for (int shift = (bytes - 1) * 8; shift >= 0; shift -= 8) out_.push_back(static_cast<std::uint8_t>(value >> shift));
  }
  void AppendInteger(std::int64_t value) {
    // 1, 2 and 4-byte integers are unsigned; the 8-byte form is signed.
    const auto bits = static_cast<std::uint64_t>(value);
    const std::uint8_t size = value < 0 ? 8 : BytesFor(bits);
    out_.push_back(static_cast<std::uint8_t>(0x10 | (size == 1 ? 0 : size == 2 ? 1 : size == 4 ? 2 : 3)));
    AppendBigEndian(bits, size);
  }
  void AppendMarker(std::uint8_t kind, std::uint64_t count) {
    if (count < 15) {
      out_.push_back(static_cast<std::uint8_t>(kind | count));
    } else {
      out_.push_back(static_cast<std::uint8_t>(kind | 0x0F));
      AppendInteger(static_cast<std::int64_t>(count));
    }
  }
  void AppendDouble(std::uint8_t marker, double value) {
    std::uint64_t bits = 0;
    std::memcpy(&bits, &value, sizeof bits);
    out_.push_back(marker);
    AppendBigEndian(bits, 8);
  }
  void AppendString(const std::string& text) {
    if (std::all_of(text.begin(), text.end(), [](char c) { return static_cast<unsigned char>(c) < 0x80; })) {
      AppendMarker(0x50, text.size());
      out_.insert(out_.end(), text.begin(), text.end());
      return;
    }
    units_.clear();
    const auto* bytes = reinterpret_cast<const std::uint8_t*>(text.data());
    const auto length = static_cast<std::int32_t>(text.size());
    for (std::int32_t i = 0; i < length;) {
      UChar32 c = 0;
      U8_NEXT(bytes, i, length, c);
      if (U16_LENGTH(c) == 1) {
        units_.push_back(static_cast<char16_t>(c));
      } else {
        units_.push_back(U16_LEAD(c));
        units_.push_back(U16_TRAIL(c));
      }
    }
    AppendMarker(0x60, units_.size());
    for (char16_t unit : units_) AppendBigEndian(unit, 2);
  }

  // Writes `value` as object number `ref`, then everything inside it. Objects are numbered and
  // written in the same order (depth first, a dictionary's keys before its values), so a
  // container knows its children's numbers from their sizes before they are written.
  void WriteObject(const Value& value, std::uint64_t ref) {
    offsets_.push_back(out_.size());
    switch (value.type()) {
      case Value::Type::kString:
        AppendString(*value.AsString());
        return;
      case Value::Type::kInteger:
        AppendInteger(*value.AsInteger());
        return;
      case Value::Type::kReal:
        AppendDouble(0x23, *value.AsReal());
        return;
      case Value::Type::kBool:
        out_.push_back(*value.AsBool() ? 0x09 : 0x08);
        return;
      case Value::Type::kDate:
        AppendDouble(0x33, ClampedDate(value.AsDate()->seconds_since_2001));
        return;
      case Value::Type::kData: {
        const Data& data = *value.AsData();
        AppendMarker(0x40, data.size());
        out_.insert(out_.end(), data.begin(), data.end());
        return;
      }
      case Value::Type::kArray: {
        const Array& array = *value.AsArray();
        AppendMarker(0xA0, array.size());
        std::vector<std::uint64_t> children;
        children.reserve(array.size());
        std::uint64_t next = ref + 1;
        for (const Value& item : array) {
          children.push_back(next);
          next += Size(item);
        }
        for (std::uint64_t child : children) AppendBigEndian(child, ref_size_);
        for (std::size_t i = 0; i < array.size(); ++i) WriteObject(array[i], children[i]);
        return;
      }
      case Value::Type::kDictionary: {
        const Dictionary& dict = *value.AsDictionary();
        AppendMarker(0xD0, dict.size());
        std::vector<std::uint64_t> values;
        values.reserve(dict.size());
        std::uint64_t next = ref + 1;
        for (std::size_t i = 0; i < dict.size(); ++i) AppendBigEndian(next++, ref_size_);
        for (const auto& [key, item] : dict) {
          values.push_back(next);
          next += Size(item);
        }
        for (std::uint64_t child : values) AppendBigEndian(child, ref_size_);
        for (const auto& [key, item] : dict) {
          offsets_.push_back(out_.size());
          AppendString(key);
        }
        std::size_t i = 0;
        for (const auto& [key, item] : dict) WriteObject(item, values[i++]);
        return;
      }
    }
  }

  // The number of objects in `value`, itself included (dictionary keys count).
  static std::uint64_t Size(const Value& value) {
    std::uint64_t size = 1;
    if (const Array* array = value.AsArray()) {
      for (const Value& item : *array) size += Size(item);
    } else if (const Dictionary* dict = value.AsDictionary()) {
      for (const auto& [key, item] : *dict) size += 1 + Size(item);
    }
    return size;
  }

  std::vector<std::uint8_t> out_;
  std::vector<std::uint64_t> offsets_;
  std::vector<char16_t> units_;
  std::uint64_t object_count_ = 0;
  std::uint8_t ref_size_ = 1;
};

}  // namespace

bool IsPropertyListText(std::string_view text) {
  const auto* bytes = reinterpret_cast<const std::uint8_t*>(text.data());
  const std::int32_t length = static_cast<std::int32_t>(std::min<std::size_t>(text.size(), INT32_MAX));
  if (static_cast<std::size_t>(length) != text.size()) return false;
  for (std::int32_t i = 0; i < length;) {
    UChar32 c = 0;
    U8_NEXT(bytes, i, length, c);
    if (c <= 0) return false;  // ill-formed (negative) or NUL
  }
  return true;
}

std::optional<Value> ParsePropertyList(std::span<const std::uint8_t> bytes) {
  if (bytes.empty() || bytes.size() > std::numeric_limits<std::uint32_t>::max()) return std::nullopt;
  // The common binary documents are read directly (several times faster: no node tree to
  // build, convert and free); libplist reads everything else.
  if (std::optional<Value> value = ReadCommonBinaryPropertyList(bytes)) return value;
  return ParsePropertyListWithLibplist(bytes);
}

std::optional<Value> ParsePropertyListWithLibplist(std::span<const std::uint8_t> bytes) {
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
  std::vector<std::uint8_t> bytes;
  if (!BinaryWriter().Write(value, bytes)) return {};
  return bytes;
}

std::string SerializeXmlPropertyList(const Value& value) {
  NodePtr root = ToNode(value);
  if (!root) return {};
  char* buffer = nullptr;
  std::uint32_t length = 0;
  plist_to_xml(root.get(), &buffer, &length);
  std::string xml(buffer ? buffer : "", buffer ? length : 0);
  plist_to_xml_free(buffer);
  return xml;
}

}  // namespace lumeris::plist
