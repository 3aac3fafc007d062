// SearchRequests: search as you type without flooding the service or showing old answers.
//
// At most one search is in flight. While it is, further keystrokes only replace the text that
// waits; when the reply comes the waiting text is sent at once, so a burst of keystrokes costs
// two requests, not one per key, and a single keystroke is sent without delay. Each request
// carries a new "transactionID"; a reply is shown only when its transaction is the one issued
// for the text now in the field, so a slow answer to "hea" never replaces the results of "heart".
//
//   std::optional<Search> send = searches.TextChanged("he");
//   if (send) Request(send->transaction, send->text);
//   ...
//   SearchRequests::Outcome outcome = searches.ReplyArrived(reply_transaction);
//   if (outcome.show) ShowResults(reply);
//   if (outcome.next) Request(outcome.next->transaction, outcome.next->text);
//
// Thread-safety: not thread-safe; the picker uses it on the main thread only.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace lumeris::picker {

class SearchRequests {
 public:
  struct Search {
    std::uint64_t transaction = 0;
    std::string text;
  };
  struct Outcome {
    bool show = false;            // the reply answers the text now in the field
    std::optional<Search> next;   // the search to send now
  };

  // The field now holds `text`. Returns the search to send at once, or std::nullopt when one is
  // in flight (the text waits) or the text is empty (nothing to search; no reply will show).
  std::optional<Search> TextChanged(std::string text);

  // The reply to `transaction` arrived, or its request failed. Replies to transactions that are
  // not in flight (duplicates, strays) show nothing and send nothing.
  Outcome ReplyArrived(std::uint64_t transaction);

  const std::string& text() const { return text_; }

 private:
  Search Issue(std::string text);

  std::string text_;
  std::uint64_t last_issued_ = 0;
  std::optional<std::uint64_t> in_flight_;
  std::optional<std::uint64_t> answers_text_;  // the transaction issued for text_, if any
  std::optional<std::string> waiting_;
};

}  // namespace lumeris::picker
