// PickerState: what the picker remembers per application between runs, kept by the service as
// the application's saved state ("save_state", read back in "read_recents_favorites").
//
//   {"category": "Greek", "closeAfterPick": false, "keepSearch": true, "searchText": "heart",
//    "windowHeight": 480, "windowWidth": 720}
//
// Members that are missing or of the wrong type read as their defaults; members other programs
// stored beside them are kept when the state is written back.
//
// Thread-safety: plain values and pure functions.
#pragma once

#include <string>

#include "service/message_value.h"

namespace lumeris::picker {

struct PickerState {
  std::string category;       // the section id last shown; "" for the first
  int window_width = 0;       // 0: the default size
  int window_height = 0;
  bool keep_search = false;   // restore the search text next time
  std::string search_text;    // kept only when keep_search
  bool close_after_pick = false;
};

// The state in a reply's "state" payload (JSON text of an object); defaults when absent.
// `others` (optional) receives the whole object, to carry members the picker does not know.
PickerState ParsePickerState(const MessageValue::Bytes* json, std::string* others = nullptr);

// The JSON text to save: `others` (a JSON object's text, or "") with the picker's members set.
std::string PickerStateJson(const PickerState& state, const std::string& others = {});

}  // namespace lumeris::picker
