// Reading the builder's input files: plain text files and the bzip2-compressed Unihan files.
//
// Thread-safety: the functions keep no state; safe from any thread.
// Ownership: the returned strings belong to the caller. A missing or unreadable file (or a
// damaged bzip2 stream) gives std::nullopt, never an exception.
#pragma once

#include <filesystem>
#include <optional>
#include <string>

namespace lumeris::resources {

// The whole content of `path` as bytes.
std::optional<std::string> ReadTextFile(const std::filesystem::path& path);

// The decompressed content of the bzip2 file at `path` (concatenated streams allowed).
std::optional<std::string> ReadBzip2File(const std::filesystem::path& path);

}  // namespace lumeris::resources
