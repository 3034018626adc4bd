#include "main/command_line.h"

int main(int argc, char** argv) { return cvn::runAgent(argc, argv); }
