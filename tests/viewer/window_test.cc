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
  xcb_connection_t* connection() { return x_.connection(); }

  testing::XDisplay x_;
};

// The 40 x 30 test window's picture: red grows to the right, green downwards.
constexpr int kWidth = 40;
constexpr int kHeight = 30;
uint32_t Pattern(int x, int y) { return 0xFF000000u | uint32_t(x * 6) << 16 | uint32_t(y * 8) << 8 | 0x40u; }

class WindowCaptureTest : public WindowTest {
 protected:
  void SetUp() override {
    WindowTest::SetUp();
    if (IsSkipped()) return;
    // Placed where no other test's window goes, so nothing covers it.
    window_ = x_.CreateWindow(x_.root(), 900, 600, kWidth, kHeight);
    x_.Show(window_);
    std::vector<uint32_t> pixels;
    for (int y = 0; y < kHeight; ++y) {
      for (int x = 0; x < kWidth; ++x) pixels.push_back(Pattern(x, y));
    }
    x_.Paint(window_, 24, kWidth, kHeight, pixels);
  }

  // Every pixel of `picture` compared with the window's pattern seen from (left, top), each
  // window pixel `scale` times as large; outside the window it must be white.
  void ExpectShows(cairo_surface_t* picture, int left, int top, int width, int height) {
    ASSERT_NE(picture, nullptr);
    ASSERT_EQ(cairo_image_surface_get_width(picture), width);
    ASSERT_EQ(cairo_image_surface_get_height(picture), height);
    int wrong = 0;
    for (int y = 0; y < height; ++y) {
      for (int x = 0; x < width; ++x) {
        const int wx = left + x, wy = top + y;
        const bool inside = wx >= 0 && wx < kWidth && wy >= 0 && wy < kHeight;
        const uint32_t expected = inside ? Pattern(wx, wy) : 0xFFFFFFFFu;
        if (PixelAt(picture, x, y) != expected && ++wrong <= 3) {
          ADD_FAILURE() << "pixel " << x << "," << y << ": " << std::hex << PixelAt(picture, x, y) << " != " << expected;
        }
      }
    }
    EXPECT_EQ(wrong, 0);
  }

  xcb_window_t window_ = XCB_NONE;
};

TEST_F(WindowCaptureTest, EmptyRectangleGivesTheWholeWindow) {
  for (const Rect empty : {Rect{}, Rect{5, 5, 0, 10}, Rect{5, 5, 10, -1}}) {
    cairo_surface_t* picture = CacheWindowContentsImage(connection(), window_, empty);
    ExpectShows(picture, 0, 0, kWidth, kHeight);
    if (empty == Rect{}) {
      EXPECT_TRUE(testing::WritePicture(picture, "captured_window"));
    }
    cairo_surface_destroy(picture);
  }
}

TEST_F(WindowCaptureTest, RectangleGivesThatPartInPixels) {
  const struct {
    Rect rect;
    double scale;
    int left, top, width, height;  // expected, in window pixels
  } kCases[] = {
      {{5, 4, 10, 6}, 1, 5, 4, 10, 6},
      {{5.5, 4.25, 9, 5.5}, 1, 5, 4, 10, 6},  // widened to whole pixels
      {{35, 25, 10, 10}, 1, 35, 25, 10, 10},  // partly outside: white there
  };
  for (const auto& c : kCases) {
    cairo_surface_t* picture = CacheWindowContentsImage(connection(), window_, c.rect, c.scale);
    ExpectShows(picture, c.left, c.top, c.width, c.height);
    cairo_surface_destroy(picture);
  }
  // Two pixels per point: twice the size, from twice the origin.
  cairo_surface_t* doubled = CacheWindowContentsImage(connection(), window_, {5, 4, 10, 6}, 2);
  ASSERT_NE(doubled, nullptr);
  EXPECT_EQ(cairo_image_surface_get_width(doubled), 20);
  EXPECT_EQ(cairo_image_surface_get_height(doubled), 12);
  EXPECT_EQ(PixelAt(doubled, 0, 0), Pattern(10, 8));
  EXPECT_EQ(PixelAt(doubled, 19, 11), Pattern(29, 19));
  cairo_surface_destroy(doubled);
}

TEST_F(WindowCaptureTest, NothingForAMissingWindowOrARectangleOutsideIt) {
  EXPECT_EQ(CacheWindowContentsImage(connection(), window_, {100, 100, 5, 5}), nullptr);
  const xcb_window_t gone = x_.CreateWindow(x_.root(), 0, 0, 5, 5);
  x_.Destroy(gone);
  EXPECT_EQ(CacheWindowContentsImage(connection(), gone, {}), nullptr);
  const xcb_window_t unmapped = x_.CreateWindow(x_.root(), 0, 0, 5, 5);
  EXPECT_EQ(CacheWindowContentsImage(connection(), unmapped, {}), nullptr);
}

TEST_F(WindowTest, TransparentPartsOfAnAlphaWindowComeOutWhite) {
  const xcb_window_t window = x_.CreateWindow(x_.root(), 1000, 700, 4, 2, /*argb=*/true);
  if (window == XCB_NONE) GTEST_SKIP() << "the X server has no 32-bit visual";
  x_.Show(window);
  // Premultiplied: transparent, half-covering red, opaque blue, half-covering grey.
  const std::vector<uint32_t> pixels = {0x00000000, 0x80800000, 0xFF0000FF, 0x80404040,
                                        0x00000000, 0x00000000, 0x00000000, 0x00000000};
  x_.Paint(window, 32, 4, 2, pixels);
  cairo_surface_t* picture = CacheWindowContentsImage(connection(), window, {});
  ASSERT_NE(picture, nullptr);
  const uint32_t kExpected[] = {0xFFFFFFFF, 0xFFFF7F7F, 0xFF0000FF, 0xFFBFBFBF};
  for (int x = 0; x < 4; ++x) EXPECT_EQ(PixelAt(picture, x, 0), kExpected[x]) << "x = " << x;
  EXPECT_EQ(PixelAt(picture, 3, 1), 0xFFFFFFFFu);
  cairo_surface_destroy(picture);
}

// Two windows at known places; the first holds two views and a view inside a view. The windows
// are never shown: positions hold all the same.
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
      {"view to its window", inner, first, {1.5 + 13, 2.25 + 24}},
      {"view to another window's view", left, second_view, {1.5 + 210 - 407, 2.25 + 120 - 308}},
      {"window to another window", second, first, {1.5 + 200, 2.25 + 200}},
      {"view to the screen", inner, XCB_NONE, {1.5 + 213, 2.25 + 124}},
      {"window to the screen", second, XCB_NONE, {1.5 + 400, 2.25 + 300}},
      {"screen to a view", XCB_NONE, left, {1.5 - 210, 2.25 - 120}},
      {"screen to a window", XCB_NONE, second, {1.5 - 400, 2.25 - 300}},
      {"neither", XCB_NONE, XCB_NONE, {0, 0}},
      {"missing source to the screen", gone, XCB_NONE, {0, 0}},
      {"missing destination", left, gone, {0, 0}},
      // The missing source's window gives (0,0) on the screen, which then goes into the view.
      {"missing source to a view", gone, left, {-210, -120}},
  };
  for (const auto& c : kCases) {
    EXPECT_EQ(ConvertPointBetweenViews(connection(), c.source, c.destination, p), c.expected) << c.name;
  }
}

}  // namespace
}  // namespace lumeris
