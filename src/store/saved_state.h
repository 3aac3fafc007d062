// The saved panel state of a client application, kept under "State:" + application, and the one
// member shared by every application, "VTGlobalEmojiDiversityDescribed", kept on its own key and
// merged into every state that is read.
//
// A state replaces the stored one whole (members are not merged), but a state with no member
// left after the global one is taken out never clears the stored one: deliberate.
//
// Thread-safety: every function may be called from any thread. Ownership: returned values are
// copies owned by the caller.
#pragma once

#include <optional>
#include <string_view>

#include "platform/property_list.h"

namespace lumeris {

// The stored state of `application` (empty when none, or when what is stored is not a
// dictionary), with the global member, when stored, set over a member of the same name.
// Synchronises once, first. Without an application only the global member is read: it does
// not depend on the application.
plist::Dictionary CopyLastState(std::optional<std::string_view> application);

// After the version check: writes the global member when `state` has it (and then posts the
// change notification), writes the rest under "State:" + application when it has at least one
// member, and synchronises. An absent state (a payload that was not JSON) writes nothing and
// posts nothing; only the version check and the synchronise happen.
void SetLastState(const std::optional<plist::Dictionary>& state, std::string_view application);

}  // namespace lumeris
