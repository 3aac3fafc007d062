#include <cairo.h>

#include <vector>

#include <gtest/gtest.h>

#include "support/pictures.h"
#include "viewer/point_conversion.h"
#include "viewer/window_capture.h"
#include "viewer/x_display.h"

namespace lumeris {
namespace {

using testing::PixelAt;

class WindowTest : public ::testing::Test {
 protected:
  void SetUp() override {
    if (!x_.connected()) GTEST_SKIP() << "no X server (run the tests under scripts/test-env.sh)";
  }
  testing::XDisplay x_;
};

// The 40 x 30 test window's pixels: red grows to the right, green downwards.
uint32_t Pattern(int x, int y) { return 0xFF000000u | uint32_t(x * 6) << 16 | uint32_t(y * 8) << 8 | 0x40u; }

TEST_F(WindowTest, CapturesTheWholeWindowOrAPartOfIt) {
  const xcb_window_t window = x_.CreateWindow(x_.root(), 900, 600, 40, 30);  // where no other test draws
  x_.Show(window);
  std::vector<uint32_t> pixels;
  for (int y = 0; y < 30; ++y) {
    for (int x = 0; x < 40; ++x) pixels.push_back(Pattern(x, y));
  }
  x_.Paint(window, 24, 40, 30, pixels);

  const struct {
    Rect rect;
    double scale;
    int left, top, width, height;  // the expected picture, in window pixels
  } kCases[] = {
      {{}, 1, 0, 0, 40, 30},                  // empty: the whole window
      {{5, 5, 0, 10}, 2, 0, 0, 40, 30},
      {{5, 4, 10, 6}, 1, 5, 4, 10, 6},
      {{5.5, 4.25, 9, 5.5}, 1, 5, 4, 10, 6},  // widened to whole pixels
      {{35, 25, 10, 10}, 1, 35, 25, 10, 10},  // partly outside: white there
      {{5, 4, 10, 6}, 2, 10, 8, 20, 12},      // two pixels per point
  };
  for (const auto& c : kCases) {
    cairo_surface_t* picture = CacheWindowContentsImage(x_.connection(), window, c.rect, c.scale);
    ASSERT_NE(picture, nullptr);
    ASSERT_EQ(cairo_image_surface_get_width(picture), c.width);
    ASSERT_EQ(cairo_image_surface_get_height(picture), c.height);
    int wrong = 0;
    for (int y = 0; y < c.height; ++y) {
      for (int x = 0; x < c.width; ++x) {
        const int wx = c.left + x, wy = c.top + y;
        wrong += PixelAt(picture, x, y) != (wx < 40 && wy < 30 ? Pattern(wx, wy) : 0xFFFFFFFFu);
      }
    }
    EXPECT_EQ(wrong, 0) << "rectangle " << c.rect.x << "," << c.rect.y << " " << c.rect.width << "x" << c.rect.height;
    if (c.rect.IsEmpty()) {
      EXPECT_TRUE(testing::WritePicture(picture, "captured_window"));
    }
    cairo_surface_destroy(picture);
  }
  EXPECT_EQ(CacheWindowContentsImage(x_.connection(), window, {100, 100, 5, 5}), nullptr);
  // Hanging over the screen's bottom-right corner: only the part on the screen can be read.
  const xcb_window_t corner = x_.CreateWindow(x_.root(), x_.screen_width() - 3, x_.screen_height() - 2, 40, 30);
  x_.Show(corner);
  x_.Paint(corner, 24, 40, 30, pixels);
  cairo_surface_t* cut = CacheWindowContentsImage(x_.connection(), corner, {});
  ASSERT_NE(cut, nullptr);
  EXPECT_EQ(PixelAt(cut, 2, 1), Pattern(2, 1));
  EXPECT_EQ(PixelAt(cut, 3, 1), 0xFFFFFFFFu);
  EXPECT_EQ(PixelAt(cut, 2, 2), 0xFFFFFFFFu);
  cairo_surface_destroy(cut);
  const xcb_window_t unmapped = x_.CreateWindow(x_.root(), 0, 0, 5, 5);
  EXPECT_EQ(CacheWindowContentsImage(x_.connection(), unmapped, {}), nullptr);
  x_.Destroy(unmapped);
  EXPECT_EQ(CacheWindowContentsImage(x_.connection(), unmapped, {}), nullptr);
}

TEST_F(WindowTest, TransparentPartsOfAnAlphaWindowComeOutWhite) {
  const xcb_window_t window = x_.CreateWindow(x_.root(), 1000, 700, 4, 1, /*argb=*/true);
  ASSERT_NE(window, XCB_NONE) << "the X server has no 32-bit visual";
  x_.Show(window);
  // Premultiplied: transparent, half-covering red, opaque blue, half-covering grey.
  x_.Paint(window, 32, 4, 1, {0x00000000, 0x80800000, 0xFF0000FF, 0x80404040});
  cairo_surface_t* picture = CacheWindowContentsImage(x_.connection(), window, {});
  ASSERT_NE(picture, nullptr);
  const uint32_t kExpected[] = {0xFFFFFFFF, 0xFFFF7F7F, 0xFF0000FF, 0xFFBFBFBF};
  for (int x = 0; x < 4; ++x) EXPECT_EQ(PixelAt(picture, x, 0), kExpected[x]) << "x = " << x;
  cairo_surface_destroy(picture);
}

// Two windows at known places (never shown: positions hold all the same); the first holds two
// views and a view inside a view.
TEST_F(WindowTest, ConvertsPointsBetweenViewsAndWindows) {
  const xcb_window_t first = x_.CreateWindow(x_.root(), 200, 100, 100, 100);
  const xcb_window_t left = x_.CreateWindow(first, 10, 20, 30, 30);
  const xcb_window_t right = x_.CreateWindow(first, 50, 5, 30, 30);
  const xcb_window_t inner = x_.CreateWindow(left, 3, 4, 10, 10);
  const xcb_window_t second = x_.CreateWindow(x_.root(), 400, 300, 50, 50);
  const xcb_window_t second_view = x_.CreateWindow(second, 7, 8, 10, 10);
  const xcb_window_t gone = x_.CreateWindow(first, 1, 1, 1, 1);
  x_.Destroy(gone);

  const Point p{1.5, 2.25};
  const struct {
    const char* name;
    xcb_window_t source, destination;
    Point expected;
  } kCases[] = {
      {"view to view, one window", left, right, {1.5 - 40, 2.25 + 15}},
      {"nested view to view", inner, right, {1.5 - 37, 2.25 + 19}},
      {"window to its view", first, left, {1.5 - 10, 2.25 - 20}},
      {"view to another window's view", left, second_view, {1.5 + 210 - 407, 2.25 + 120 - 308}},
      {"window to another window", second, first, {1.5 + 200, 2.25 + 200}},
      {"view to the screen", inner, XCB_NONE, {1.5 + 213, 2.25 + 124}},
      {"screen to a view", XCB_NONE, left, {1.5 - 210, 2.25 - 120}},
      {"screen to a window", XCB_NONE, second, {1.5 - 400, 2.25 - 300}},
      {"neither", XCB_NONE, XCB_NONE, {0, 0}},
      {"missing source to the screen", gone, XCB_NONE, {0, 0}},
      {"missing destination", left, gone, {0, 0}},
      // The missing source's window gives (0,0) on the screen, which then goes into the view.
      {"missing source to a view", gone, left, {-210, -120}},
  };
  for (const auto& c : kCases) {
    EXPECT_EQ(ConvertPointBetweenViews(x_.connection(), c.source, c.destination, p), c.expected) << c.name;
  }
}

}  // namespace
}  // namespace lumeris
