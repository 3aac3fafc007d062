// Writes the related-characters database file ("RelatedCharDB.sqlite3"): table `related_dict`
// with the one column `relatedChars`, one row per group, each row the group's characters written
// one after another (UTF-8).
//
// Thread-safety: no shared state. Returns false when the file cannot be written.
#pragma once

#include <filesystem>
#include <string>
#include <vector>

namespace lumeris::resources {

bool WriteRelatedDatabase(const std::filesystem::path& path, const std::vector<std::string>& groups);

}  // namespace lumeris::resources
