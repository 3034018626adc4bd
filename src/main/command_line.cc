#include "main/command_line.h"

#include <cstdint>
#include <cstring>

namespace cvn {
namespace {

bool startsWith(const std::string& s, const char* prefix) {
  return s.compare(0, std::strlen(prefix), prefix) == 0;
}

// Whole seconds, at least one; anything else leaves the default.
bool parseSeconds(const std::string& text, int64_t* seconds) {
  if (text.empty() || text.size() > 10) return false;
  int64_t value = 0;
  for (char c : text) {
    if (c < '0' || c > '9') return false;
    value = value * 10 + (c - '0');
  }
  if (value < 1 || value > INT32_MAX) return false;
  *seconds = value;
  return true;
}

}  // namespace

CommandLineAction parseCommandLine(const std::vector<std::string>& args, ScanSettings* settings,
                                   const std::function<void()>& go_silent) {
  for (const std::string& arg : args) {
    if (arg == "-?" || arg == "--help") return CommandLineAction::kHelp;
    if (arg == "/silent" || arg == "-silent") {
      if (go_silent) go_silent();
      settings->silent = true;
    } else if (startsWith(arg, "/ip:") || startsWith(arg, "-ip:")) {
      settings->ip = arg.substr(4);
    } else if (arg == "/log" || arg == "-log") {
      settings->log = true;
    } else if (startsWith(arg, "/login:") || startsWith(arg, "-login:")) {
      settings->login = arg.substr(arg.find(':') + 1);
    } else if (arg == "/debug" || arg == "-debug") {
      settings->debug = true;
    } else if (startsWith(arg, "/timeout:") || startsWith(arg, "-timeout:")) {
      parseSeconds(arg.substr(9), &settings->profiler_timeout_seconds);
    }
  }
  settings->scan_requested = true;
  return CommandLineAction::kScan;
}

void printHelp(std::FILE* out) {
  std::fputs("Copyright (c) 2010-2014 Corvane \n", out);
  std::fputs("Corvane's Mac OS X Agent\n", out);
  std::fputs("Usage: cvnmacagent [OPTION...]\n", out);
  std::fputs("-ip:[ipaddr],\t\t/ip:[ipaddr]\t\tSet Current IP Address\n", out);
  std::fputs("--help,\t\t\t-?\t\t\tShow this help message\n", out);
  std::fputs("-debug,\t\t\t/debug\t\t\tSave offline scan result in raw format to send to support\n",
             out);
  std::fputs("-silent,\t\t/silent\t\t\tStart offline scan without output to console\n", out);
  std::fputs("\n\nFor additional information contact us: support@corvane.example\n", out);
  std::fputs("Visit our site: https://www.corvane.example & forum: https://forum.corvane.example\n",
             out);
}

ConsentAnswer askConsent(std::FILE* in, std::FILE* out) {
  std::fputs("Corvane scanner for MacOS X\nDo you want to start the scan of local computer?(y/n)\n",
             out);
  std::fflush(out);
  // The width keeps an over-long answer inside the buffer; the rest of it is
  // simply not read.
  char word[128] = {0};
  if (std::fscanf(in, "%127s", word) != 1) word[0] = '\0';
  if (std::strcmp(word, "y") == 0) {
    std::fputs("Scan started...\n", out);
    return ConsentAnswer::kYes;
  }
  if (std::strcmp(word, "n") == 0) {
    std::fputs("Scan canceled.\n", out);
    return ConsentAnswer::kNo;
  }
  std::fputs("Incorrect input. Application terminated.\n", out);
  return ConsentAnswer::kInvalid;
}

}  // namespace cvn
