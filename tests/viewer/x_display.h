// XDisplay: a connection to the test run's virtual X server ($DISPLAY) and the domain verbs the
// window tests need: make a window, show it, paint known pixels into it.
#pragma once

#include <xcb/xcb.h>

#include <chrono>
#include <cstdlib>
#include <thread>
#include <vector>

namespace lumeris::testing {

class XDisplay {
 public:
  // The X server of the test environment may still be starting: connecting is retried until it
  // answers or 60 s pass (there is no event to wait for before a server exists).
  XDisplay() {
    if (std::getenv("DISPLAY") == nullptr) return;
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    for (;;) {
      connection_ = xcb_connect(nullptr, nullptr);
      if (!xcb_connection_has_error(connection_)) break;
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
  XDisplay(const XDisplay&) = delete;
  XDisplay& operator=(const XDisplay&) = delete;

  bool connected() const { return connection_ != nullptr; }
  xcb_connection_t* connection() const { return connection_; }
  xcb_window_t root() const { return screen_->root; }

  // A window of the root's depth (or the 32-bit ARGB visual when `argb`), not yet shown.
  // Returns XCB_NONE when the server has no ARGB visual.
  xcb_window_t CreateWindow(xcb_window_t parent, int x, int y, int width, int height, bool argb = false) {
    const xcb_window_t window = xcb_generate_id(connection_);
    uint8_t depth = XCB_COPY_FROM_PARENT;
    xcb_visualid_t visual = screen_->root_visual;
    const uint32_t mask = XCB_CW_BACK_PIXEL | XCB_CW_BORDER_PIXEL | XCB_CW_OVERRIDE_REDIRECT |
                          XCB_CW_EVENT_MASK | (argb ? XCB_CW_COLORMAP : 0);
    uint32_t values[5] = {0, 0, 1, XCB_EVENT_MASK_EXPOSURE, 0};
    if (argb) {
      visual = ArgbVisual();
      if (visual == 0) return XCB_NONE;
      depth = 32;
      values[4] = xcb_generate_id(connection_);
      xcb_create_colormap(connection_, XCB_COLORMAP_ALLOC_NONE, values[4], screen_->root, visual);
    }
    xcb_create_window(connection_, depth, window, parent, static_cast<int16_t>(x), static_cast<int16_t>(y),
                      static_cast<uint16_t>(width), static_cast<uint16_t>(height), 0,
                      XCB_WINDOW_CLASS_INPUT_OUTPUT, visual, mask, values);
    xcb_flush(connection_);
    return window;
  }

  // Maps `window` and waits for its first Expose event: from then on it has pixels to draw on.
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

  // Writes 32-bit pixels (0xAARRGGBB, premultiplied for an ARGB window) into the window and
  // waits until the server has done it.
  void Paint(xcb_window_t window, uint8_t depth, int width, int height, const std::vector<uint32_t>& pixels) {
    const xcb_gcontext_t gc = xcb_generate_id(connection_);
    xcb_create_gc(connection_, gc, window, 0, nullptr);
    xcb_put_image(connection_, XCB_IMAGE_FORMAT_Z_PIXMAP, window, gc, static_cast<uint16_t>(width),
                  static_cast<uint16_t>(height), 0, 0, 0, depth, static_cast<uint32_t>(pixels.size() * 4),
                  reinterpret_cast<const uint8_t*>(pixels.data()));
    xcb_free_gc(connection_, gc);
    std::free(xcb_get_input_focus_reply(connection_, xcb_get_input_focus(connection_), nullptr));
  }

  void Destroy(xcb_window_t window) {
    xcb_destroy_window(connection_, window);
    std::free(xcb_get_input_focus_reply(connection_, xcb_get_input_focus(connection_), nullptr));
  }

 private:
  xcb_visualid_t ArgbVisual() const {
    for (auto depths = xcb_screen_allowed_depths_iterator(screen_); depths.rem; xcb_depth_next(&depths)) {
      if (depths.data->depth != 32) continue;
      for (auto v = xcb_depth_visuals_iterator(depths.data); v.rem; xcb_visualtype_next(&v)) {
        if (v.data->_class == XCB_VISUAL_CLASS_TRUE_COLOR) return v.data->visual_id;
      }
    }
    return 0;
  }

  xcb_connection_t* connection_ = nullptr;
  xcb_screen_t* screen_ = nullptr;
};

}  // namespace lumeris::testing
