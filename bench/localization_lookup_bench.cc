// Costs of the category data's localization lookup: a cached named table against the default
// table that reloads at every lookup, opening a bundle with many localizations (done at every
// catalogue request) and choosing its preferred localization with ICU.
#include <benchmark/benchmark.h>
#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <optional>
#include <string>
#include <vector>

#include "categories/localization_lookup.h"
#include "platform/bundle.h"
#include "platform/property_list_io.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;

constexpr const char* kLocalizations[] = {
    "ar", "bg", "ca", "cs", "da", "de", "el", "en", "en-AU", "en-GB", "es", "es-419", "et", "fi", "fr",
    "fr-CA", "he", "hi", "hr", "hu", "id", "it", "ja", "kk", "ko", "lt", "lv", "ms", "nb", "nl", "pl",
    "pt", "pt-PT", "ro", "ru", "sk", "sl", "sr", "sr-Latn", "sv", "th", "tr", "uk", "vi", "zh-Hans", "zh-Hant"};

void WritePlist(const fs::path& file, const plist::Value& value) {
  const std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(value);
  std::ofstream(file, std::ios::binary).write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
}

// A bundle like the input-method application: ~50 localizations, two tables of 100 keys each.
class BenchBundle {
 public:
  BenchBundle() {
    std::string pattern = (fs::temp_directory_path() / "lumeris-bench-XXXXXX").string();
    root_ = mkdtemp(pattern.data());
    const fs::path contents = root_ / "Bench.app" / "Contents";
    fs::create_directories(contents / "Resources");
    WritePlist(contents / "Info.plist",
               plist::Dictionary{{"CFBundleIdentifier", "com.example.Bench"}, {"CFBundleDevelopmentRegion", "en"}});
    for (const char* loc : kLocalizations) {
      const fs::path folder = contents / "Resources" / (std::string(loc) + ".lproj");
      fs::create_directories(folder);
      for (const char* table : {"Localizable", "Emoji_Category"}) {
        plist::Dictionary strings;
        for (int i = 0; i < 100; ++i) strings.emplace("Key-" + std::to_string(i), std::string(loc) + " text " + std::to_string(i));
        WritePlist(folder / (std::string(table) + ".strings"), strings);
      }
    }
    setenv("LANGUAGE", "de_CH:fr", 1);
    bundle_ = Bundle::Open(path());
  }
  ~BenchBundle() { fs::remove_all(root_); }
  fs::path path() const { return root_ / "Bench.app"; }
  const Bundle& bundle() const { return *bundle_; }

 private:
  fs::path root_;
  std::optional<Bundle> bundle_;
};

const BenchBundle& Fixture() {
  static const BenchBundle* const fixture = new BenchBundle();
  return *fixture;
}

void BM_LookupNamedTableCached(benchmark::State& state) {
  StringsTableCache cache;
  const Bundle& bundle = Fixture().bundle();
  int i = 0;
  for (auto _ : state) {
    benchmark::DoNotOptimize(cache.Lookup("Key-" + std::to_string(i++ % 100), &bundle, "de", "Emoji_Category", "x"));
  }
}
BENCHMARK(BM_LookupNamedTableCached);

void BM_LookupDefaultTableReloads(benchmark::State& state) {
  StringsTableCache cache;
  const Bundle& bundle = Fixture().bundle();
  int i = 0;
  for (auto _ : state) {
    benchmark::DoNotOptimize(cache.Lookup("Key-" + std::to_string(i++ % 100), &bundle, "de", std::nullopt, "x"));
  }
}
BENCHMARK(BM_LookupDefaultTableReloads);

void BM_OpenBundle(benchmark::State& state) {
  const fs::path path = Fixture().path();
  for (auto _ : state) benchmark::DoNotOptimize(Bundle::Open(path));
}
BENCHMARK(BM_OpenBundle);

void BM_PreferredLocalizationOfBundle(benchmark::State& state) {
  const Bundle& bundle = Fixture().bundle();
  for (auto _ : state) benchmark::DoNotOptimize(PreferredLocalizationOfBundle(&bundle));
}
BENCHMARK(BM_PreferredLocalizationOfBundle);

}  // namespace
}  // namespace lumeris

BENCHMARK_MAIN();
