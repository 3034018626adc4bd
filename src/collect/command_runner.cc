#include "collect/command_runner.h"

#include <algorithm>

#include "collect/process_group_runner.h"

namespace cvn {
namespace {

// Collected text (a folder name) can sit in a command; a log line must not
// carry its control characters to the operator's terminal.
std::string printable(const std::string& text) {
  std::string out = text;
  for (char& c : out) {
    if (static_cast<unsigned char>(c) < 0x20 || c == 0x7f) c = '?';
  }
  return out;
}

}  // namespace

ToolLimits ToolLimits::forProfilerSeconds(int64_t seconds) {
  ToolLimits limits;
  limits.profiler = std::chrono::seconds(seconds);
  limits.other = std::min(limits.other, limits.profiler);
  return limits;
}

ToolOutput CommandRunner::runBounded(const std::string& command, size_t chunk_size) {
  constexpr int kOnlyRun = 0;
  start(kOnlyRun, command, chunk_size, limits_.other);
  int id = kOnlyRun;
  ToolOutput output;
  if (!waitForOne(&id, &output)) return ToolOutput{};
  if (output.timed_out && timeout_log_) {
    std::fprintf(timeout_log_, "%s: no answer in %s, kept what it printed\n",
                 printable(command).c_str(), describeLimit(limits_.other).c_str());
    std::fflush(timeout_log_);
  }
  return output;
}

std::string describeLimit(ToolDuration limit) {
  long long ms = static_cast<long long>(limit.count());
  if (ms % 1000 == 0) return std::to_string(ms / 1000) + " s";
  return std::to_string(ms) + " ms";
}

CommandRunner& systemCommandRunner() {
  static ProcessGroupRunner runner;
  return runner;
}

}  // namespace cvn
