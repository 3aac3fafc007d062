// lumeris-fileservice: the file service. Serves until SIGTERM or SIGINT.
#include <malloc.h>
#include <stdlib.h>

#include <iostream>

#include "database/database_operations.h"
#include "platform/font_coverage.h"
#include "service/server.h"
#include "service/service_command_line.h"
#include "service/service_handler.h"

int main(int argc, char** argv) {
  // glibc gives each pool thread a malloc arena of its own; memory freed in one arena is not
  // reused by the others, which kept about 3 MB more resident for the life of the service. Two
  // arenas are enough for a pool that mostly waits on sockets. MALLOC_ARENA_MAX still decides.
  if (getenv("MALLOC_ARENA_MAX") == nullptr) mallopt(M_ARENA_MAX, 2);
  if (std::optional<int> status = lumeris::ParseServiceCommandLine(argc, argv, std::cout, std::cerr)) return *status;
  // The colour emoji font name must resolve before the first search asks about it.
  lumeris::LoadLumerisFontConfiguration();
  lumeris::PrepareCharacterDatabaseInBackground();
  return lumeris::ServiceMain(lumeris::ServiceConnectionHandler);
}
