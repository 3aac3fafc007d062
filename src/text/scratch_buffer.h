// A scratch array that lives on the stack for ordinary sizes and falls back to the heap only for
// long inputs. Internal to the text utilities (not installed).
//
// Thread-safety: none needed; one owner, one scope.
// Ownership: the buffer owns its storage; data() is valid for the buffer's lifetime.
#pragma once

#include <array>
#include <cstddef>
#include <memory>

namespace lumeris::text_internal {

template <typename T, size_t kInline>
class ScratchBuffer {
 public:
  explicit ScratchBuffer(size_t size) {
    if (size > kInline) heap_ = std::make_unique_for_overwrite<T[]>(size);
  }
  ScratchBuffer(const ScratchBuffer&) = delete;
  ScratchBuffer& operator=(const ScratchBuffer&) = delete;

  T* data() { return heap_ ? heap_.get() : inline_.data(); }

 private:
  std::array<T, kInline> inline_;
  std::unique_ptr<T[]> heap_;
};

}  // namespace lumeris::text_internal
