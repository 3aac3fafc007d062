// The character database as the service's dispatcher sees it: fills in the database members of
// ServiceOperations with the shared LMCharacterDatabase and the regional refresh.
//
//   ServiceOperations operations;
//   InstallDatabaseOperations(operations);
//
// Rules the adapter adds: the request's "string" is UTF-8; text that is not well-formed UTF-8 is
// handled as the empty string. The request's unsigned "limit" reaches the database unchanged, as
// the signed 64-bit value of the same bits.
//
// Thread-safety: the installed members may be called from any thread at once.
#pragma once

#include "service/service_operations.h"

namespace lumeris {

// Sets UpdateCountryInfoAndCheckSignificantChange, createXPCArrayForSearchString,
// createXPCArrayForRelatedCharacters and createXPCDictionaryForCharacterInfo; leaves every other
// member as it is.
void InstallDatabaseOperations(ServiceOperations& operations);

// Reads the shared database's search index and loads the font lists, each on a thread of its
// own, so that the first search after the service starts finds them ready (a search arriving
// meanwhile waits for the stored index, or is answered by the reference rules while an index is
// built from the table). The threads take none of the process's signals. For the service's
// start, before the service blocks its stop signals.
void PrepareCharacterDatabaseInBackground();

}  // namespace lumeris
