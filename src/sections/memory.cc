// The "Memory" section: one record per memory module slot, and the installed
// memory of the whole machine under "General-info".
#include <string>

#include "sections/builder_util.h"
#include "sections/sections.h"
#include "zxml/trim_text.h"

namespace cvn {
namespace {

// `nested`: the slot comes from a bank group's own "_items". Flat layouts
// (older profilers) may leave the maker out, and then no "manuf" is written.
void addSlot(Tag& memory, const Tag& slot, bool nested, int& counter) {
  Tag& record = memory.addChild(formatText("Memory-slot:%d", counter++));
  record.setProperty("used", TagValue(flagText(rawText(slot, "dimm_status"), "ok")));
  if (nested) {
    copyField(record, "manuf", slot, "dimm_manufacturer");
  } else {
    copyFieldIfPresent(record, "manuf", slot, "dimm_manufacturer");
  }
  record.setProperty("capacity", TagValue(sizeInMegabytes(rawText(slot, "dimm_size"))));
  copyField(record, "mem-type", slot, "dimm_type");
  record.setProperty("speed", TagValue(firstWord(rawText(slot, "dimm_speed"))));
  copyField(record, "bank-label", slot, "_name");
}

// Soldered memory has no slot, speed or bank; the record says how much there
// is, of which type and by whom.
void addUnifiedMemory(Tag& memory, const Tag& item, int& counter) {
  Tag& record = memory.addChild(formatText("Memory-slot:%d", counter++));
  record.setProperty("used", TagValue("1"));
  copyFieldIfPresent(record, "manuf", item, "dimm_manufacturer");
  record.setProperty("capacity", TagValue(sizeInMegabytes(rawText(item, "SPMemoryDataType"))));
  copyFieldIfPresent(record, "mem-type", item, "dimm_type");
}

}  // namespace

void buildMemorySection(TagTree& snapshot, const TagTree& raw) {
  Tag& top = snapshot.top();
  const Tag* items = findItems(raw, "SPMemoryDataType");
  if (items && !items->children().empty()) {
    Tag& memory = top.addChild("Memory");
    int counter = 1;
    for (const auto& item : items->children()) {
      if (const Tag* group = item->findChild("_items")) {
        for (const auto& slot : group->children()) addSlot(memory, *slot, true, counter);
      } else if (isUnifiedMemory(*item)) {
        addUnifiedMemory(memory, *item, counter);
      } else {
        addSlot(memory, *item, false, counter);
      }
    }
  }

  const Tag* hardware = findFirstItem(raw, "SPHardwareDataType");
  if (!hardware) return;
  Tag& general = top.addChild("Memory").addChild("General-info");
  general.setProperty("physical-memory",
                      TagValue(sizeInMegabytes(rawText(*hardware, "physical_memory"))));
}

}  // namespace cvn
