#include "collect/process_table.h"

#include <cinttypes>
#include <string_view>
#include <unordered_map>

#include "collect/command_runner.h"
#include "zxml/tag.h"
#include "zxml/trim_text.h"

namespace cvn {
namespace {

// One listing for the whole table. Asking ps once per process cost a ps run
// per process, and each of those reads the whole table itself: the scan grew
// with the square of the process count. "-ww" keeps a long command line
// whole instead of cutting it at the terminal's width; empty headers leave
// out the header line. Valid for the BSD ps of the Mac and for procps.
constexpr char kListingCommand[] = "ps -axww -o pid= -o user= -o command=";
constexpr size_t kListingChunk = 1 << 16;
// More digits than any pid has: such a line is not a record.
constexpr size_t kMaxPidDigits = 18;

// A record line starts with the pid, right-aligned in its column, followed
// by a blank or the line's end. Sets `pid` and `rest`: what follows the pid
// and its blanks, up to the line's end.
bool readRecordLine(std::string_view line, int64_t* pid, std::string_view* rest) {
  size_t i = line.find_first_not_of(' ');
  if (i == std::string_view::npos) return false;
  size_t digits = 0;
  int64_t value = 0;
  for (; i < line.size() && line[i] >= '0' && line[i] <= '9'; ++i, ++digits) {
    if (digits == kMaxPidDigits) return false;
    value = value * 10 + (line[i] - '0');
  }
  if (digits == 0 || (i < line.size() && line[i] != ' ')) return false;
  while (i < line.size() && line[i] == ' ') ++i;
  *pid = value;
  *rest = line.substr(i);
  return true;
}

// For each listed pid, what "ps -p PID -o user= -o command=" prints for that
// process: the user column onward. A command holding a line break goes on
// over the next lines, which do not start like a record; they stay part of
// it, as they were part of the per-process output. A pid listed twice keeps
// its first line.
std::unordered_map<int64_t, std::string_view> splitListing(std::string_view listing) {
  std::unordered_map<int64_t, std::string_view> records;
  std::string_view* open = nullptr;  // the record that later lines continue
  for (size_t at = 0; at < listing.size();) {
    size_t end = listing.find('\n', at);
    if (end == std::string_view::npos) end = listing.size();
    std::string_view line = listing.substr(at, end - at);
    int64_t pid = 0;
    std::string_view rest;
    if (readRecordLine(line, &pid, &rest)) {
      auto inserted = records.emplace(pid, rest);
      open = inserted.second ? &inserted.first->second : nullptr;
    } else if (open) {
      const char* start = open->data();
      *open = std::string_view(start, static_cast<size_t>(line.data() + line.size() - start));
    }
    at = end + 1;
  }
  return records;
}

}  // namespace

void collectProcesses(TagTree& raw, ProcessTable& table, CommandRunner& runner) {
  std::vector<ProcessEntry> entries;
  if (!table.read(&entries)) return;
  Tag& processes = raw.top().addChild("Processes");
  bool any = false;
  for (const ProcessEntry& entry : entries) any = any || entry.pid != 0;
  if (!any) return;
  // Read after the table, so a process in the table that has exited since
  // is missing from the listing and left out.
  const std::string listing = runner.run(kListingCommand, kListingChunk);
  const std::unordered_map<int64_t, std::string_view> listed = splitListing(listing);
  char record[48];
  for (size_t i = 0; i < entries.size(); ++i) {
    const ProcessEntry& entry = entries[i];
    if (entry.pid == 0) continue;  // the kernel itself
    auto found = listed.find(entry.pid);
    if (found == listed.end()) continue;  // gone since the table was read
    std::string_view output = found->second;
    size_t space = output.find(' ');
    if (space == std::string_view::npos) continue;
    std::snprintf(record, sizeof record, "process:%zu", i + 1);
    Tag& process = processes.setChildValue(record, TagValue(entry.short_name));
    process.setProperty("pid", TagValue(entry.pid));
    process.setProperty("ppid", TagValue(entry.ppid));
    process.setProperty("user", TagValue(trimText(output.substr(0, space), " \n\r", kTrimBoth)));
    process.setProperty("cmd-line", TagValue(trimText(output.substr(space), " \n\r", kTrimBoth)));
  }
}

}  // namespace cvn
