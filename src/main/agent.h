// The program as a function, so that main() stays one line.
#ifndef CVN_MAIN_AGENT_H_
#define CVN_MAIN_AGENT_H_

namespace cvn {

/// The whole program: options, consent, one scan. Returns the exit code.
int runAgent(int argc, char** argv);

}  // namespace cvn

#endif  // CVN_MAIN_AGENT_H_
