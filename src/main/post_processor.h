// Turns the raw profiler tree into the inventory sections of the snapshot,
// one builder after the other in a fixed order.
#ifndef CVN_MAIN_POST_PROCESSOR_H_
#define CVN_MAIN_POST_PROCESSOR_H_

#include <cstdio>

#include "zxml/tag.h"

namespace cvn {

class CommandRunner;
class FileSystem;

/// Runs the fifteen builders in order. The order matters: later builders
/// work under nodes that earlier ones made (plug-ins under "Software",
/// removable disks numbered after the storage section's). With `log`, each
/// step is framed by "N..." and "done" on `out`, flushed at once.
void postProcess(TagTree& snapshot, const TagTree& raw, bool log, CommandRunner& runner,
                 FileSystem& files, std::FILE* out);

}  // namespace cvn

#endif  // CVN_MAIN_POST_PROCESSOR_H_
