#include <string>
#include <string_view>

#include "collect/command_runner.h"
#include "collect/shell_quote.h"
#include "sections/builder_util.h"
#include "sections/sections.h"
#include "zxml/trim_text.h"

namespace cvn {
namespace {

constexpr std::string_view kBlanks = "\n\t ";

// `dscl` prints the attributes of a record in alphabetical order, so each
// label is looked for after the home directory and every value ends where
// the next known label (or its line) ends. A label or an end marker that is
// missing must never send a search past the end of the output.
class DsclRecord {
 public:
  DsclRecord(std::string_view output, size_t start) : output_(output), start_(start) {}

  /// Text between `label` and `end_label` (or the end of the output when
  /// `end_label` is missing), trimmed. False when `label` is missing.
  bool findBetween(std::string_view label, std::string_view end_label, std::string* out) const {
    size_t from = valueStart(label);
    if (from == std::string_view::npos) return false;
    size_t to = output_.find(end_label, from);
    *out = trimmed(from, to);
    return true;
  }

  /// Text after `label` up to the end of its line, trimmed.
  bool findLine(std::string_view label, std::string* out) const {
    return findBetween(label, "\n", out);
  }

 private:
  size_t valueStart(std::string_view label) const {
    size_t at = output_.find(label, start_);
    return at == std::string_view::npos ? at : at + label.size();
  }
  std::string trimmed(size_t from, size_t to) const {
    if (to == std::string_view::npos) to = output_.size();
    return trimText(output_.substr(from, to - from), kBlanks, kTrimBoth);
  }

  std::string_view output_;
  size_t start_;
};

void addAccount(Tag& accounts, const std::string& folder, std::string_view output) {
  size_t home = output.find("\nNFSHomeDirectory:");
  // Folders such as Shared have no account behind them.
  if (home == std::string_view::npos) return;
  DsclRecord record(output, home);

  std::string name;
  if (!record.findBetween("RecordName:", "RecordType:", &name)) return;
  Tag& account = accounts.setChildValue("usr-acc:" + name, TagValue(name));

  std::string text;
  if (record.findBetween("RealName:", "RecordName:", &text)) account.setProperty("fullname", text);
  if (record.findLine("PrimaryGroupID:", &text)) account.setProperty("group", text);
  if (record.findLine("UniqueID:", &text)) account.setProperty("id", text);
  if (record.findLine("UserShell:", &text)) account.setProperty("shell", text);
  account.setProperty("hdir", TagValue("/users/" + folder));
  account.setProperty("is-system-user", TagValue("0"));
}

}  // namespace

void buildUsersSection(TagTree& snapshot, CommandRunner& runner) {
  ToolOutput listed;
  // /Users always holds at least Shared, so an empty listing means that the
  // tool did not answer; ask again, unless it hung.
  do {
    listed = runner.runBounded("ls -1 /Users/", 100);
  } while (listed.text.empty() && !listed.timed_out);
  const std::string& listing = listed.text;

  size_t line_start = 0;
  // Text after the last line break is not a complete line and is not used.
  for (size_t line_end = listing.find('\n'); line_end != std::string::npos;
       line_start = line_end + 1, line_end = listing.find('\n', line_start)) {
    std::string folder = listing.substr(line_start, line_end - line_start);
    std::string output =
        runner.run("dscl . -read \"/users/" + escapeForDoubleQuotes(folder) + "\"", 100);
    if (output.empty()) continue;
    Tag& accounts = snapshot.top().addChild("User-accounts");
    addAccount(accounts, folder, output);
  }
}

}  // namespace cvn
