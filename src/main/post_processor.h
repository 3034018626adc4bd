// Turns the raw profiler tree into the inventory sections of the snapshot,
// one builder after the other in a fixed order.
#ifndef CVN_MAIN_POST_PROCESSOR_H_
#define CVN_MAIN_POST_PROCESSOR_H_

#include <cstdio>
#include <string_view>

#include "zxml/tag.h"

namespace cvn {

class CommandRunner;
class FileSystem;

/// What the builders read besides the raw tree.
struct SectionSources {
  CommandRunner& runner;
  FileSystem& files;
  /// ioreg's platform UUID, read once while collecting.
  std::string_view ioreg_uuid;
};

/// Runs the fifteen builders in order. The order matters: later builders
/// work under nodes that earlier ones made (plug-ins under "Software",
/// removable disks numbered after the storage section's). With a `log`,
/// each step is framed there by "N..." and "done", flushed at once.
void postProcess(TagTree& snapshot, const TagTree& raw, const SectionSources& sources,
                 std::FILE* log);

}  // namespace cvn

#endif  // CVN_MAIN_POST_PROCESSOR_H_
