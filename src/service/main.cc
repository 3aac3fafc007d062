// lumeris-fileservice: the file service. Serves until SIGTERM or SIGINT.
#include "service/server.h"
#include "service/service_handler.h"

int main() { return lumeris::ServiceMain(lumeris::ServiceConnectionHandler); }
