// Options, help text and the consent dialogue.
#ifndef CVN_MAIN_COMMAND_LINE_H_
#define CVN_MAIN_COMMAND_LINE_H_

#include <cstdio>
#include <functional>
#include <string>
#include <vector>

#include "main/scan_settings.h"

namespace cvn {

enum class CommandLineAction { kScan, kHelp };

/// Reads `args` (without the program name) into `settings`, first match per
/// argument, case-sensitive; unknown arguments are ignored. "-?"/"--help"
/// stops at once with kHelp, options before it having taken effect.
/// `go_silent` runs when "-silent" is seen (it redirects stdin and stderr).
CommandLineAction parseCommandLine(const std::vector<std::string>& args, ScanSettings* settings,
                                   const std::function<void()>& go_silent);

void printHelp(std::FILE* out);

enum class ConsentAnswer { kYes, kNo, kInvalid };

/// Asks for consent on `out` and reads one whitespace-delimited word from
/// `in`; prints the outcome's line.
ConsentAnswer askConsent(std::FILE* in, std::FILE* out);

}  // namespace cvn

#endif  // CVN_MAIN_COMMAND_LINE_H_
