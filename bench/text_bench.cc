// Costs of the text utilities and entity IDs, with the heap allocations each call makes
// ("allocs" counter, per call): the scalar conversions, the emoji lookups and the replacement
// key must not allocate for ordinary strings.
#include <benchmark/benchmark.h>

#include <atomic>
#include <cstdlib>
#include <optional>

#include "entity/entity_id.h"
#include "entity/recent_equality.h"
#include "text/code_string.h"
#include "text/emoji.h"
#include "text/replacement_dictionary.h"
#include "text/scalar.h"

// Every heap allocation of the process, ICU's and the C++ library's included, goes through malloc,
// calloc or realloc; these replacements count them and hand over to glibc.
extern "C" void* __libc_malloc(std::size_t size);
extern "C" void* __libc_calloc(std::size_t count, std::size_t size);
extern "C" void* __libc_realloc(void* p, std::size_t size);

namespace {

std::atomic<long> allocations{0};

}  // namespace

extern "C" void* malloc(std::size_t size) {
  allocations.fetch_add(1, std::memory_order_relaxed);
  return __libc_malloc(size);
}
extern "C" void* calloc(std::size_t count, std::size_t size) {
  allocations.fetch_add(1, std::memory_order_relaxed);
  return __libc_calloc(count, size);
}
extern "C" void* realloc(void* p, std::size_t size) {
  allocations.fetch_add(1, std::memory_order_relaxed);
  return __libc_realloc(p, size);
}

namespace lumeris {
namespace {

icu::UnicodeString ThumbsUpMedium() {
  return icu::UnicodeString(static_cast<UChar32>(0x1F44D)).append(static_cast<UChar32>(0x1F3FD));
}

// Runs `call` for every iteration and reports the allocations per call.
template <typename Call>
void Measure(benchmark::State& state, Call call) {
  const long before = allocations.load();
  for (auto _ : state) call();
  state.counters["allocs"] = benchmark::Counter(
      static_cast<double>(allocations.load() - before), benchmark::Counter::kAvgIterations);
}

void BM_StringToScalerValues(benchmark::State& state) {
  const icu::UnicodeString text = ThumbsUpMedium();
  uint32_t scalars[4];
  Measure(state, [&] { benchmark::DoNotOptimize(StringToScalerValues(text, scalars)); });
}
BENCHMARK(BM_StringToScalerValues);

void BM_ContainedDiversityUnicode(benchmark::State& state) {
  const icu::UnicodeString text = ThumbsUpMedium();
  Measure(state, [&] { benchmark::DoNotOptimize(ContainedDiversityUnicode(text)); });
}
BENCHMARK(BM_ContainedDiversityUnicode);

void BM_CompareEmojiStrings(benchmark::State& state) {
  const icu::UnicodeString a = ThumbsUpMedium();
  const icu::UnicodeString b(static_cast<UChar32>(0x1F44D));
  Measure(state, [&] { benchmark::DoNotOptimize(CompareEmojiStrings(a, b, true, false)); });
}
BENCHMARK(BM_CompareEmojiStrings);

void BM_ReplacementDictionaryNormalizedKeyString(benchmark::State& state) {
  const icu::UnicodeString text = ThumbsUpMedium();
  bool had_skin_tone = false;
  Measure(state, [&] {
    benchmark::DoNotOptimize(ReplacementDictionaryNormalizedKeyString(text, &had_skin_tone));
  });
}
BENCHMARK(BM_ReplacementDictionaryNormalizedKeyString);

void BM_StringFromUnicodeCodeString(benchmark::State& state) {
  const icu::UnicodeString code(u"U+D83D U+DC4D");
  Measure(state, [&] { benchmark::DoNotOptimize(StringFromUnicodeCodeString(code)); });
}
BENCHMARK(BM_StringFromUnicodeCodeString);

void BM_EntityIDFromCharacterInfo(benchmark::State& state) {
  CharacterInfo info;
  info.character = ThumbsUpMedium();
  info.font = icu::UnicodeString(kEmojiFontName);
  Measure(state, [&] { benchmark::DoNotOptimize(EntityIDFromCharacterInfo(info)); });
}
BENCHMARK(BM_EntityIDFromCharacterInfo);

void BM_CharacterInfoFromEntityIDCurrent(benchmark::State& state) {
  CharacterInfo info;
  info.character = ThumbsUpMedium();
  info.font = icu::UnicodeString(kEmojiFontName);
  const icu::UnicodeString id = EntityIDFromCharacterInfo(info);
  std::optional<icu::UnicodeString> character;
  Measure(state, [&] { benchmark::DoNotOptimize(CharacterInfoFromEntityID(id, nullptr, &character)); });
}
BENCHMARK(BM_CharacterInfoFromEntityIDCurrent);

void BM_CharacterInfoFromEntityIDOld(benchmark::State& state) {
  const icu::UnicodeString id =
      EntityIDFromOldCharacterInfo(ThumbsUpMedium(), icu::UnicodeString(kEmojiFontName), 1234);
  std::optional<icu::UnicodeString> character;
  Measure(state, [&] { benchmark::DoNotOptimize(CharacterInfoFromEntityID(id, nullptr, &character)); });
}
BENCHMARK(BM_CharacterInfoFromEntityIDOld);

void BM_IsEqualRecentEntityID(benchmark::State& state) {
  CharacterInfo info;
  info.character = ThumbsUpMedium();
  info.font = icu::UnicodeString(kEmojiFontName);
  const icu::UnicodeString a = EntityIDFromCharacterInfo(info);
  info.character = icu::UnicodeString(static_cast<UChar32>(0x1F44D));
  const icu::UnicodeString b = EntityIDFromCharacterInfo(info);
  Measure(state, [&] { benchmark::DoNotOptimize(IsEqualRecentEntityID(a, b)); });
}
BENCHMARK(BM_IsEqualRecentEntityID);

}  // namespace
}  // namespace lumeris

BENCHMARK_MAIN();
