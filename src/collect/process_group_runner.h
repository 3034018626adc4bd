// The real tools, side by side and never waited for for ever: each command
// runs through /bin/sh in a process group of its own, and at its deadline
// the whole group is ended, so a helper a tool started cannot keep running
// either.
#ifndef CVN_COLLECT_PROCESS_GROUP_RUNNER_H_
#define CVN_COLLECT_PROCESS_GROUP_RUNNER_H_

#include <sys/types.h>

#include <chrono>
#include <deque>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "collect/command_runner.h"
#include "collect/interrupt_watch.h"

namespace cvn {

class ProcessGroupRunner : public CommandRunner {
 public:
  /// `grace` is how long a group has between SIGTERM and SIGKILL.
  explicit ProcessGroupRunner(ToolDuration grace = std::chrono::seconds(5));
  /// Ends every group still running.
  ~ProcessGroupRunner() override;

  void start(int id, const std::string& command, size_t chunk_size, ToolDuration limit) override;
  /// Reads every running command's output in one wait. When SIGINT, SIGTERM
  /// or SIGHUP arrives meanwhile, every group is ended and the signal then
  /// takes its usual course.
  bool waitForOne(int* id, ToolOutput* output) override;

  /// The process group of the command started under `id`, or -1 once it
  /// has ended.
  pid_t groupOf(int id) const;

 private:
  using Clock = std::chrono::steady_clock;
  struct Child;

  void readAvailable(Child& child);
  /// Sends SIGTERM or SIGKILL when a child's time has come, and reaps it
  /// once it has ended; true when it is done with.
  bool advance(Child& child, Clock::time_point now);
  /// The latest moment the next wait may last to.
  Clock::time_point nextWake(Clock::time_point now) const;
  void waitForReadable(Clock::time_point until);
  [[noreturn]] void endEverythingAndRaise(int signal_number);
  void finish(size_t index);

  ToolDuration grace_;
  std::vector<std::unique_ptr<Child>> running_;
  std::deque<std::pair<int, ToolOutput>> finished_;
  /// Present while any tool runs.
  std::optional<InterruptWatch> watch_;
};

}  // namespace cvn

#endif  // CVN_COLLECT_PROCESS_GROUP_RUNNER_H_
