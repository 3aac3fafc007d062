#include "picker/picker_app.h"

int main(int argc, char** argv) { return lumeris::picker::RunPickerApplication(argc, argv); }
