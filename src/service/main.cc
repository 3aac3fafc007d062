// lumeris-fileservice: the file service. Serves until SIGTERM or SIGINT.
#include <iostream>

#include "database/database_operations.h"
#include "platform/font_coverage.h"
#include "service/server.h"
#include "service/service_command_line.h"
#include "service/service_handler.h"

int main(int argc, char** argv) {
  if (std::optional<int> status = lumeris::ParseServiceCommandLine(argc, argv, std::cout, std::cerr)) return *status;
  // The colour emoji font name must resolve before the first search asks about it.
  lumeris::LoadLumerisFontConfiguration();
  lumeris::PrepareCharacterDatabaseInBackground();
  return lumeris::ServiceMain(lumeris::ServiceConnectionHandler);
}
