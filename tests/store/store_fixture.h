// Helpers for the user data store's tests: entity IDs as the panel writes them, preference files
// seeded and read back directly, and a fixture with an isolated user environment and a counting
// notification sink. Not thread-safe apart from the post counter.
#pragma once

#include <gtest/gtest.h>

#include <atomic>
#include <filesystem>
#include <fstream>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/preferences_paths.h"
#include "platform/property_list_io.h"
#include "store/change_notification.h"
#include "support/scoped_env.h"

namespace lumeris::testing {

using StringVector = std::vector<std::string>;

inline std::string EmojiID(std::string_view character) {
  return "com.vantorel.lmk:{\"char\":\"" + std::string(character) + "\",\"font\":\"VantorelColorEmoji\"}";
}
inline std::string PlainID(std::string_view character) {
  return "com.vantorel.lmk:{\"char\":\"" + std::string(character) + "\"}";
}

inline constexpr char kThumbsUp[] = "\xF0\x9F\x91\x8D";                     // U+1F44D
inline constexpr char kThumbsUpMedium[] = "\xF0\x9F\x91\x8D\xF0\x9F\x8F\xBD";  // + U+1F3FD
inline constexpr char kThumbsUpDark[] = "\xF0\x9F\x91\x8D\xF0\x9F\x8F\xBF";    // + U+1F3FF
inline constexpr char kHorseRacing[] = "\xF0\x9F\x8F\x87";                  // U+1F3C7
inline constexpr char kHorseRacingLight[] = "\xF0\x9F\x8F\x87\xF0\x9F\x8F\xBB";
inline constexpr char kGrinning[] = "\xF0\x9F\x98\x80";  // U+1F600, takes no skin tone

// The string entries of a list; std::nullopt when `value` is absent or not a list.
inline std::optional<StringVector> StringsOf(const std::optional<plist::Value>& value) {
  if (!value || !value->AsArray()) return std::nullopt;
  StringVector strings;
  for (const plist::Value& entry : *value->AsArray()) {
    if (const std::string* text = entry.AsString()) strings.push_back(*text);
  }
  return strings;
}
inline std::optional<StringVector> StringsOf(const std::optional<plist::Array>& array) {
  return array ? StringsOf(std::optional<plist::Value>(*array)) : std::nullopt;
}

inline std::filesystem::path DomainFile(std::string_view domain) {
  return *PreferencesFilePath(domain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
}

// Replaces the file of `domain` by renaming a new file into place, so a store that has read the
// old one sees the change.
inline void SeedDomain(std::string_view domain, const plist::Dictionary& contents) {
  const std::filesystem::path path = DomainFile(domain);
  std::filesystem::create_directories(path.parent_path());
  std::ofstream(path.string() + ".seed") << plist::SerializeXmlPropertyList(plist::Value(contents));
  std::filesystem::rename(path.string() + ".seed", path);
}
inline void SeedStore(const plist::Dictionary& contents) { SeedDomain("com.vantorel.Lumeris", contents); }

// The file of `domain` as it is on disk (empty when missing or unreadable).
inline plist::Dictionary StoredDomain(std::string_view domain = "com.vantorel.Lumeris") {
  std::optional<plist::Value> file = plist::ReadPropertyListFile(DomainFile(domain));
  return file && file->AsDictionary() ? *file->AsDictionary() : plist::Dictionary{};
}
inline std::optional<plist::Value> StoredValue(std::string_view key) {
  plist::Dictionary domain = StoredDomain();
  auto found = domain.find(key);
  return found == domain.end() ? std::nullopt : std::optional<plist::Value>(found->second);
}
inline std::optional<StringVector> StoredList(std::string_view key) { return StringsOf(StoredValue(key)); }

class StoreTest : public ::testing::Test {
 protected:
  StoreTest() : sink_([this] { ++posts_; }) {}
  int posts() const { return posts_.load(); }
  void resetPosts() { posts_ = 0; }

 private:
  IsolatedUserEnvironment environment_;
  std::atomic<int> posts_{0};
  ScopedChangeNotificationSink sink_;
};

}  // namespace lumeris::testing
