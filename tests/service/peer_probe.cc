// Test client run under another uid: connects to the socket given as argument, asks for a reply
// and says what happened. Exit status: 0 reply, 1 closed without reply, 2 no answer, 3 no connect.
#include <cstdio>

#include "support/service_fixture.h"

int main(int argc, char** argv) {
  using namespace lumeris::testing;
  if (argc != 2) return 64;
  std::optional<RawConnection> connection = RawConnection::Open(argv[1]);
  if (!connection) {
    std::puts("no connection");
    return 3;
  }
  std::uint64_t id = connection->SendMessage(Command("search_probe"));
  if (connection->ReadReply(id, 2s)) {
    std::puts("reply");
    return 0;
  }
  if (connection->WaitForPeerClose(100ms)) {
    std::puts("closed");
    return 1;
  }
  std::puts("no answer");
  return 2;
}
