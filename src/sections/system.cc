// The "System" section: the computer's model and UUID, the chassis, one
// entry per memory slot and one per power-management profile.
#include <string>
#include <string_view>

#include "sections/builder_util.h"
#include "sections/sections.h"
#include "zxml/size_text.h"

namespace cvn {
namespace {

// The most of ioreg's output that is kept: a UUID is 36 characters, so
// anything longer is not one.
constexpr size_t kIoregUuidKept = 40;

void addHardware(Tag& top, const TagTree& raw, std::string_view ioreg_uuid) {
  const Tag* item = findFirstItem(raw, "SPHardwareDataType");
  if (!item) return;
  Tag& system = top.addChild("System");
  Tag& computer = system.addChild("Computer-system");
  if (const TagValue* model = rawValue(*item, "machine_model")) {
    computer.setProperty("model", *model);
  } else {
    computer.setProperty("model", TagValue(""));
  }
  if (const TagValue* uuid = rawValue(*item, "platform_UUID")) {
    computer.setProperty("uuid", *uuid);
  } else {
    computer.setProperty("uuid", TagValue(ioreg_uuid.substr(0, kIoregUuidKept)));
  }
  Tag& chassis = system.addChild("Chassis");
  chassis.setProperty("manuf", TagValue("Apple Inc."));
  copyFieldIfPresent(chassis, "serial", *item, "serial_number");
}

void addMemorySlot(Tag& top, const Tag& slot, size_t number) {
  Tag& slots = top.addChild("System").addChild("Mem-slots");
  Tag& record = addComplexRecord(slots, formatText("mem-slot:%zu", number));
  if (rawText(slot, "dimm_status") != "ok") {
    record.setProperty("used", TagValue("0"));
    return;
  }
  record.setProperty("used", TagValue("1"));
  double gigabytes = SizeText::toGigabytes(rawText(slot, "dimm_size"));
  int64_t bytes = truncateToInt64(gigabytes * 1073741824.0);
  int64_t megabytes = truncateToInt64(gigabytes * 1024.0);
  TagProperty& capacity = record.setProperty("capacity", TagValue(megabytes));
  // A slot number repeated by a later bank group overwrites the capacity, so
  // the bytes beside it must follow rather than keep the first group's.
  capacity.setAnnotation("base-value", formatText("%lld", static_cast<long long>(bytes)));
}

void addMemorySlots(Tag& top, const TagTree& raw) {
  const Tag* items = findItems(raw, "SPMemoryDataType");
  if (!items) return;
  const auto& entries = items->children();
  for (size_t i = 0; i < entries.size(); ++i) {
    const Tag& entry = *entries[i];
    if (const Tag* group = entry.findChild("_items")) {
      // Numbers restart in every group: slots at the same place in two
      // groups share one entry, and the later group wins.
      const auto& banks = group->children();
      for (size_t j = 0; j < banks.size(); ++j)
        addMemorySlot(top, *banks[j], itemPosition(*banks[j], j) + 1);
    } else if (!isUnifiedMemory(entry)) {
      // Soldered memory has no slot to record.
      addMemorySlot(top, entry, itemPosition(entry, i) + 1);
    }
  }
}

struct ProfileSetting {
  const char* key;
  const char* field;
  bool is_switch;  // "Yes" gives "1", anything else "0"
};

constexpr ProfileSetting kProfileSettings[] = {
    {"System_Sleep_Timer", "system-sleep-timer", false},
    {"Disk_Sleep_Timer", "disk-sleep-timer", false},
    {"Display_Sleep_Timer", "display-sleep-timer", false},
    {"Sleep_On_Power_Button", "sleep-on-power-button", true},
    {"Automatic_Restart_On_Power_Loss", "auto-restart-on-power-loss", true},
    {"Wake_On_LAN", "wake-on-lan", true},
    {"Wake_On_AC_Change", "wake-on-ac-change", true},
    {"Wake_On_Clamshell_Open", "wake-on-clamshell-open", true},
    {"ReduceBrightness", "reduce-brightness", true},
    {"Display_Sleep_Uses_Dim", "display-sleep-uses-dim", true},
};

void addPowerProfiles(Tag& top, const TagTree& raw) {
  const Tag* items = findItems(raw, "SPPowerDataType");
  if (!items) return;
  for (const auto& item : items->children()) {
    if (rawText(*item, "_name") != "sppower_information") continue;
    const auto& profiles = item->children();
    if (profiles.empty()) return;
    for (size_t k = 0; k < profiles.size(); ++k) {
      const Tag& profile = *profiles[k];
      Tag& power = top.addChild("System").addChild("PowerManagement");
      std::string_view label = profile.name() == "AC_Power" ? "AC Power" : profile.name();
      Tag& record = power.setChildValue(formatText("Profile:%zu", k + 1), TagValue(label));
      for (const ProfileSetting& setting : kProfileSettings) {
        if (!setting.is_switch) {
          copyFieldIfPresent(record, setting.field, profile, setting.key);
        } else if (hasKey(profile, setting.key)) {
          record.setProperty(setting.field,
                             TagValue(flagText(rawText(profile, setting.key), "Yes")));
        }
      }
    }
  }
}

}  // namespace

void buildSystemSection(TagTree& snapshot, const TagTree& raw, std::string_view ioreg_uuid) {
  Tag& top = snapshot.top();
  addHardware(top, raw, ioreg_uuid);
  addMemorySlots(top, raw);
  addPowerProfiles(top, raw);
}

}  // namespace cvn
