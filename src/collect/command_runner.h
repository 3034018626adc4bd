// Runs the system's tools. Builders that need a tool take a CommandRunner so
// that tests hand them canned output and check the exact command text.
#ifndef CVN_COLLECT_COMMAND_RUNNER_H_
#define CVN_COLLECT_COMMAND_RUNNER_H_

#include <cstddef>
#include <string>
#include <string_view>

namespace cvn {

class CommandRunner {
 public:
  virtual ~CommandRunner() = default;
  /// The command's whole standard output (run through the shell); empty when
  /// the command could not be started. `chunk_size` is the read size.
  virtual std::string run(const std::string& command, size_t chunk_size) = 0;
};

/// popen/pclose; the first read is retried up to three times while it yields
/// nothing, then reading goes on while each read fills the whole chunk.
class PipeCommandRunner : public CommandRunner {
 public:
  std::string run(const std::string& command, size_t chunk_size) override;
};

/// The process-wide runner used by the scan.
CommandRunner& systemCommandRunner();

/// `text` ready to stand inside double quotes in a shell command: the
/// characters the shell still interprets there ($ ` " \) are escaped, so a
/// value never ends the quotes or starts a substitution.
std::string escapeForDoubleQuotes(std::string_view text);
/// `text` as one shell word: unchanged when it holds only characters that
/// are safe unquoted ([A-Za-z0-9_./:@%+,=-]), else single-quoted.
std::string shellQuote(std::string_view text);

}  // namespace cvn

#endif  // CVN_COLLECT_COMMAND_RUNNER_H_
