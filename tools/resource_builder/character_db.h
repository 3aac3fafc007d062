// Writes the character database file ("CharacterDB.sqlite3"): table `unihan_dict` with the
// columns `uchr` and `info` (in that order; readers address them by position) and an index on
// `uchr` for the information lookup.
//
// Thread-safety: no shared state. Returns false when the file cannot be written.
#pragma once

#include <filesystem>
#include <vector>

#include "resource_builder/character_info.h"

namespace lumeris::resources {

bool WriteCharacterDatabase(const std::filesystem::path& path, const std::vector<CharacterRow>& rows);

}  // namespace lumeris::resources
