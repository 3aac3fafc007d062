// A direct reader of binary property lists ("bplist00") into plist::Value, for the documents
// that are read on every request (strings tables, category plists, Info.plist files).
//
//   if (std::optional<plist::Value> value = plist::ReadCommonBinaryPropertyList(bytes)) ...
//
// It covers the common subset of the format: booleans, integers of 1, 2, 4 and 8 bytes, reals
// of 4 and 8 bytes, data, ASCII strings without NUL, UTF-16 strings that are non-empty, well formed and
// hold no NUL, arrays, and dictionaries with string keys (a repeated key keeps its last value),
// nested at most kMaxPropertyListDepth deep. For any other document (another format, a date,
// a 16-byte integer, a set, a UID, a reference or offset out of range, an ASCII string with a
// byte above 0x7F, ...) it returns std::nullopt without reading further, and the caller hands
// the bytes to libplist. Where it answers, it gives the value that libplist's reader followed
// by the conversion in property_list_io.cc gives, without building libplist's node tree first.
//
// Thread-safety: a pure function of its input.
#pragma once

#include <cstdint>
#include <optional>
#include <span>

#include "platform/property_list.h"

namespace lumeris::plist {

std::optional<Value> ReadCommonBinaryPropertyList(std::span<const std::uint8_t> bytes);

}  // namespace lumeris::plist
