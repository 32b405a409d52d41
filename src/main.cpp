// Process entry of pinforge: one process performs one run.
#include "front_end.h"

int main(int argc, char** argv) { return runFrontEnd(argc, argv); }
