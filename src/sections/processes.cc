#include "sections/sections.h"

namespace cvn {

void buildProcessesSection(TagTree& snapshot, const TagTree& raw) {
  // Without a process list (the table could not be read) there is no section.
  if (const Tag* processes = raw.top().findChild("Processes"))
    snapshot.top().appendCopyOf(*processes);
}

}  // namespace cvn
