// search_relevance: how often the real search puts the character a person means among the first
// five results. For each word of a fixed list it asks the running service (started on demand, in
// a scratch runtime directory) for five results and counts a hit when any of the characters
// expected for that word is among them. The row order of CharacterDB is the only ranking search
// has, so this is the measure by which the resource builder's emoji order is tuned.
//
//   search_relevance [WORD=EXPECTED...]    (EXPECTED: characters without separators, any one counts)
#include <stdlib.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#include <unicode/brkiter.h>
#include <unicode/unistr.h>

#include "client/service_client.h"
#include "stop_service.h"

namespace lumeris {
namespace {

using namespace std::chrono_literals;

struct Expectation {
  std::string text;
  std::vector<std::string> characters;  // any one of them among the first five is a hit
};

const std::vector<Expectation> kDefaultList = {
    {"heart", {"❤️"}},       {"fire", {"🔥"}},         {"star", {"⭐", "🌟"}},  {"cat", {"🐈", "🐱"}},
    {"dog", {"🐕", "🐶"}},    {"sun", {"☀️", "🌞"}},     {"thumbs", {"👍"}},     {"check", {"✅", "✔️", "☑️"}},
    {"laugh", {"😂", "🤣"}},  {"cry", {"😢", "😭"}},     {"party", {"🥳", "🎉"}}, {"rocket", {"🚀"}},
    {"pray", {"🙏"}},        {"clap", {"👏"}},          {"eyes", {"👀"}},       {"coffee", {"☕"}},
    {"pizza", {"🍕"}},       {"sparkles", {"✨"}},      {"skull", {"💀"}},      {"muscle", {"💪"}},
};

// "sun=☀️🌞" -> {"sun", {"☀️", "🌞"}}, split into grapheme clusters.
Expectation ParseExpectation(const std::string& argument) {
  Expectation expectation;
  size_t equals = argument.find('=');
  expectation.text = argument.substr(0, equals);
  if (equals == std::string::npos) return expectation;
  icu::UnicodeString characters = icu::UnicodeString::fromUTF8(argument.substr(equals + 1));
  UErrorCode status = U_ZERO_ERROR;
  std::unique_ptr<icu::BreakIterator> clusters(icu::BreakIterator::createCharacterInstance(icu::Locale::getRoot(), status));
  if (U_FAILURE(status)) return expectation;
  clusters->setText(characters);
  for (int32_t start = clusters->first(), end = clusters->next(); end != icu::BreakIterator::DONE;
       start = end, end = clusters->next()) {
    std::string utf8;
    expectation.characters.push_back(characters.tempSubStringBetween(start, end).toUTF8String(utf8));
  }
  return expectation;
}

// The first `limit` results, or std::nullopt when the service does not answer.
std::optional<std::vector<std::string>> FirstResults(ServiceClient& client, const std::string& text,
                                                     std::uint64_t limit) {
  MessageValue request = MessageValue::MakeDictionary();
  request.Set("command", MessageValue::String("search_matched_chars"));
  request.Set("string", MessageValue::String(text));
  request.Set("limit", MessageValue::Uint64(limit));
  request.Set("transactionID", MessageValue::Uint64(1));
  std::vector<std::string> results;
  std::optional<MessageValue> reply = client.Request(request, 10s);
  if (!reply) return std::nullopt;
  const MessageValue* result = reply->Find("result");
  const MessageValue::Array* items = result ? result->AsArray() : nullptr;
  if (items == nullptr) return results;
  for (const MessageValue& item : *items) {
    if (item.AsString() && results.size() < limit) results.push_back(*item.AsString());
  }
  return results;
}

int Main(int argc, char** argv) {
  std::vector<Expectation> list;
  for (int i = 1; i < argc; ++i) list.push_back(ParseExpectation(argv[i]));
  if (list.empty()) list = kDefaultList;

  char runtime[] = "/tmp/lumeris-relevance-XXXXXX";
  if (mkdtemp(runtime) == nullptr) return 1;
  setenv("XDG_RUNTIME_DIR", runtime, 1);
  if (getenv("LUMERIS_FILESERVICE") == nullptr) setenv("LUMERIS_FILESERVICE", LUMERIS_BENCH_FILESERVICE, 1);
  setenv("LUMERIS_SYSTEM_ROOT", LUMERIS_BENCH_SYSTEM_ROOT, 0);
  setenv("LUMERIS_FONTCONFIG_FILE", LUMERIS_BENCH_FONTCONFIG_FILE, 0);

  std::string error;
  std::unique_ptr<ServiceClient> client = ServiceClient::Connect({}, &error);
  if (!client) {
    std::fprintf(stderr, "search_relevance: %s\n", error.c_str());
    return 1;
  }
  int hits = 0;
  for (const Expectation& expectation : list) {
    std::optional<std::vector<std::string>> first = FirstResults(*client, expectation.text, 5);
    if (!first) {
      std::fprintf(stderr, "search_relevance: no reply to a search for \"%s\"\n", expectation.text.c_str());
      break;
    }
    bool hit = false;
    std::string shown;
    for (const std::string& character : *first) {
      for (const std::string& expected : expectation.characters) hit |= character == expected;
      shown += character + " ";
    }
    hits += hit ? 1 : 0;
    std::printf("%-4s %-10s %s\n", hit ? "hit" : "miss", expectation.text.c_str(), shown.c_str());
  }
  std::printf("%d of %zu words show an expected character among the first five results\n", hits, list.size());
  client.reset();
  StopService();
  std::filesystem::remove_all(runtime);
  return 0;
}

}  // namespace
}  // namespace lumeris

int main(int argc, char** argv) { return lumeris::Main(argc, argv); }
