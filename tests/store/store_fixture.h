// A fixture for the user data store's unit tests: an isolated user environment whose preference
// files the test seeds and reads back directly, and a counting notification sink.
//
//   TEST_F(StoreTest, ...) {
//     seedStore({{"version", 1}, {"Recents:x", plist::Array{"a"}}});
//     AddRecentID("b", "x");
//     EXPECT_EQ(storedList("Recents:x"), (std::vector<std::string>{"b", "a"}));
//     EXPECT_EQ(posts(), 1);
//   }
//
// Not thread-safe apart from the post counter: use from the test's main thread.
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
#include "platform/property_list.h"
#include "platform/property_list_io.h"
#include "store/change_notification.h"
#include "store/store_keys.h"
#include "support/scoped_env.h"

namespace lumeris::testing {

// Entity IDs as the panel writes them.
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
inline constexpr std::string_view kDefaultIdentifier = kDefaultDataStorageIdentifier;

// The string entries of a stored list; std::nullopt when `value` is absent or not a list.
inline std::optional<std::vector<std::string>> StringsOf(const std::optional<plist::Value>& value) {
  if (!value || !value->AsArray()) return std::nullopt;
  std::vector<std::string> strings;
  for (const plist::Value& entry : *value->AsArray()) {
    if (const std::string* text = entry.AsString()) strings.push_back(*text);
  }
  return strings;
}
inline plist::Array IDArray(const std::vector<std::string>& strings) {
  return plist::Array(strings.begin(), strings.end());
}

// The file of `domain` for the current user, any host.
inline std::filesystem::path DomainFile(std::string_view domain) {
  return *PreferencesFilePath(domain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
}

// Writes `contents` as the whole file of `domain`, as a new file renamed into place so that a
// store that has read the old one sees the change.
inline void SeedDomain(std::string_view domain, const plist::Dictionary& contents) {
  const std::filesystem::path path = DomainFile(domain);
  std::filesystem::create_directories(path.parent_path());
  const std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(plist::Value(contents));
  std::filesystem::path temporary = path;
  temporary += ".seed";
  std::ofstream(temporary, std::ios::binary)
      .write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
  std::filesystem::rename(temporary, path);
}

// The file of `domain` as it is on disk (empty when missing).
inline plist::Dictionary StoredDomain(std::string_view domain = kStoreDomain) {
  std::optional<plist::Value> file = plist::ReadPropertyListFile(DomainFile(domain));
  if (!file || !file->AsDictionary()) return {};
  return *file->AsDictionary();
}

inline std::optional<plist::Value> StoredValue(std::string_view key) {
  plist::Dictionary domain = StoredDomain();
  auto found = domain.find(key);
  if (found == domain.end()) return std::nullopt;
  return found->second;
}

// The string entries of the list stored under `key`; std::nullopt when none is stored.
inline std::optional<std::vector<std::string>> StoredList(std::string_view key) {
  return StringsOf(StoredValue(key));
}

class StoreTest : public ::testing::Test {
 protected:
  StoreTest() : sink_([this] { ++posts_; }) {}

  static void seedDomain(std::string_view domain, const plist::Dictionary& contents) {
    SeedDomain(domain, contents);
  }
  static void seedStore(const plist::Dictionary& contents) { SeedDomain(kStoreDomain, contents); }
  static plist::Dictionary storedDomain(std::string_view domain = kStoreDomain) { return StoredDomain(domain); }
  static std::optional<plist::Value> storedValue(std::string_view key) { return StoredValue(key); }
  static std::optional<std::vector<std::string>> storedList(std::string_view key) { return StoredList(key); }

  int posts() const { return posts_.load(); }
  void resetPosts() { posts_ = 0; }

 private:
  IsolatedUserEnvironment environment_;
  std::atomic<int> posts_{0};
  ScopedChangeNotificationSink sink_;
};

}  // namespace lumeris::testing
