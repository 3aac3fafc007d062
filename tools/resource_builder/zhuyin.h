// Zhuyin (Bopomofo) spelling of a Mandarin syllable written in tone-marked Hanyu Pinyin, as
// Unihan's kMandarin field gives it: PinyinToZhuyin("xīn") == "ㄒㄧㄣ", ("lǜ") == "ㄌㄩˋ",
// ("zhī") == "ㄓ"; a syllable with no tone mark is taken as neutral tone ("˙ㄇㄚ").
//
// Thread-safety: pure function; the result belongs to the caller.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace lumeris::resources {

// nullopt when `pinyin` is not one syllable of standard Pinyin.
std::optional<std::string> PinyinToZhuyin(std::string_view pinyin);

}  // namespace lumeris::resources
