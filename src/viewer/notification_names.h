// The names of the notifications of the system: the one the service posts for every panel of the
// user, and the panel's own, which the panel posts and observes (the service never does). Each
// constant's value is its own name. Header-only constants; safe to use from any thread.
#pragma once

namespace lumeris {

// Posted (no object) after the recents list, the skin-tone history or the global emoji-
// diversity state changed, so that every panel of the user reloads.
inline constexpr char kLMLumerisRecentsChangedNotification[] = "LMLumerisRecentsChangedNotification";

// The panel's notifications.
inline constexpr char LMKVistrelWindowWillOpen[] = "LMKVistrelWindowWillOpen";
inline constexpr char LMKVistrelWindowDidOpen[] = "LMKVistrelWindowDidOpen";
inline constexpr char LMKNavigationFocusMoved[] = "LMKNavigationFocusMoved";
inline constexpr char LMKNavigationCharacterSelectionMoved[] = "LMKNavigationCharacterSelectionMoved";
inline constexpr char LMKNavigationCategorySelectionMoved[] = "LMKNavigationCategorySelectionMoved";
inline constexpr char LMKNavigationSelectionConfirmed[] = "LMKNavigationSelectionConfirmed";
inline constexpr char LMKNavigationSelectionCanceled[] = "LMKNavigationSelectionCanceled";
// Posted when the user's country, and with it the regional hiding of characters, changed.
inline constexpr char LMKLocaleCountryInfoChanged[] = "LMKLocaleCountryInfoChanged";

}  // namespace lumeris
