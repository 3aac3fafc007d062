#include "categories/system_bundles.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "bundle/bundle_fixture.h"
#include "platform/system_root.h"
#include "support/scoped_env.h"
#include "support/temp_dir.h"

namespace lumeris {
namespace {

using testing::BundleWriter;
using testing::ScopedEnv;
using testing::ScopedTempDir;

class SystemBundlesTest : public ::testing::Test {
 protected:
  SystemBundlesTest() {
    env_.Set("LUMERIS_SYSTEM_ROOT", root_.path().string());
    testing::SetUserLanguages(env_, "de");
  }

  BundleWriter InstallFramework(const char* identifier) {
    BundleWriter framework = BundleWriter::Framework(SystemPath(kFrameworkBundlePath), identifier, "en");
    framework.WriteStringsTable("en", "Localizable", {{"Close", "Close"}, {"Done", "Done"}});
    framework.WriteStringsTable("de", "Localizable", {{"Close", "Schließen"}});
    return framework;
  }

  ScopedTempDir root_;
  ScopedEnv env_;
};

TEST_F(SystemBundlesTest, ApplicationBundleOpensUnderTheSystemRoot) {
  EXPECT_FALSE(OpenApplicationBundle());
  BundleWriter::Application(SystemPath(kApplicationBundlePath), "com.vantorel.SorvendiIM", "en");
  const auto app = OpenApplicationBundle();
  ASSERT_TRUE(app);
  EXPECT_EQ(app->identifier(), "com.vantorel.SorvendiIM");
  EXPECT_EQ(app->path(), root_.path() / "System/Library/Input Methods/Sorvendi.app");
}

// The framework bundle is process-wide, so its whole life is one test: absent, found, kept.
TEST_F(SystemBundlesTest, FrameworkBundleIsFoundOnceAndKept) {
  EXPECT_EQ(MyFrameworkBundle(), nullptr);
  EXPECT_EQ(MyFrameworkLocalizedString("Close"), "Close");

  InstallFramework("com.vantorel.Lumeris");
  const Bundle* framework = MyFrameworkBundle();
  ASSERT_NE(framework, nullptr);
  EXPECT_EQ(framework->identifier(), "com.vantorel.Lumeris");
  EXPECT_EQ(MyFrameworkLocalizedString("Close"), "Schließen");
  EXPECT_EQ(MyFrameworkLocalizedString("Done"), "Done");
  EXPECT_EQ(MyFrameworkLocalizedString("Missing"), "Missing");

  ScopedTempDir elsewhere;
  env_.Set("LUMERIS_SYSTEM_ROOT", elsewhere.path().string());
  EXPECT_EQ(MyFrameworkBundle(), framework);
}

}  // namespace
}  // namespace lumeris
