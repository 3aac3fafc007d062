#include "picker/picker_state.h"

#include <nlohmann/json.hpp>

namespace lumeris::picker {
namespace {

template <typename T>
void Read(const nlohmann::json& object, const char* key, T& value) {
  const auto found = object.find(key);
  if (found == object.end()) return;
  if constexpr (std::is_same_v<T, bool>) {
    if (found->is_boolean()) value = found->get<bool>();
  } else if constexpr (std::is_same_v<T, int>) {
    if (found->is_number_integer() && found->get<long long>() > 0 && found->get<long long>() < 100000) {
      value = found->get<int>();
    }
  } else {
    if (found->is_string()) value = found->get<std::string>();
  }
}

}  // namespace

PickerState ParsePickerState(const MessageValue::Bytes* json, std::string* others) {
  PickerState state;
  if (json == nullptr) return state;
  const nlohmann::json object = nlohmann::json::parse(json->begin(), json->end(), nullptr, false);
  if (!object.is_object()) return state;
  Read(object, "category", state.category);
  Read(object, "windowWidth", state.window_width);
  Read(object, "windowHeight", state.window_height);
  Read(object, "keepSearch", state.keep_search);
  if (state.keep_search) Read(object, "searchText", state.search_text);
  Read(object, "closeAfterPick", state.close_after_pick);
  if (others) *others = object.dump();
  return state;
}

std::string PickerStateJson(const PickerState& state, const std::string& others) {
  nlohmann::json object = nlohmann::json::parse(others, nullptr, false);
  if (!object.is_object()) object = nlohmann::json::object();
  object["category"] = state.category;
  if (state.window_width > 0 && state.window_height > 0) {
    object["windowWidth"] = state.window_width;
    object["windowHeight"] = state.window_height;
  }
  object["keepSearch"] = state.keep_search;
  object["searchText"] = state.keep_search ? state.search_text : std::string();
  object["closeAfterPick"] = state.close_after_pick;
  return object.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace);
}

}  // namespace lumeris::picker
