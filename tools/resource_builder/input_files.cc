#include "resource_builder/input_files.h"

#include <bzlib.h>

#include <cstdio>
#include <fstream>
#include <iterator>
#include <memory>

namespace lumeris::resources {

std::optional<std::string> ReadTextFile(const std::filesystem::path& path) {
  std::ifstream in(path, std::ios::binary);
  if (!in) return std::nullopt;
  std::string content((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
  if (in.bad()) return std::nullopt;
  return content;
}

std::optional<std::string> ReadBzip2File(const std::filesystem::path& path) {
  std::optional<std::string> compressed = ReadTextFile(path);
  if (!compressed) return std::nullopt;

  std::string out;
  bz_stream stream{};
  stream.next_in = compressed->data();
  stream.avail_in = static_cast<unsigned>(compressed->size());
  char buffer[1 << 16];
  bool stream_open = false;
  while (true) {
    if (!stream_open) {
      if (stream.avail_in == 0) break;  // every stream decoded
      if (BZ2_bzDecompressInit(&stream, 0, 0) != BZ_OK) return std::nullopt;
      stream_open = true;
    }
    stream.next_out = buffer;
    stream.avail_out = sizeof buffer;
    int rc = BZ2_bzDecompress(&stream);
    out.append(buffer, sizeof buffer - stream.avail_out);
    if (rc == BZ_STREAM_END) {
      BZ2_bzDecompressEnd(&stream);
      stream_open = false;
    } else if (rc != BZ_OK || (stream.avail_in == 0 && stream.avail_out != 0)) {
      BZ2_bzDecompressEnd(&stream);
      return std::nullopt;  // damaged or truncated stream
    }
  }
  return out;
}

}  // namespace lumeris::resources
