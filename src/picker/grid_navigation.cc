#include "picker/grid_navigation.h"

#include <algorithm>

namespace lumeris::picker {

void GridNavigation::Reset(std::size_t count, std::size_t columns) {
  count_ = count;
  columns_ = std::max<std::size_t>(columns, 1);
  selected_.reset();
}

void GridNavigation::SetColumns(std::size_t columns) { columns_ = std::max<std::size_t>(columns, 1); }

void GridNavigation::Select(std::size_t index) {
  if (index < count_) selected_ = index;
}

bool GridNavigation::Apply(GridMove move, std::size_t page_rows) {
  if (count_ == 0) return false;
  const std::optional<std::size_t> before = selected_;
  if (!selected_) {
    selected_ = move == GridMove::kEnd ? count_ - 1 : 0;
    return true;
  }
  const std::size_t at = *selected_;
  const std::size_t last = count_ - 1;
  const std::size_t page = std::max<std::size_t>(page_rows, 1) * columns_;
  switch (move) {
    case GridMove::kLeft:
      if (at > 0) selected_ = at - 1;
      break;
    case GridMove::kRight:
      if (at < last) selected_ = at + 1;
      break;
    case GridMove::kUp:
      if (at >= columns_) selected_ = at - columns_;
      break;
    case GridMove::kDown:
      if (at + columns_ <= last) selected_ = at + columns_;
      break;
    case GridMove::kPageUp:
      selected_ = at >= page ? at - page : at % columns_;
      break;
    case GridMove::kPageDown:
      selected_ = at + page <= last ? at + page : std::min(last, at + (last - at) / columns_ * columns_);
      break;
    case GridMove::kHome:
      selected_ = 0;
      break;
    case GridMove::kEnd:
      selected_ = last;
      break;
  }
  return selected_ != before;
}

}  // namespace lumeris::picker
