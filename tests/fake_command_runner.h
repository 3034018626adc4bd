// A CommandRunner that answers from a table and records what was asked.
#ifndef CVN_TESTS_FAKE_COMMAND_RUNNER_H_
#define CVN_TESTS_FAKE_COMMAND_RUNNER_H_

#include <algorithm>
#include <deque>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "collect/command_runner.h"

namespace cvn {

class FakeCommandRunner : public CommandRunner {
 public:
  /// Every run of `command` prints `output`.
  void answer(const std::string& command, std::string output) {
    outputs_[command] = ToolOutput{std::move(output), false};
  }
  /// The next runs of `command` end like these, one each, before `answer`.
  void answerInTurn(const std::string& command, std::vector<ToolOutput> outputs) {
    for (ToolOutput& output : outputs) in_turn_[command].push_back(std::move(output));
  }
  /// Every run of `command` hits its limit after printing `partial`.
  void hang(const std::string& command, std::string partial = "") {
    outputs_[command] = ToolOutput{std::move(partial), true};
  }

  void start(int id, const std::string& command, size_t chunk_size, ToolDuration limit) override {
    commands_ran_.push_back(command);
    chunk_sizes_.push_back(chunk_size);
    limits_given_.push_back(limit);
    running_.emplace_back(id, respond(command));
    most_at_once_ = std::max(most_at_once_, running_.size());
  }
  bool waitForOne(int* id, ToolOutput* output) override {
    if (running_.empty()) return false;
    auto ended = last_started_ends_first ? running_.end() - 1 : running_.begin();
    *id = ended->first;
    *output = std::move(ended->second);
    running_.erase(ended);
    return true;
  }

  /// Runs end in the reverse order of their start instead of in it.
  bool last_started_ends_first = false;
  std::vector<std::string> commands_ran_;
  std::vector<size_t> chunk_sizes_;
  std::vector<ToolDuration> limits_given_;
  size_t most_at_once_ = 0;

 protected:
  virtual ToolOutput respond(const std::string& command) {
    auto turn = in_turn_.find(command);
    if (turn != in_turn_.end() && !turn->second.empty()) {
      ToolOutput next = std::move(turn->second.front());
      turn->second.pop_front();
      return next;
    }
    auto it = outputs_.find(command);
    return it == outputs_.end() ? ToolOutput{} : it->second;
  }

 private:
  std::map<std::string, ToolOutput> outputs_;
  std::map<std::string, std::deque<ToolOutput>> in_turn_;
  std::deque<std::pair<int, ToolOutput>> running_;
};

}  // namespace cvn

#endif  // CVN_TESTS_FAKE_COMMAND_RUNNER_H_
