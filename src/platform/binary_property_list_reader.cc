#include "platform/binary_property_list_reader.h"

#include <unicode/utf16.h>
#include <unicode/utf8.h>

#include <cstring>
#include <string>
#include <utility>

#include "platform/property_list_io.h"

namespace lumeris::plist {
namespace {

constexpr std::size_t kHeaderSize = 8;
constexpr std::size_t kTrailerSize = 32;

std::uint64_t BigEndian(const std::uint8_t* bytes, std::size_t size) {
  std::uint64_t value = 0;
  for (std::size_t i = 0; i < size; ++i) value = value << 8 | bytes[i];
  return value;
}

class Reader {
 public:
  explicit Reader(std::span<const std::uint8_t> bytes) : bytes_(bytes) {}

  std::optional<Value> Read() {
    if (bytes_.size() < kHeaderSize + kTrailerSize || std::memcmp(bytes_.data(), "bplist00", kHeaderSize) != 0)
      return std::nullopt;
    const std::uint8_t* trailer = bytes_.data() + bytes_.size() - kTrailerSize;
    offset_size_ = trailer[6];
    ref_size_ = trailer[7];
    object_count_ = BigEndian(trailer + 8, 8);
    const std::uint64_t root = BigEndian(trailer + 16, 8);
    table_offset_ = BigEndian(trailer + 24, 8);
    const std::uint64_t objects_end = bytes_.size() - kTrailerSize;
    if (offset_size_ == 0 || offset_size_ > 8 || ref_size_ == 0 || ref_size_ > 8 || root >= object_count_ ||
        table_offset_ < kHeaderSize || table_offset_ > objects_end ||
        object_count_ > (objects_end - table_offset_) / offset_size_) {
      return std::nullopt;
    }
    return ReadObject(root, 0);
  }

 private:
  // The start of object `index`, which must lie between the header and the offset table.
  std::optional<std::uint64_t> ObjectOffset(std::uint64_t index) const {
    if (index >= object_count_) return std::nullopt;
    const std::uint64_t offset = BigEndian(bytes_.data() + table_offset_ + index * offset_size_, offset_size_);
    if (offset < kHeaderSize || offset >= table_offset_) return std::nullopt;
    return offset;
  }

  // Whether `size` bytes from `offset` lie before the offset table.
  bool Fits(std::uint64_t offset, std::uint64_t size) const {
    return offset <= table_offset_ && size <= table_offset_ - offset;
  }

  // The element count of a container or string whose marker is at `offset`: the marker's low
  // nibble, or the integer that follows it when the nibble is 0xF. `*body` is set to where the
  // contents begin.
  std::optional<std::uint64_t> Count(std::uint64_t offset, std::uint64_t* body) const {
    const std::uint8_t nibble = bytes_[offset] & 0x0F;
    if (nibble != 0x0F) {
      *body = offset + 1;
      return nibble;
    }
    if (!Fits(offset + 1, 1)) return std::nullopt;
    const std::uint8_t marker = bytes_[offset + 1];
    if ((marker & 0xF0) != 0x10 || (marker & 0x0F) > 3) return std::nullopt;
    const std::size_t size = std::size_t{1} << (marker & 0x0F);
    if (!Fits(offset + 2, size)) return std::nullopt;
    const std::uint64_t count = BigEndian(bytes_.data() + offset + 2, size);
    if (size == 8 && count > static_cast<std::uint64_t>(INT64_MAX)) return std::nullopt;
    *body = offset + 2 + size;
    return count;
  }

  std::optional<Value> ReadObject(std::uint64_t index, int depth) {
    if (depth > kMaxPropertyListDepth) return std::nullopt;
    const std::optional<std::uint64_t> offset = ObjectOffset(index);
    if (!offset) return std::nullopt;
    const std::uint8_t marker = bytes_[*offset];
    const std::uint8_t nibble = marker & 0x0F;
    switch (marker >> 4) {
      case 0x0:
        if (marker == 0x08 || marker == 0x09) return Value(marker == 0x09);
        return std::nullopt;
      case 0x1: {
        if (nibble > 3) return std::nullopt;
        const std::size_t size = std::size_t{1} << nibble;
        if (!Fits(*offset + 1, size)) return std::nullopt;
        return Value(static_cast<std::int64_t>(BigEndian(bytes_.data() + *offset + 1, size)));
      }
      case 0x2: {
        if (nibble != 2 && nibble != 3) return std::nullopt;
        const std::size_t size = std::size_t{1} << nibble;
        if (!Fits(*offset + 1, size)) return std::nullopt;
        const std::uint64_t bits = BigEndian(bytes_.data() + *offset + 1, size);
        if (size == 4) {
          float real;
          const auto narrow = static_cast<std::uint32_t>(bits);
          std::memcpy(&real, &narrow, 4);
          return Value(static_cast<double>(real));
        }
        double real;
        std::memcpy(&real, &bits, 8);
        return Value(real);
      }
      case 0x4: {
        std::uint64_t body = 0;
        const std::optional<std::uint64_t> size = Count(*offset, &body);
        if (!size || !Fits(body, *size)) return std::nullopt;
        const std::uint8_t* begin = bytes_.data() + body;
        return Value(Data(begin, begin + *size));
      }
      case 0x5: {
        std::uint64_t body = 0;
        const std::optional<std::uint64_t> size = Count(*offset, &body);
        if (!size || !Fits(body, *size)) return std::nullopt;
        const auto* begin = reinterpret_cast<const char*>(bytes_.data() + body);
        for (std::uint64_t i = 0; i < *size; ++i) {
          if (begin[i] == '\0' || static_cast<std::uint8_t>(begin[i]) >= 0x80) return std::nullopt;
        }
        return Value(std::string(begin, *size));
      }
      case 0x6:
        return ReadUtf16String(*offset);
      case 0xA:
        return ReadArray(*offset, depth);
      case 0xD:
        return ReadDictionary(*offset, depth);
      default:
        return std::nullopt;
    }
  }

  // A UTF-16 (big-endian) string as UTF-8; std::nullopt for an empty one (which libplist
  // refuses), a lone surrogate or a NUL.
  std::optional<Value> ReadUtf16String(std::uint64_t offset) const {
    std::uint64_t body = 0;
    const std::optional<std::uint64_t> units = Count(offset, &body);
    if (!units || *units == 0 || *units > table_offset_ / 2 || !Fits(body, *units * 2)) return std::nullopt;
    std::string text;
    text.reserve(static_cast<std::size_t>(*units) * 3);
    const std::uint8_t* begin = bytes_.data() + body;
    for (std::uint64_t i = 0; i < *units; ++i) {
      UChar32 c = static_cast<UChar32>(BigEndian(begin + 2 * i, 2));
      if (U16_IS_SURROGATE(c)) {
        if (!U16_IS_LEAD(c) || i + 1 == *units) return std::nullopt;
        const auto trail = static_cast<UChar32>(BigEndian(begin + 2 * (i + 1), 2));
        if (!U16_IS_TRAIL(trail)) return std::nullopt;
        c = U16_GET_SUPPLEMENTARY(c, trail);
        ++i;
      }
      if (c == 0) return std::nullopt;
      char buffer[4];
      std::int32_t length = 0;
      U8_APPEND_UNSAFE(buffer, length, c);
      text.append(buffer, static_cast<std::size_t>(length));
    }
    return Value(std::move(text));
  }

  // The object references of a container at `offset`: `count` * `per_entry` references from
  // `*body`.
  bool References(std::uint64_t offset, std::uint64_t per_entry, std::uint64_t* count, std::uint64_t* body) const {
    const std::optional<std::uint64_t> n = Count(offset, body);
    if (!n || *n > table_offset_ / per_entry / ref_size_) return false;
    *count = *n;
    return Fits(*body, *n * per_entry * ref_size_);
  }

  std::uint64_t Reference(std::uint64_t at) const { return BigEndian(bytes_.data() + at, ref_size_); }

  std::optional<Value> ReadArray(std::uint64_t offset, int depth) {
    std::uint64_t count = 0;
    std::uint64_t body = 0;
    if (!References(offset, 1, &count, &body)) return std::nullopt;
    Array array;
    array.reserve(static_cast<std::size_t>(count));
    for (std::uint64_t i = 0; i < count; ++i) {
      std::optional<Value> item = ReadObject(Reference(body + i * ref_size_), depth + 1);
      if (!item) return std::nullopt;
      array.push_back(std::move(*item));
    }
    return Value(std::move(array));
  }

  std::optional<Value> ReadDictionary(std::uint64_t offset, int depth) {
    std::uint64_t count = 0;
    std::uint64_t body = 0;
    if (!References(offset, 2, &count, &body)) return std::nullopt;
    Dictionary dictionary;
    for (std::uint64_t i = 0; i < count; ++i) {
      std::optional<Value> key = ReadObject(Reference(body + i * ref_size_), depth + 1);
      if (!key || key->AsString() == nullptr) return std::nullopt;
      std::optional<Value> value = ReadObject(Reference(body + (count + i) * ref_size_), depth + 1);
      if (!value) return std::nullopt;
      dictionary.insert_or_assign(std::move(*key->AsString()), std::move(*value));
    }
    return Value(std::move(dictionary));
  }

  std::span<const std::uint8_t> bytes_;
  std::uint8_t offset_size_ = 0;
  std::uint8_t ref_size_ = 0;
  std::uint64_t object_count_ = 0;
  std::uint64_t table_offset_ = 0;
};

}  // namespace

std::optional<Value> ReadCommonBinaryPropertyList(std::span<const std::uint8_t> bytes) {
  return Reader(bytes).Read();
}

}  // namespace lumeris::plist
