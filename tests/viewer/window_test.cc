// Window capture and point conversion on the test run's virtual X server ($DISPLAY), with windows
// the tests make, show and fill with known pixels.
#include <cairo.h>
#include <xcb/xcb.h>

#include <chrono>
#include <cstdlib>
#include <thread>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "support/pictures.h"
#include "viewer/point_conversion.h"
#include "viewer/window_capture.h"

namespace lumeris {
namespace {

using testing::PixelAt;

class WindowTest : public ::testing::Test {
 protected:
  // The test environment's X server may still be starting: connecting is retried for up to 60 s
  // (there is no event to wait for before a server exists).
  void SetUp() override {
    if (std::getenv("DISPLAY") == nullptr) GTEST_SKIP() << "no X server (run the tests under scripts/test-env.sh)";
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    while (xcb_connection_has_error(x_ = xcb_connect(nullptr, nullptr))) {
      xcb_disconnect(std::exchange(x_, nullptr));
      ASSERT_LT(std::chrono::steady_clock::now(), deadline) << "no X server at " << std::getenv("DISPLAY");
      std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
    screen_ = xcb_setup_roots_iterator(xcb_get_setup(x_)).data;
  }
  void TearDown() override {
    if (x_ != nullptr) xcb_disconnect(x_);
  }

  // A window of the root's depth, or of the 32-bit ARGB visual when `argb` (XCB_NONE when the
  // server has none), not yet shown. Requests on one connection are handled in order, so what the
  // tests ask later sees every window made, shown, filled or destroyed before.
  xcb_window_t Create(xcb_window_t parent, int x, int y, int width, int height, bool argb = false) {
    uint32_t values[] = {0, 0, 1, 0};  // back, border, override-redirect, colormap
    xcb_visualid_t visual = screen_->root_visual;
    for (auto d = xcb_screen_allowed_depths_iterator(screen_); argb && d.rem && visual == screen_->root_visual;
         xcb_depth_next(&d)) {
      if (d.data->depth == 32 && d.data->visuals_len > 0) visual = xcb_depth_visuals(d.data)[0].visual_id;
    }
    if (argb && visual == screen_->root_visual) return XCB_NONE;
    if (argb) xcb_create_colormap(x_, XCB_COLORMAP_ALLOC_NONE, values[3] = xcb_generate_id(x_), screen_->root, visual);
    const xcb_window_t window = xcb_generate_id(x_);
    xcb_create_window(x_, argb ? 32 : XCB_COPY_FROM_PARENT, window, parent, int16_t(x), int16_t(y), uint16_t(width),
                      uint16_t(height), 0, XCB_WINDOW_CLASS_INPUT_OUTPUT, visual,
                      XCB_CW_BACK_PIXEL | XCB_CW_BORDER_PIXEL | XCB_CW_OVERRIDE_REDIRECT | (argb ? XCB_CW_COLORMAP : 0),
                      values);
    return window;
  }

  // Maps a new top-level window (the server paints its background as it maps it), then puts 32-bit
  // pixels (premultiplied 0xAARRGGBB for an ARGB window) at its top-left corner.
  xcb_window_t Shown(int x, int y, int width, int height, const std::vector<uint32_t>& pixels, bool argb = false) {
    const xcb_window_t window = Create(screen_->root, x, y, width, height, argb);
    if (window == XCB_NONE) return window;
    xcb_map_window(x_, window);
    const xcb_gcontext_t gc = xcb_generate_id(x_);
    xcb_create_gc(x_, gc, window, 0, nullptr);
    xcb_put_image(x_, XCB_IMAGE_FORMAT_Z_PIXMAP, window, gc, uint16_t(width), uint16_t(height), 0, 0, 0,
                  argb ? 32 : 24, uint32_t(pixels.size() * 4), reinterpret_cast<const uint8_t*>(pixels.data()));
    xcb_free_gc(x_, gc);
    return window;
  }

  xcb_connection_t* x_ = nullptr;
  xcb_screen_t* screen_ = nullptr;
};

// The 40 x 30 test window's pixels: red grows to the right, green downwards.
uint32_t Pattern(int x, int y) { return 0xFF000000u | uint32_t(x * 6) << 16 | uint32_t(y * 8) << 8 | 0x40u; }

TEST_F(WindowTest, CapturesTheWholeWindowOrAPartOfItOverWhite) {
  std::vector<uint32_t> pixels;
  for (int i = 0; i < 40 * 30; ++i) pixels.push_back(Pattern(i % 40, i / 40));
  // One window where no other test draws, one hanging over the screen's bottom-right corner, of
  // which only the 3 x 2 pixels on the screen can be read.
  const xcb_window_t window = Shown(900, 600, 40, 30, pixels);
  const xcb_window_t corner = Shown(screen_->width_in_pixels - 3, screen_->height_in_pixels - 2, 40, 30, pixels);
  const struct {
    xcb_window_t window;
    Rect rect;
    double scale;
    int left, top, width, height;  // the expected picture, in window pixels
    int seen_width, seen_height;   // white beyond
  } kCases[] = {
      {window, {}, 1, 0, 0, 40, 30, 40, 30},                  // empty: the whole window
      {window, {5, 5, 0, 10}, 2, 0, 0, 40, 30, 40, 30},
      {window, {5, 4, 10, 6}, 1, 5, 4, 10, 6, 40, 30},
      {window, {5.5, 4.25, 9, 5.5}, 1, 5, 4, 10, 6, 40, 30},  // widened to whole pixels
      {window, {35, 25, 10, 10}, 1, 35, 25, 10, 10, 40, 30},  // partly outside the window
      {window, {5, 4, 10, 6}, 2, 10, 8, 20, 12, 40, 30},      // two pixels per point
      {corner, {}, 1, 0, 0, 40, 30, 3, 2},
  };
  for (const auto& c : kCases) {
    cairo_surface_t* picture = CacheWindowContentsImage(x_, c.window, c.rect, c.scale);
    ASSERT_NE(picture, nullptr);
    ASSERT_EQ(cairo_image_surface_get_width(picture), c.width);
    ASSERT_EQ(cairo_image_surface_get_height(picture), c.height);
    int wrong = 0;
    for (int y = 0; y < c.height; ++y) {
      for (int x = 0; x < c.width; ++x) {
        const int wx = c.left + x, wy = c.top + y;
        wrong += PixelAt(picture, x, y) != (wx < c.seen_width && wy < c.seen_height ? Pattern(wx, wy) : 0xFFFFFFFFu);
      }
    }
    EXPECT_EQ(wrong, 0) << "rectangle " << c.rect.x << "," << c.rect.y << " " << c.rect.width << "x" << c.rect.height;
    EXPECT_TRUE(c.window != window || !c.rect.IsEmpty() || testing::WritePicture(picture, "captured_window"));
    cairo_surface_destroy(picture);
  }
  EXPECT_EQ(CacheWindowContentsImage(x_, window, {100, 100, 5, 5}), nullptr);
  const xcb_window_t unmapped = Create(screen_->root, 0, 0, 5, 5);
  EXPECT_EQ(CacheWindowContentsImage(x_, unmapped, {}), nullptr);
  xcb_destroy_window(x_, unmapped);
  EXPECT_EQ(CacheWindowContentsImage(x_, unmapped, {}), nullptr);

  // The transparent parts of an alpha window come out white. Premultiplied: transparent,
  // half-covering red, opaque blue, half-covering grey.
  const xcb_window_t alpha = Shown(1000, 700, 4, 1, {0x00000000, 0x80800000, 0xFF0000FF, 0x80404040}, /*argb=*/true);
  ASSERT_NE(alpha, XCB_NONE) << "the X server has no 32-bit visual";
  cairo_surface_t* picture = CacheWindowContentsImage(x_, alpha, {});
  ASSERT_NE(picture, nullptr);
  const uint32_t kExpected[] = {0xFFFFFFFF, 0xFFFF7F7F, 0xFF0000FF, 0xFFBFBFBF};
  for (int x = 0; x < 4; ++x) EXPECT_EQ(PixelAt(picture, x, 0), kExpected[x]) << "x = " << x;
  cairo_surface_destroy(picture);
}

// Two windows at known places (never shown: positions hold all the same); the first holds two
// views and a view inside a view.
TEST_F(WindowTest, ConvertsPointsBetweenViewsAndWindows) {
  const xcb_window_t first = Create(screen_->root, 200, 100, 100, 100);
  const xcb_window_t left = Create(first, 10, 20, 30, 30);
  const xcb_window_t right = Create(first, 50, 5, 30, 30);
  const xcb_window_t inner = Create(left, 3, 4, 10, 10);
  const xcb_window_t second = Create(screen_->root, 400, 300, 50, 50);
  const xcb_window_t second_view = Create(second, 7, 8, 10, 10);
  const xcb_window_t gone = Create(first, 1, 1, 1, 1);
  xcb_destroy_window(x_, gone);

  const Point p{1.5, 2.25};
  const struct { const char* name; xcb_window_t source, destination; Point expected; } kCases[] = {
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
    EXPECT_EQ(ConvertPointBetweenViews(x_, c.source, c.destination, p), c.expected) << c.name;
  }
}

}  // namespace
}  // namespace lumeris
