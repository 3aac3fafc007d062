#include "platform/font_coverage.h"

#include <fontconfig/fontconfig.h>
#include <ft2build.h>
#include FT_FREETYPE_H
#include <stdlib.h>
#include <unicode/uchar.h>
#include <unicode/utf16.h>

#include <filesystem>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>
#include <vector>

#include "lumeris/config.h"
#include "platform/log.h"

namespace lumeris {
namespace {

std::once_flag configuration_once;
bool configuration_loaded = false;

std::filesystem::path ConfigurationFile() {
  if (const char* path = getenv("LUMERIS_FONTCONFIG_FILE"); path != nullptr && *path != '\0')
    return path;
  return config::kFontConfigFileDefault;
}

void LoadConfiguration() {
  const std::filesystem::path file = ConfigurationFile();
  FcConfig* config = FcInitLoadConfig();
  if (config == nullptr) {
    Log("fontconfig: cannot load the default configuration");
    return;
  }
  if (FcConfigParseAndLoad(config, reinterpret_cast<const FcChar8*>(file.c_str()), FcTrue) !=
      FcTrue) {
    Log("fontconfig: cannot load " + file.string() +
        "; the colour emoji font name stays unresolved");
    FcConfigDestroy(config);
    return;
  }
  if (FcConfigBuildFonts(config) != FcTrue || FcConfigSetCurrent(config) != FcTrue) {
    Log("fontconfig: cannot build the font list with " + file.string());
    FcConfigDestroy(config);
    return;
  }
  FcConfigDestroy(config);  // the current configuration keeps its own reference
  configuration_loaded = true;
}

// Whether every code point of `text` passes `has_glyph`, default-ignorable ones passing anyway.
template <typename HasGlyph>
bool CoversEveryCodePoint(const icu::UnicodeString& text, HasGlyph&& has_glyph) {
  const int32_t length = text.length();
  for (int32_t i = 0; i < length;) {
    UChar32 c;
    U16_NEXT(text.getBuffer(), i, length, c);
    if (U_IS_SURROGATE(c)) return false;
    if (!has_glyph(c) && !u_hasBinaryProperty(c, UCHAR_DEFAULT_IGNORABLE_CODE_POINT)) return false;
  }
  return true;
}

using AnswerCache = std::unordered_map<std::u16string, bool>;

std::u16string CacheKey(const icu::UnicodeString& text) {
  return std::u16string(text.getBuffer(), static_cast<std::size_t>(text.length()));
}

// One family's best match, opened with FreeType when it is a colour font. FreeType faces are not
// thread-safe, so the face and the answer cache share one mutex.
class ColorFont {
 public:
  explicit ColorFont(std::string_view family) {
    if (FT_Init_FreeType(&library_) != 0) {
      library_ = nullptr;
      Log("freetype: cannot initialise the library");
      return;
    }
    FcPattern* pattern = FcPatternCreate();
    FcPatternAddString(pattern, FC_FAMILY,
                       reinterpret_cast<const FcChar8*>(std::string(family).c_str()));
    FcConfigSubstitute(nullptr, pattern, FcMatchPattern);
    FcDefaultSubstitute(pattern);
    FcResult result = FcResultNoMatch;
    FcPattern* match = FcFontMatch(nullptr, pattern, &result);
    FcPatternDestroy(pattern);
    if (match == nullptr) return;
    FcBool color = FcFalse;
    FcChar8* file = nullptr;
    int index = 0;
    if (FcPatternGetBool(match, FC_COLOR, 0, &color) == FcResultMatch && color &&
        FcPatternGetString(match, FC_FILE, 0, &file) == FcResultMatch) {
      FcPatternGetInteger(match, FC_INDEX, 0, &index);
      if (FT_New_Face(library_, reinterpret_cast<const char*>(file), index, &face_) != 0) {
        face_ = nullptr;
        Log(std::string("freetype: cannot open ") + reinterpret_cast<const char*>(file));
      }
    }
    FcPatternDestroy(match);
  }
  ~ColorFont() {
    if (face_ != nullptr) FT_Done_Face(face_);
    if (library_ != nullptr) FT_Done_FreeType(library_);
  }
  ColorFont(const ColorFont&) = delete;
  ColorFont& operator=(const ColorFont&) = delete;

  // Not cached: a character-map lookup per code point costs less than a cache lookup would,
  // and the search asks about every row of the character database.
  bool Draws(const icu::UnicodeString& text) {
    std::lock_guard lock(mutex_);
    if (face_ == nullptr) return false;
    return CoversEveryCodePoint(
        text, [&](UChar32 c) { return FT_Get_Char_Index(face_, static_cast<FT_ULong>(c)) != 0; });
  }

 private:
  FT_Library library_ = nullptr;
  FT_Face face_ = nullptr;
  std::mutex mutex_;
};

// The default sans family's sorted fallback list, untrimmed, so that a font whose characters
// earlier fonts already cover still counts when it alone covers a whole string.
class DefaultFallbackList {
 public:
  DefaultFallbackList() {
    FcPattern* pattern = FcPatternCreate();
    FcPatternAddString(pattern, FC_FAMILY, reinterpret_cast<const FcChar8*>("sans-serif"));
    FcConfigSubstitute(nullptr, pattern, FcMatchPattern);
    FcDefaultSubstitute(pattern);
    FcResult result = FcResultNoMatch;
    fonts_ = FcFontSort(nullptr, pattern, FcFalse, nullptr, &result);
    FcPatternDestroy(pattern);
    if (fonts_ == nullptr) return;
    for (int i = 0; i < fonts_->nfont; ++i) {
      FcCharSet* charset = nullptr;
      if (FcPatternGetCharSet(fonts_->fonts[i], FC_CHARSET, 0, &charset) == FcResultMatch) {
        charsets_.push_back(charset);
      }
    }
  }
  ~DefaultFallbackList() {
    if (fonts_ != nullptr) FcFontSetSortDestroy(fonts_);
  }
  DefaultFallbackList(const DefaultFallbackList&) = delete;
  DefaultFallbackList& operator=(const DefaultFallbackList&) = delete;

  bool Draws(const icu::UnicodeString& text) {
    {
      std::lock_guard lock(mutex_);
      if (auto it = answers_.find(CacheKey(text)); it != answers_.end()) return it->second;
    }
    // The character sets are read only, so the walk itself needs no lock.
    bool drawn = false;
    for (FcCharSet* charset : charsets_) {
      if (CoversEveryCodePoint(text, [&](UChar32 c) {
            return FcCharSetHasChar(charset, static_cast<FcChar32>(c)) == FcTrue;
          })) {
        drawn = true;
        break;
      }
    }
    std::lock_guard lock(mutex_);
    answers_.try_emplace(CacheKey(text), drawn);
    return drawn;
  }

 private:
  FcFontSet* fonts_ = nullptr;
  std::vector<FcCharSet*> charsets_;  // borrowed from fonts_
  std::mutex mutex_;
  AnswerCache answers_;
};

}  // namespace

bool LoadLumerisFontConfiguration() {
  std::call_once(configuration_once, LoadConfiguration);
  return configuration_loaded;
}

bool ColorFontDrawsString(std::string_view family, const icu::UnicodeString& text) {
  LoadLumerisFontConfiguration();
  // One entry per family asked for; never released, like the configuration itself.
  static std::mutex fonts_mutex;
  static auto* const fonts = new std::map<std::string, std::unique_ptr<ColorFont>, std::less<>>();
  ColorFont* font = nullptr;
  {
    std::lock_guard lock(fonts_mutex);
    auto it = fonts->find(family);
    if (it == fonts->end())
      it = fonts->emplace(std::string(family), std::make_unique<ColorFont>(family)).first;
    font = it->second.get();
  }
  return font->Draws(text);
}

bool DefaultLikeFontDrawsString(const icu::UnicodeString& text) {
  LoadLumerisFontConfiguration();
  static DefaultFallbackList* const list = new DefaultFallbackList();
  return list->Draws(text);
}

}  // namespace lumeris
