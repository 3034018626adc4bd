// A CommandRunner that answers from a table and records what was asked.
#ifndef CVN_TESTS_FAKE_COMMAND_RUNNER_H_
#define CVN_TESTS_FAKE_COMMAND_RUNNER_H_

#include <map>
#include <string>
#include <utility>
#include <vector>

#include "collect/command_runner.h"

namespace cvn {

class FakeCommandRunner : public CommandRunner {
 public:
  void answer(const std::string& command, std::string output) {
    outputs_[command] = std::move(output);
  }
  std::string run(const std::string& command, size_t chunk_size) override {
    commands_ran_.push_back(command);
    chunk_sizes_.push_back(chunk_size);
    auto it = outputs_.find(command);
    return it == outputs_.end() ? std::string() : it->second;
  }

  std::vector<std::string> commands_ran_;
  std::vector<size_t> chunk_sizes_;

 private:
  std::map<std::string, std::string> outputs_;
};

}  // namespace cvn

#endif  // CVN_TESTS_FAKE_COMMAND_RUNNER_H_
