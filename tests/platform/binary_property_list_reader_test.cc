// The direct binary reader against libplist: wherever it answers, it must answer what libplist
// answers, on every property list of the built bundles and on damaged copies of them.
#include "platform/binary_property_list_reader.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>

#include "platform/property_list_io.h"

namespace lumeris::plist {
namespace {

namespace fs = std::filesystem;
using Bytes = std::vector<std::uint8_t>;

Bytes ReadBytes(const fs::path& path) {
  std::ifstream in(path, std::ios::binary);
  return Bytes(std::istreambuf_iterator<char>(in), {});
}

// Every binary property list of the built bundles, and one document with each type the reader
// covers, written by the project's own writer.
std::vector<Bytes> Seeds() {
  std::vector<Bytes> seeds;
  for (const auto& entry : fs::recursive_directory_iterator(LUMERIS_TEST_BUILD_SYSTEM_ROOT)) {
    const fs::path& path = entry.path();
    if (path.extension() == ".plist" || path.extension() == ".strings") seeds.push_back(ReadBytes(path));
  }
  Dictionary all{{"ascii", "Arrows"},
                 {"utf16", "Flèches ↔ 矢印 😀"},
                 {"integers", Array{0, 255, 256, 65536, std::int64_t{1} << 40, std::int64_t{-1}}},
                 {"reals", Array{0.5, -1e300}},
                 {"flags", Array{true, false}},
                 {"data", Data{0, 1, 2, 255}},
                 {"nested", Dictionary{{"a", Array{Dictionary{}, Array{}}}}}};
  seeds.push_back(SerializeBinaryPropertyList(Value(std::move(all))));
  return seeds;
}

TEST(BinaryPropertyListReaderTest, ReadsEveryBundleDocumentAsLibplistDoes) {
  const std::vector<Bytes> seeds = Seeds();
  ASSERT_GT(seeds.size(), 100u);
  for (const Bytes& seed : seeds) {
    const std::optional<Value> direct = ReadCommonBinaryPropertyList(seed);
    ASSERT_TRUE(direct.has_value()) << "a document of the bundles is outside the common subset";
    EXPECT_EQ(direct, ParsePropertyListWithLibplist(seed));
  }
}

// Damaged copies (bytes overwritten, trailer fields changed, cut short) either are refused by the
// direct reader, to be read by libplist, or read exactly as libplist reads them.
TEST(BinaryPropertyListReaderTest, DamagedDocumentsAreRefusedOrReadAsLibplistDoes) {
  std::vector<Bytes> seeds = Seeds();
  // The small ones: damage to a large document mostly lands in string bytes.
  std::erase_if(seeds, [](const Bytes& seed) { return seed.size() > 4096; });
  std::mt19937 random(20261123);
  int answered = 0;
  int refused = 0;
  for (int round = 0; round < 20000; ++round) {
    Bytes bytes = seeds[random() % seeds.size()];
    switch (random() % 3) {
      case 0:  // a few random bytes anywhere
        for (int i = 0, n = 1 + static_cast<int>(random() % 3); i < n; ++i)
          bytes[random() % bytes.size()] = static_cast<std::uint8_t>(random());
        break;
      case 1:  // one trailer byte: sizes, counts, root and table offset
        bytes[bytes.size() - 32 + 6 + random() % 26] = static_cast<std::uint8_t>(random());
        break;
      case 2:  // cut short
        bytes.resize(random() % bytes.size());
        break;
    }
    const std::optional<Value> direct = ReadCommonBinaryPropertyList(bytes);
    if (!direct) {
      ++refused;
      continue;
    }
    ++answered;
    ASSERT_EQ(direct, ParsePropertyListWithLibplist(bytes)) << "round " << round;
  }
  // Both paths must have been taken often for the comparison to mean something.
  EXPECT_GT(answered, 2000);
  EXPECT_GT(refused, 2000);
}

}  // namespace
}  // namespace lumeris::plist
