// lumeris: the command-line client of the file service.
#include <iostream>

#include "client/cli_app.h"

int main(int argc, char** argv) { return lumeris::cli::RunCli(argc, argv, std::cout, std::cerr); }
