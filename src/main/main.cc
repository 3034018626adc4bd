#include "main/agent.h"

int main(int argc, char** argv) { return cvn::runAgent(argc, argv); }
