// The fields of a character's information record: the sixteen four-letter tags of the
// "|"-separated `info` text of the character database, in field order (the order is part of the
// file format), and which of them the text search looks in.
//
//   info "GRINNING FACE; smile|||..."  ->  field 0 under "unam", field 1 under "jyom", ...
//
// Thread-safety: constant data.
#pragma once

#include <array>
#include <cstddef>
#include <string_view>

namespace lumeris {

inline constexpr std::size_t kCharacterInfoFieldCount = 16;

inline constexpr std::array<std::string_view, kCharacterInfoFieldCount> CharacterInfoFieldTags = {
    "unam", "jyom", "krpi", "spin", "swbx", "swbh", "sbix", "cbai",
    "tcan", "tday", "tpin", "tzhu", "rsu1", "rsu2", "rsu3", "rsu4"};

// Parallel to CharacterInfoFieldTags: a field whose entry is empty is not searched, so only the
// names and keywords of field 0 are.
inline constexpr std::array<std::string_view, kCharacterInfoFieldCount> SearchFieldTags = {
    "unam", "", "", "", "", "", "", "", "", "", "", "", "", "", "", ""};

}  // namespace lumeris
