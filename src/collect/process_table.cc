#include "collect/process_table.h"

#include <cinttypes>

#include "collect/command_runner.h"
#include "zxml/size_text.h"
#include "zxml/tag.h"

namespace cvn {

void collectProcesses(TagTree& raw, ProcessTable& table, CommandRunner& runner) {
  std::vector<ProcessEntry> entries;
  if (!table.read(&entries)) return;
  Tag& processes = raw.top().addChild("Processes");
  char command[96];
  char record[48];
  for (size_t i = 0; i < entries.size(); ++i) {
    const ProcessEntry& entry = entries[i];
    if (entry.pid == 0) continue;  // the kernel itself
    std::snprintf(command, sizeof command, "ps -p%" PRId64 " -o user=\"\" -o command=\"\"",
                  entry.pid);
    std::string output = runner.run(command, 500);
    if (output.empty()) continue;  // gone since the table was read
    size_t space = output.find(' ');
    if (space == std::string::npos) continue;
    std::snprintf(record, sizeof record, "process:%zu", i + 1);
    Tag& process = processes.setChildValue(record, TagValue(entry.short_name));
    process.setProperty("pid", TagValue(entry.pid));
    process.setProperty("ppid", TagValue(entry.ppid));
    process.setProperty("user", TagValue(trimText(output.substr(0, space), " \n\r", kTrimBoth)));
    process.setProperty("cmd-line", TagValue(trimText(output.substr(space), " \n\r", kTrimBoth)));
  }
}

}  // namespace cvn
