// The two text forms of bytes that `lumeris` reads inside JSON (client/json_notation.h): base64
// (RFC 4648, standard alphabet, "=" padding), which it also prints, and hexadecimal digits.
//
// Thread-safety: pure functions. Results are owned by the caller.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace lumeris::cli {

// The padded base64 text of `bytes`.
std::string EncodeBase64(const std::vector<std::uint8_t>& bytes);

// The bytes of padded base64 text; std::nullopt for a length that is not a multiple of four, a
// character outside the alphabet, padding anywhere but at the end, or non-zero bits left over
// in the last group (so every byte string has exactly one accepted spelling).
std::optional<std::vector<std::uint8_t>> DecodeBase64(std::string_view text);

// The bytes of hexadecimal digits (either case, an even number of them); std::nullopt otherwise.
std::optional<std::vector<std::uint8_t>> DecodeHex(std::string_view text);

}  // namespace lumeris::cli
