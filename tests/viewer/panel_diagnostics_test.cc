#include <chrono>
#include <fstream>
#include <regex>
#include <string>

#include <gtest/gtest.h>

#include "platform/log.h"
#include "support/temp_dir.h"
#include "viewer/frame_rate_meter.h"
#include "viewer/notification_names.h"
#include "viewer/vistrel_environment.h"

namespace lumeris {
namespace {

TEST(FrameRateMeterTest, LogsFramesAndTimeSinceItWasMade) {
  SetLogProgramName("panel");
  ::testing::internal::CaptureStderr();
  auto meter = MeasureFrameRate("grid scroll");
  for (int i = 0; i < 3; ++i) AdvanceFrameCount();
  // Let some time pass, so the printed seconds carry enough digits to check the rate.
  const auto start = std::chrono::steady_clock::now();
  while (std::chrono::steady_clock::now() - start < std::chrono::milliseconds(20)) {
  }
  meter();
  AdvanceFrameCount();
  meter();
  const std::string log = ::testing::internal::GetCapturedStderr();

  const std::regex line(R"(panel: grid scroll: updates = (\d+) over (\d+\.\d{6}) second at (\d+\.\d{3})fps\n)");
  auto it = std::sregex_iterator(log.begin(), log.end(), line);
  std::vector<std::smatch> lines(it, std::sregex_iterator());
  ASSERT_EQ(lines.size(), 2u) << log;
  EXPECT_EQ(lines[0][0].length() + lines[1][0].length(), log.size()) << log;
  double previous_seconds = 0;
  for (size_t i = 0; i < 2; ++i) {
    const double updates = std::stod(lines[i][1]);
    const double seconds = std::stod(lines[i][2]);
    EXPECT_EQ(updates, i == 0 ? 3 : 4);  // both from the meter's creation
    EXPECT_GE(seconds, 0.02);
    EXPECT_GE(seconds, previous_seconds);
    EXPECT_NEAR(std::stod(lines[i][3]), updates / seconds, 0.001 * updates / seconds + 0.001);
    previous_seconds = seconds;
  }
}

TEST(PanelDiagnosticsTest, DebugLogWritesNothingAndTheSwitchDefaultsToZero) {
  ::testing::internal::CaptureStderr();
  DebugNSLog("%s %d", "ignored", 1);
  EXPECT_EQ(::testing::internal::GetCapturedStderr(), "");
  EXPECT_EQ(DefaultSwitchForVistrelButton(), 0);
}

TEST(PanelNotificationsTest, EachNameIsItsOwnValue) {
  const std::pair<std::string, std::string> kNames[] = {
      {LMKVistrelWindowWillOpen, "LMKVistrelWindowWillOpen"},
      {LMKVistrelWindowDidOpen, "LMKVistrelWindowDidOpen"},
      {LMKNavigationFocusMoved, "LMKNavigationFocusMoved"},
      {LMKNavigationCharacterSelectionMoved, "LMKNavigationCharacterSelectionMoved"},
      {LMKNavigationCategorySelectionMoved, "LMKNavigationCategorySelectionMoved"},
      {LMKNavigationSelectionConfirmed, "LMKNavigationSelectionConfirmed"},
      {LMKNavigationSelectionCanceled, "LMKNavigationSelectionCanceled"},
      {LMKLocaleCountryInfoChanged, "LMKLocaleCountryInfoChanged"},
  };
  for (const auto& [constant, name] : kNames) EXPECT_EQ(constant, name);
}

void WriteInfo(const std::filesystem::path& bundle, const std::string& identifier) {
  std::filesystem::create_directories(bundle / "Contents" / "MacOS");
  std::ofstream(bundle / "Contents" / "Info.plist")
      << "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\"><dict>"
      << "<key>CFBundleIdentifier</key><string>" << identifier << "</string></dict></plist>\n";
}

TEST(VistrelEnvironmentTest, TheProgramsBundleIsTheNearestAppFolderAroundIt) {
  testing::ScopedTempDir dir;
  const auto root = dir.path();
  WriteInfo(root / "Sorvendi.app", "com.vantorel.SorvendiIM");
  WriteInfo(root / "Outer.app", "com.example.Outer");
  WriteInfo(root / "Outer.app/Contents/PlugIns/Inner.app", "com.example.Inner");
  std::filesystem::create_directories(root / "Bare.app/Contents/MacOS");
  const struct {
    std::filesystem::path executable;
    std::optional<std::string> identifier;
  } kCases[] = {
      {root / "Sorvendi.app/Contents/MacOS/sorvendi", "com.vantorel.SorvendiIM"},
      {root / "Outer.app/Contents/PlugIns/Inner.app/Contents/MacOS/inner", "com.example.Inner"},
      {root / "Outer.app/Contents/MacOS/outer", "com.example.Outer"},
      {root / "Bare.app/Contents/MacOS/bare", std::nullopt},  // no Info.plist, no identifier
      {root / "bin/tool", std::nullopt},                      // no bundle at all
  };
  for (const auto& c : kCases) EXPECT_EQ(BundleIdentifierOfExecutable(c.executable), c.identifier) << c.executable;
  // This test program lives in no bundle.
  EXPECT_FALSE(IsWorkingInVistrel());
}

}  // namespace
}  // namespace lumeris
