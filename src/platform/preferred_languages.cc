#include "platform/preferred_languages.h"

#include <unicode/localebuilder.h>
#include <unicode/locid.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <utility>

namespace lumeris {
namespace {

// glibc's locale modifiers that name a script, and the ISO 15924 codes they stand for.
constexpr std::array<std::pair<std::string_view, const char*>, 3> kScriptModifiers = {{
    {"latin", "Latn"},
    {"cyrillic", "Cyrl"},
    {"devanagari", "Deva"},
}};

std::optional<icu::Locale> LocaleFromPosixName(std::string_view name) {
  std::string_view modifier;
  if (const auto at = name.find('@'); at != std::string_view::npos) {
    modifier = name.substr(at + 1);
    name = name.substr(0, at);
  }
  if (const auto dot = name.find('.'); dot != std::string_view::npos) name = name.substr(0, dot);
  if (name.empty() || name == "C" || name == "POSIX") return std::nullopt;

  std::string tag(name);
  std::replace(tag.begin(), tag.end(), '_', '-');
  UErrorCode status = U_ZERO_ERROR;
  const icu::Locale parsed = icu::Locale::forLanguageTag(tag, status);
  if (U_FAILURE(status) || parsed.isBogus() || *parsed.getLanguage() == '\0') return std::nullopt;

  icu::LocaleBuilder builder;
  builder.setLocale(parsed);
  for (const auto& [posix_modifier, script] : kScriptModifiers) {
    if (modifier == posix_modifier) builder.setScript(script);
  }
  if (modifier == "valencia") builder.setVariant("valencia");
  icu::Locale locale = builder.build(status);
  if (U_FAILURE(status) || locale.isBogus()) return std::nullopt;
  return locale;
}

// The value of the first of LC_ALL, LC_MESSAGES and LANG that is set and non-empty.
std::optional<std::string_view> CurrentLocaleName() {
  for (const char* variable : {"LC_ALL", "LC_MESSAGES", "LANG"}) {
    const char* value = std::getenv(variable);
    if (value != nullptr && *value != '\0') return std::string_view(value);
  }
  return std::nullopt;
}

void AppendUnique(std::vector<std::string>& list, std::string value) {
  if (std::find(list.begin(), list.end(), value) == list.end()) list.push_back(std::move(value));
}

}  // namespace

std::optional<std::string> LanguageTagFromPosixLocale(std::string_view name) {
  const std::optional<icu::Locale> locale = LocaleFromPosixName(name);
  if (!locale) return std::nullopt;
  UErrorCode status = U_ZERO_ERROR;
  std::string tag = locale->toLanguageTag<std::string>(status);
  if (U_FAILURE(status) || tag.empty() || tag == "und") return std::nullopt;
  return tag;
}

std::vector<std::string> PreferredLanguages() {
  std::vector<std::string> languages;
  if (const char* list = std::getenv("LANGUAGE"); list != nullptr) {
    std::string_view rest(list);
    while (!rest.empty()) {
      const auto colon = rest.find(':');
      if (auto tag = LanguageTagFromPosixLocale(rest.substr(0, colon))) {
        AppendUnique(languages, std::move(*tag));
      }
      if (colon == std::string_view::npos) break;
      rest.remove_prefix(colon + 1);
    }
  }
  if (languages.empty()) {
    if (const auto name = CurrentLocaleName()) {
      if (auto tag = LanguageTagFromPosixLocale(*name)) languages.push_back(std::move(*tag));
    }
  }
  return languages;
}

std::optional<std::string> CurrentLocaleCountryCode() {
  const auto name = CurrentLocaleName();
  if (!name) return std::nullopt;
  const std::optional<icu::Locale> locale = LocaleFromPosixName(*name);
  if (!locale || *locale->getCountry() == '\0') return std::nullopt;
  return std::string(locale->getCountry());
}

}  // namespace lumeris
