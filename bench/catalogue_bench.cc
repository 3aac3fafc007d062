// The category catalogue over the bundles the build wrote: one "read_categorydata" request for
// every category of the "Categories" plist (the emoji category among them), and the parts it is
// made of.
//
//   RoundTrip          the request through the real service, reply decoded (p50_us, p90_us)
//   InProcess          CreateXPCCategoryDataArray() alone
//   OpenBundles        opening the application and framework bundles (Info.plist, .lproj list)
//   Localization       choosing the preferred localization with ICU
//   ReadPlists         locating and parsing "Categories", every "Category-<name>" and "Category-Emoji"
//   ReadIcons          locating and reading every icon file (categories and emoji sub-categories)
//   Titles             every title lookup, in the catalogue's order (the default table reloads each time)
//   EncodeReply        MessagePack encoding of the reply frame
//
// Every request rereads every file, so the figures are file reading and property-list parsing;
// the page cache is warm after the first iteration.
#include <benchmark/benchmark.h>
#include <signal.h>
#include <spawn.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "categories/category_catalogue.h"
#include "categories/localization_lookup.h"
#include "categories/system_bundles.h"
#include "client/service_client.h"
#include "platform/bundle_localization.h"
#include "platform/preferred_languages.h"
#include "platform/property_list_io.h"
#include "platform/system_root.h"
#include "service/socket_path.h"
#include "service/wire.h"
#include "bench_service.h"


namespace lumeris {
namespace {

using Clock = std::chrono::steady_clock;

// The bundles of the build (unless LUMERIS_SYSTEM_ROOT says otherwise), English, and every
// category name the "Categories" plist offers.
struct Setup {
  Setup() {
    setenv("LUMERIS_SYSTEM_ROOT", LUMERIS_BENCH_SYSTEM_ROOT, 0);
    setenv("LANG", "en_US.UTF-8", 1);
    unsetenv("LANGUAGE");
    if (const std::optional<Bundle> app = OpenApplicationBundle()) {
      for (const CategoryGroup& group : ReadAvailableCategories(*app, PreferredLocalizationOfBundle(&*app))) {
        names.insert(names.end(), group.categories.begin(), group.categories.end());
      }
    }
    if (std::find(names.begin(), names.end(), kEmojiCategoryName) == names.end()) {
      names.emplace_back(kEmojiCategoryName);
    }
  }
  std::vector<std::string> names;
};

const Setup& GetSetup() {
  static const Setup setup;
  return setup;
}

void BM_RoundTrip(benchmark::State& state) {
  GetSetup();  // the root and language reach the service only when set before it starts
  ServiceClient* client = BenchService::Get().client();
  if (client == nullptr) return state.SkipWithError("no service");
  MessageValue names = MessageValue::MakeArray();
  for (const std::string& name : GetSetup().names) names.Append(MessageValue::String(name));
  MessageValue request = MessageValue::MakeDictionary();
  request.Set("command", MessageValue::String("read_categorydata"));
  request.Set("categories", std::move(names));
  std::size_t reply_bytes = 0;
  TimeIterations(state, [&] {
    std::optional<MessageValue> reply = client->Request(request, std::chrono::seconds(30));
    const MessageValue* result = reply ? reply->Find("result") : nullptr;
    if (result == nullptr || result->AsArray()->size() != GetSetup().names.size()) return false;
    reply_bytes = EncodeMessageValue(*reply).size();
    return true;
  });
  state.counters["categories"] = static_cast<double>(GetSetup().names.size());
  state.counters["reply_kib"] = static_cast<double>(reply_bytes) / 1024;
}
BENCHMARK(BM_RoundTrip)->UseManualTime()->Unit(benchmark::kMicrosecond);

void BM_InProcess(benchmark::State& state) {
  TimeIterations(state, [&] {
    benchmark::DoNotOptimize(CreateXPCCategoryDataArray(GetSetup().names));
    return true;
  });
}
BENCHMARK(BM_InProcess)->UseManualTime()->Unit(benchmark::kMicrosecond);

void BM_OpenBundles(benchmark::State& state) {
  for (auto _ : state) {
    benchmark::DoNotOptimize(OpenApplicationBundle());
    benchmark::DoNotOptimize(Bundle::Open(SystemPath(kFrameworkBundlePath)));
  }
}
BENCHMARK(BM_OpenBundles)->Unit(benchmark::kMicrosecond);

void BM_Localization(benchmark::State& state) {
  const std::optional<Bundle> app = OpenApplicationBundle();
  for (auto _ : state) benchmark::DoNotOptimize(PreferredLocalizationOfBundle(&*app));
}
BENCHMARK(BM_Localization)->Unit(benchmark::kMicrosecond);

void BM_ReadPlists(benchmark::State& state) {
  const std::optional<Bundle> app = OpenApplicationBundle();
  const std::string loc = PreferredLocalizationOfBundle(&*app);
  for (auto _ : state) {
    benchmark::DoNotOptimize(plist::ReadPropertyListFile(*app->PathForResource("Categories", "plist", {}, loc)));
    benchmark::DoNotOptimize(plist::ReadPropertyListFile(*app->PathForResource("Category-Emoji", "plist")));
    for (const std::string& name : GetSetup().names) {
      if (auto path = app->PathForResource("Category-" + name, "plist", {}, loc)) {
        benchmark::DoNotOptimize(plist::ReadPropertyListFile(*path));
      }
    }
  }
}
BENCHMARK(BM_ReadPlists)->Unit(benchmark::kMicrosecond);

// The "VTDataTitle" or "VTCategoryImage" strings of the emoji sub-categories, in order.
std::vector<std::string> EmojiSubcategoryField(const Bundle& app, const char* key) {
  std::vector<std::string> values;
  const auto emoji = plist::ReadPropertyListFile(*app.PathForResource("Category-Emoji", "plist"));
  for (const plist::Value& sub : *emoji->Find("EmojiDataArray")->AsArray()) values.push_back(*sub.Find(key)->AsString());
  return values;
}

std::vector<std::uint8_t> ReadBytes(const std::filesystem::path& path) {
  std::ifstream in(path, std::ios::binary);
  return std::vector<std::uint8_t>((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
}

void BM_ReadIcons(benchmark::State& state) {
  const std::optional<Bundle> app = OpenApplicationBundle();
  const std::optional<Bundle> framework = Bundle::Open(SystemPath(kFrameworkBundlePath));
  const std::vector<std::string> images = EmojiSubcategoryField(*app, "VTCategoryImage");
  std::size_t bytes = 0;
  for (auto _ : state) {
    bytes = 0;
    // As the catalogue does: each bundle's folders listed once per request, then each lookup.
    const std::vector<std::string> languages = PreferredLanguages();
    const Bundle::PlainResourceLookup app_lookup =
        app->ListPlainResources(PreferredLocalizationsFromArray(app->localizations(), languages));
    const Bundle::PlainResourceLookup framework_lookup =
        framework->ListPlainResources(PreferredLocalizationsFromArray(framework->localizations(), languages));
    for (const std::string& name : GetSetup().names) {
      auto path = app_lookup.PathForResource("CategoryImage-" + name, "tiff");
      if (!path) path = app_lookup.PathForResource("CategoryImage-" + name, "pdf");
      if (path) bytes += ReadBytes(*path).size();
    }
    for (const std::string& image : images) {
      auto path = framework_lookup.PathForResource(image, "tiff");
      if (!path) path = app_lookup.PathForResource(image, "tiff");
      if (!path) path = framework_lookup.PathForResource(image, "pdf");
      if (!path) path = app_lookup.PathForResource(image, "pdf");
      if (path) bytes += ReadBytes(*path).size();
    }
  }
  state.counters["icon_kib"] = static_cast<double>(bytes) / 1024;
}
BENCHMARK(BM_ReadIcons)->Unit(benchmark::kMicrosecond);

void BM_Titles(benchmark::State& state) {
  const std::optional<Bundle> app = OpenApplicationBundle();
  const std::string loc = PreferredLocalizationOfBundle(&*app);
  const std::vector<std::string> keys = EmojiSubcategoryField(*app, "VTDataTitle");
  for (auto _ : state) {
    for (const std::string& name : GetSetup().names) {
      if (name == kEmojiCategoryName) {
        for (const std::string& key : keys) {
          benchmark::DoNotOptimize(LocalizedStringForLanguage(key, &*app, loc, "Emoji_Category", key));
        }
      }
      benchmark::DoNotOptimize(LocalizedStringForLanguage("CategoryName-" + name, &*app, loc, std::nullopt, name));
    }
  }
}
BENCHMARK(BM_Titles)->Unit(benchmark::kMicrosecond);

void BM_EncodeReply(benchmark::State& state) {
  Frame frame{FrameKind::kReply, 1, MessageValue::MakeDictionary()};
  frame.body.Set("result", CreateXPCCategoryDataArray(GetSetup().names));
  for (auto _ : state) benchmark::DoNotOptimize(EncodeFrame(frame));
}
BENCHMARK(BM_EncodeReply)->Unit(benchmark::kMicrosecond);

}  // namespace
}  // namespace lumeris

BENCHMARK_MAIN();
