#include "resource_builder/han_language_info.h"

#include <string_view>
#include <utility>

namespace lumeris::resources {

plist::Value HanLanguageInfo() {
  static constexpr std::pair<std::string_view, std::string_view> kFieldLanguages[] = {
      {"jyom", "ja"},      {"krpi", "ko"},      {"spin", "zh-Hans"}, {"swbx", "zh-Hans"}, {"swbh", "zh-Hans"},
      {"sbix", "zh-Hans"}, {"cbai", "yue"},     {"tcan", "zh-Hant"}, {"tday", "zh-Hant"}, {"tpin", "zh-Hant"},
      {"tzhu", "zh-Hant"}, {"rsu1", "zh"},      {"rsu2", "zh"},      {"rsu3", "zh"},      {"rsu4", "zh"},
  };
  plist::Dictionary tags;
  plist::Dictionary languages;
  for (const auto& [tag, language] : kFieldLanguages) {
    tags.emplace(std::string(tag), std::string(language));
    auto [it, inserted] = languages.try_emplace(std::string(language), plist::Array{});
    it->second.AsArray()->push_back(std::string(tag));
  }
  return plist::Dictionary{{"tags", std::move(tags)}, {"languages", std::move(languages)}};
}

}  // namespace lumeris::resources
