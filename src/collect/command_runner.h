// Runs the system's tools, each under a time limit. Builders that need a
// tool take a CommandRunner so that tests hand them canned output and check
// the exact command text.
#ifndef CVN_COLLECT_COMMAND_RUNNER_H_
#define CVN_COLLECT_COMMAND_RUNNER_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <string>

namespace cvn {

using ToolDuration = std::chrono::milliseconds;

/// How long a tool may run. A profiler run can take minutes on a Mac with
/// many applications; every other tool answers in moments when it answers
/// at all.
struct ToolLimits {
  ToolDuration profiler = std::chrono::seconds(300);
  ToolDuration other = std::chrono::seconds(60);

  /// The profiler's limit as given, and the others' the smaller of it and
  /// their default.
  static ToolLimits forProfilerSeconds(int64_t seconds);
};

/// What one run of a tool printed on standard output.
struct ToolOutput {
  std::string text;
  /// The tool was stopped at its limit; `text` is what came before.
  bool timed_out = false;
};

class CommandRunner {
 public:
  virtual ~CommandRunner() = default;

  /// Starts `command` through the shell and returns at once. It runs until
  /// it ends or `limit` has passed; `id` names it to waitForOne. `chunk_size`
  /// is the read size.
  virtual void start(int id, const std::string& command, size_t chunk_size, ToolDuration limit) = 0;
  /// Waits until one started command has ended and hands over its id and
  /// output; false when none was running.
  virtual bool waitForOne(int* id, ToolOutput* output) = 0;

  /// Runs one command under the limit for tools other than the profiler.
  /// Call only while nothing else started is running.
  ToolOutput runBounded(const std::string& command, size_t chunk_size);
  /// What the command printed, up to its limit; empty when it could not be
  /// started.
  std::string run(const std::string& command, size_t chunk_size) {
    return runBounded(command, chunk_size).text;
  }

  const ToolLimits& limits() const { return limits_; }
  void setLimits(const ToolLimits& limits) { limits_ = limits; }
  /// Where each run that hit its limit is named, one line each; null (the
  /// default) says nothing.
  void setTimeoutLog(std::FILE* log) { timeout_log_ = log; }
  std::FILE* timeoutLog() const { return timeout_log_; }

 private:
  ToolLimits limits_;
  std::FILE* timeout_log_ = nullptr;
};

/// "300 s", or "250 ms" for a limit of no whole seconds.
std::string describeLimit(ToolDuration limit);

/// The runner of the real tools, made once: every command in a process group
/// of its own, ended whole at its deadline.
CommandRunner& systemCommandRunner();

}  // namespace cvn

#endif  // CVN_COLLECT_COMMAND_RUNNER_H_
