// XDisplay: a connection to the test run's virtual X server ($DISPLAY) and the verbs the window
// tests need: make a window, show it, paint known pixels into it, destroy it.
#pragma once

#include <xcb/xcb.h>

#include <chrono>
#include <cstdlib>
#include <thread>
#include <vector>

namespace lumeris::testing {

class XDisplay {
 public:
  // The test environment's X server may still be starting: connecting is retried for up to 60 s
  // (there is no event to wait for before a server exists).
  XDisplay() {
    if (std::getenv("DISPLAY") == nullptr) return;
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    while (xcb_connection_has_error(connection_ = xcb_connect(nullptr, nullptr))) {
      xcb_disconnect(connection_);
      connection_ = nullptr;
      if (std::chrono::steady_clock::now() > deadline) return;
      std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
    screen_ = xcb_setup_roots_iterator(xcb_get_setup(connection_)).data;
  }
  ~XDisplay() {
    if (connection_ != nullptr) xcb_disconnect(connection_);
  }

  bool connected() const { return connection_ != nullptr; }
  xcb_connection_t* connection() const { return connection_; }
  xcb_window_t root() const { return screen_->root; }
  int screen_width() const { return screen_->width_in_pixels; }
  int screen_height() const { return screen_->height_in_pixels; }

  // A window of the root's depth, or of the 32-bit ARGB visual when `argb` (XCB_NONE when the
  // server has none); not yet shown.
  xcb_window_t CreateWindow(xcb_window_t parent, int x, int y, int width, int height, bool argb = false) {
    uint32_t values[] = {0, 0, 1, XCB_EVENT_MASK_EXPOSURE, 0};  // back, border, override-redirect, events, colormap
    xcb_visualid_t visual = screen_->root_visual;
    if (argb) {
      for (auto d = xcb_screen_allowed_depths_iterator(screen_); d.rem && visual == screen_->root_visual; xcb_depth_next(&d)) {
        if (d.data->depth == 32 && d.data->visuals_len > 0) visual = xcb_depth_visuals(d.data)[0].visual_id;
      }
      if (visual == screen_->root_visual) return XCB_NONE;
      values[4] = xcb_generate_id(connection_);
      xcb_create_colormap(connection_, XCB_COLORMAP_ALLOC_NONE, values[4], screen_->root, visual);
    }
    const xcb_window_t window = xcb_generate_id(connection_);
    xcb_create_window(connection_, argb ? 32 : XCB_COPY_FROM_PARENT, window, parent, int16_t(x), int16_t(y),
                      uint16_t(width), uint16_t(height), 0, XCB_WINDOW_CLASS_INPUT_OUTPUT, visual,
                      XCB_CW_BACK_PIXEL | XCB_CW_BORDER_PIXEL | XCB_CW_OVERRIDE_REDIRECT | XCB_CW_EVENT_MASK |
                          (argb ? XCB_CW_COLORMAP : 0),
                      values);
    xcb_flush(connection_);
    return window;
  }

  // Maps `window` and waits for its first Expose event: from then on it holds what is drawn.
  void Show(xcb_window_t window) {
    xcb_map_window(connection_, window);
    xcb_flush(connection_);
    while (xcb_generic_event_t* event = xcb_wait_for_event(connection_)) {
      const bool exposed = (event->response_type & 0x7F) == XCB_EXPOSE &&
                           reinterpret_cast<xcb_expose_event_t*>(event)->window == window;
      std::free(event);
      if (exposed) return;
    }
  }

  // Puts 32-bit pixels (premultiplied 0xAARRGGBB for an ARGB window) at the window's top-left
  // corner and waits until the server has done it.
  void Paint(xcb_window_t window, uint8_t depth, int width, int height, const std::vector<uint32_t>& pixels) {
    const xcb_gcontext_t gc = xcb_generate_id(connection_);
    xcb_create_gc(connection_, gc, window, 0, nullptr);
    xcb_put_image(connection_, XCB_IMAGE_FORMAT_Z_PIXMAP, window, gc, uint16_t(width), uint16_t(height), 0, 0, 0,
                  depth, uint32_t(pixels.size() * 4), reinterpret_cast<const uint8_t*>(pixels.data()));
    xcb_free_gc(connection_, gc);
    Sync();
  }

  void Destroy(xcb_window_t window) {
    xcb_destroy_window(connection_, window);
    Sync();
  }

 private:
  void Sync() { std::free(xcb_get_input_focus_reply(connection_, xcb_get_input_focus(connection_), nullptr)); }

  xcb_connection_t* connection_ = nullptr;
  xcb_screen_t* screen_ = nullptr;
};

}  // namespace lumeris::testing
