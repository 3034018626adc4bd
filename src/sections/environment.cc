#include <string>
#include <string_view>

#include "collect/command_runner.h"
#include "sections/builder_util.h"
#include "sections/sections.h"

namespace cvn {
namespace {

void addVariable(TagTree& snapshot, std::string_view line) {
  size_t equals = line.find('=');
  // Continuation lines of multi-line values carry no name.
  if (equals == std::string_view::npos) return;
  std::string name(line.substr(0, equals));
  TagValue value(line.substr(equals + 1));

  Tag& environment = snapshot.top().addChild("Environment");
  Tag& record = addComplexRecord(environment, "env-var:" + name);
  if (name == "PATH") {
    record.setProperty("value", value, "split", ":");
  } else {
    record.setProperty("value", value);
  }
  record.setProperty("system", TagValue("1"));
}

}  // namespace

void buildEnvironmentSection(TagTree& snapshot, CommandRunner& runner) {
  std::string output = runner.run("env", 300);
  std::string_view rest(output);
  while (!rest.empty()) {
    size_t end = rest.find('\n');
    addVariable(snapshot, rest.substr(0, end));
    if (end == std::string_view::npos) break;
    rest.remove_prefix(end + 1);
  }
}

}  // namespace cvn
