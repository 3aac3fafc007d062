// The store's version check: an unversioned store domain is wiped whole, once, and marked
// version 1. Stores of an earlier, unversioned layout are discarded, not converted; this is
// deliberate.
//
// It runs at the start of reading recents and of storing recents, favourites or a state, and
// nowhere else (reading favourites, skin tones or a state never wipes).
//
// Thread-safety: may be called from any thread; like every caller's read-modify-write it is not
// atomic against another writer. Returns nothing.
#pragma once

namespace lumeris {

// Reads the integer "version" of the store domain (absent or non-integer reads 0); when it is 0,
// removes every key of the domain (current user, any host) and sets "version" to 1. Any non-zero
// version is accepted as it is. Does not synchronise: every caller synchronises afterwards.
void CheckDataStorageVersion();

}  // namespace lumeris
