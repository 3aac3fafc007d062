// lumeris-fileservice: the file service. Serves until SIGTERM or SIGINT.
#include "database/database_operations.h"
#include "platform/font_coverage.h"
#include "service/server.h"
#include "service/service_handler.h"

int main() {
  // The colour emoji font name must resolve before the first search asks about it.
  lumeris::LoadLumerisFontConfiguration();
  lumeris::PrepareCharacterDatabaseInBackground();
  return lumeris::ServiceMain(lumeris::ServiceConnectionHandler);
}
