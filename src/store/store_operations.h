// The user data store as the service's dispatcher sees it: fills in the store's members of
// ServiceOperations, converting between the dispatcher's types (string lists, JSON payload
// bytes, optional identifiers) and the store's property-list values.
//
//   ServiceOperations operations;
//   InstallStoreOperations(operations);
//
// Rules the adapter adds:
// - A request without an "identifier" (or, for the state, without an "application") is answered
//   as if nothing were stored ("state" then reads "{}"), and its writes are ignored.
// - A stored list that is not an array reads as absent; its elements that are not strings are
//   left out of the reply.
// - "save_state": a payload that is not JSON reaches SetLastState as absent; a payload whose top
//   level is not an object, or that holds a JSON null anywhere, is ignored without writing.
// - "skintones" and "state" are compact UTF-8 JSON; stored values JSON cannot express are left
//   out of them.
//
// Thread-safety: the installed members may be called from any thread at once (see the store's
// own headers for what concurrent writers can and cannot lose).
#pragma once

#include "service/service_operations.h"

namespace lumeris {

// Sets CopyRecentsIDArray, SetRecentsIDArray, AddRecentID, CopyFavoritesIDArray,
// SetFavoritesIDArray, CopySkinToneHistory, SetLastSkinToneSelection, CopyLastState and
// SetLastState; leaves every other member as it is.
void InstallStoreOperations(ServiceOperations& operations);

}  // namespace lumeris
