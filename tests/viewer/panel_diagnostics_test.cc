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
  // Let 20 ms pass, so that the printed seconds carry enough digits to check the rate.
  for (const auto start = std::chrono::steady_clock::now(); std::chrono::steady_clock::now() - start < std::chrono::milliseconds(20);) {
  }
  meter();
  AdvanceFrameCount();
  meter();
  const std::string log = ::testing::internal::GetCapturedStderr();
  const std::regex line(R"(panel: grid scroll: updates = (\d+) over (\d+\.\d{6}) second at (\d+\.\d{3})fps\n)");
  std::smatch m;
  std::string rest = log;
  for (const double updates : {3.0, 4.0}) {  // both calls count from the meter's creation
    ASSERT_TRUE(std::regex_search(rest, m, line, std::regex_constants::match_continuous)) << log;
    EXPECT_EQ(std::stod(m[1]), updates);
    const double seconds = std::stod(m[2]);
    EXPECT_GE(seconds, 0.02);
    EXPECT_NEAR(std::stod(m[3]), updates / seconds, 0.001 * updates / seconds + 0.001);
    rest = m.suffix();
  }
  EXPECT_EQ(rest, "");
}

TEST(PanelNotificationsTest, EachNameIsItsOwnValue) {
  const std::pair<std::string, std::string> kNames[] = {
      {LMKVistrelWindowWillOpen, "LMKVistrelWindowWillOpen"}, {LMKVistrelWindowDidOpen, "LMKVistrelWindowDidOpen"},
      {LMKNavigationFocusMoved, "LMKNavigationFocusMoved"}, {LMKLocaleCountryInfoChanged, "LMKLocaleCountryInfoChanged"},
      {LMKNavigationCharacterSelectionMoved, "LMKNavigationCharacterSelectionMoved"},
      {LMKNavigationCategorySelectionMoved, "LMKNavigationCategorySelectionMoved"},
      {LMKNavigationSelectionConfirmed, "LMKNavigationSelectionConfirmed"},
      {LMKNavigationSelectionCanceled, "LMKNavigationSelectionCanceled"},
  };
  for (const auto& [constant, name] : kNames) EXPECT_EQ(constant, name);
}

TEST(VistrelEnvironmentTest, TheProgramsBundleIsTheNearestAppFolderAroundIt) {
  testing::ScopedTempDir dir;
  const auto root = dir.path();
  for (const auto& [bundle, identifier] : {std::pair{root / "Sorvendi.app", "com.vantorel.SorvendiIM"},
                                           std::pair{root / "Sorvendi.app/Contents/PlugIns/Inner.app", "x.Inner"}}) {
    std::filesystem::create_directories(bundle / "Contents");
    std::ofstream(bundle / "Contents/Info.plist") << "<?xml version=\"1.0\"?><plist version=\"1.0\"><dict>"
                                                  << "<key>CFBundleIdentifier</key><string>" << identifier
                                                  << "</string></dict></plist>";
  }
  std::filesystem::create_directories(root / "Bare.app/Contents");
  EXPECT_EQ(BundleIdentifierOfExecutable(root / "Sorvendi.app/Contents/MacOS/sorvendi"), "com.vantorel.SorvendiIM");
  EXPECT_EQ(BundleIdentifierOfExecutable(root / "Sorvendi.app/Contents/PlugIns/Inner.app/Contents/MacOS/i"), "x.Inner");
  EXPECT_EQ(BundleIdentifierOfExecutable(root / "Bare.app/Contents/MacOS/bare"), std::nullopt);  // no Info.plist
  EXPECT_EQ(BundleIdentifierOfExecutable(root / "bin/tool"), std::nullopt);
  EXPECT_FALSE(IsWorkingInVistrel());  // this test program lives in no bundle
}

}  // namespace
}  // namespace lumeris
