// Test client run under another uid: connects to the socket named by its argument, asks for a
// reply and prints what happened: "reply", "closed" (without a reply), "no answer" or
// "no connection".
#include <cstdio>

#include "support/service_fixture.h"

int main(int argc, char** argv) {
  using namespace lumeris::testing;
  std::optional<RawConnection> connection =
      argc == 2 ? RawConnection::Open(argv[1]) : std::nullopt;
  const char* outcome = "no connection";
  if (connection) {
    outcome = connection->ReadReply(connection->SendMessage(Command("search_probe")), 2s) ? "reply"
              : connection->WaitForPeerClose(100ms) ? "closed"
                                                    : "no answer";
  }
  std::puts(outcome);
  return 0;
}
