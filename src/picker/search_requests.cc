#include "picker/search_requests.h"

namespace lumeris::picker {

SearchRequests::Search SearchRequests::Issue(std::string text) {
  const std::uint64_t transaction = ++last_issued_;
  in_flight_ = transaction;
  answers_text_ = transaction;
  return Search{transaction, std::move(text)};
}

std::optional<SearchRequests::Search> SearchRequests::TextChanged(std::string text) {
  text_ = text;
  answers_text_.reset();
  waiting_.reset();
  if (text.empty()) return std::nullopt;
  if (in_flight_) {
    waiting_ = std::move(text);
    return std::nullopt;
  }
  return Issue(std::move(text));
}

SearchRequests::Outcome SearchRequests::ReplyArrived(std::uint64_t transaction) {
  Outcome outcome;
  if (in_flight_ != transaction) return outcome;
  in_flight_.reset();
  outcome.show = answers_text_ == transaction;
  if (waiting_) {
    outcome.next = Issue(std::move(*waiting_));
    waiting_.reset();
  }
  return outcome;
}

}  // namespace lumeris::picker
