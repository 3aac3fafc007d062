// GridNavigation: the keyboard model of the character grid. `count` cells fill rows of
// `columns` cells; one cell may be selected. Moves stop at the edges (no wrapping), Up/Down keep
// the column, and a move from "nothing selected" selects the first cell.
//
//   GridNavigation nav;
//   nav.Reset(100, 8);          // 100 cells, 8 to a row; nothing selected
//   nav.Apply(GridMove::kDown, 5);   // selects cell 0
//   nav.Apply(GridMove::kDown, 5);   // cell 8
//
// Thread-safety: not thread-safe; a plain value.
#pragma once

#include <cstddef>
#include <optional>

namespace lumeris::picker {

enum class GridMove { kLeft, kRight, kUp, kDown, kPageUp, kPageDown, kHome, kEnd };

class GridNavigation {
 public:
  // New contents: nothing selected.
  void Reset(std::size_t count, std::size_t columns);
  // A new width: the selection stays on its cell.
  void SetColumns(std::size_t columns);
  // Moves the selection; `page_rows` rows for a page. False when nothing changed.
  bool Apply(GridMove move, std::size_t page_rows);
  // Selects `index` (ignored beyond the last cell).
  void Select(std::size_t index);

  std::optional<std::size_t> selected() const { return selected_; }
  std::size_t count() const { return count_; }
  std::size_t columns() const { return columns_; }
  std::size_t rows() const { return (count_ + columns_ - 1) / columns_; }

 private:
  std::size_t count_ = 0;
  std::size_t columns_ = 1;
  std::optional<std::size_t> selected_;
};

}  // namespace lumeris::picker
