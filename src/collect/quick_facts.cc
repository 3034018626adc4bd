#include "collect/quick_facts.h"

#include <cmath>
#include <cstdio>
#include <cstdlib>

#include "collect/command_runner.h"
#include "zxml/size_text.h"

namespace cvn {

namespace {

const char kPlatformUuidCommand[] =
    "ioreg -rd1 -c IOPlatformExpertDevice | awk '/IOPlatformUUID/ { split($0, line, \"\\\"\"); "
    "printf(\"%s\", line[4]); }'";

// A missing data type reads as an item without keys.
const PlistValue& firstItem(const PlistValue& root, std::string_view data_type) {
  static const PlistValue kNoItem;
  const PlistValue* item = findFirstProfilerItem(root, data_type);
  return item ? *item : kNoItem;
}

std::string wholeNumber(double value) {
  if (!(value >= 0 && value < 1e18)) return "0";
  char buf[32];
  std::snprintf(buf, sizeof buf, "%lld", static_cast<long long>(value));
  return buf;
}

std::string oneDecimal(double value) {
  char buf[64];
  std::snprintf(buf, sizeof buf, "%.1f", std::isfinite(value) ? value : 0.0);
  return buf;
}

void readDisplays(const PlistValue& root, QuickFacts* facts) {
  const PlistValue* items = findProfilerItems(root, "SPDisplaysDataType");
  if (!items) return;
  bool have_vram = false;
  for (const PlistValue& adapter : items->array) {
    if (!have_vram) {
      std::string vram = adapter.textAt("spdisplays_vram");
      if (vram.empty()) vram = adapter.textAt("spdisplays_vram_shared");
      if (!vram.empty()) {
        facts->video_memory = wholeNumber(SizeText::toKilobytes(vram) / 1024.0);
        have_vram = true;
      }
    }
    const PlistValue* displays = adapter.findArray("spdisplays_ndrvs");
    if (!displays) continue;
    for (const PlistValue& display : displays->array) {
      if (display.textAt("spdisplays_main") != "spdisplays_yes") continue;
      facts->main_display_resolution = display.textAt("spdisplays_resolution");
      facts->main_display_edid = display.textAt("_spdisplays_edid");
      return;
    }
  }
}

void readDisks(const PlistValue& root, QuickFacts* facts) {
  const PlistValue* controllers = findProfilerItems(root, "SPSerialATADataType");
  if (!controllers) return;
  double disks = 0, volumes = 0, free = 0;
  bool any_disk = false, any_volume = false;
  for (const PlistValue& controller : controllers->array) {
    const PlistValue* devices = controller.findArray("_items");
    if (!devices) continue;
    for (const PlistValue& device : devices->array) {
      std::string size = device.textAt("size");
      if (size.empty()) continue;
      disks += SizeText::toGigabytes(size);
      any_disk = true;
      const PlistValue* vols = device.findArray("volumes");
      if (!vols) continue;
      for (const PlistValue& volume : vols->array) {
        volumes += SizeText::toGigabytes(volume.textAt("size"));
        free += SizeText::toGigabytes(volume.textAt("free_space"));
        any_volume = true;
      }
    }
  }
  if (any_disk) facts->disk_capacity = oneDecimal(disks);
  if (any_volume) {
    facts->volume_capacity = oneDecimal(volumes);
    facts->volume_free = oneDecimal(free);
  }
}

}  // namespace

QuickFacts readQuickFacts(const PlistValue& root, CommandRunner& runner) {
  QuickFacts facts;
  const PlistValue& software = firstItem(root, "SPSoftwareDataType");
  facts.local_host_name = software.textAt("local_host_name");
  std::string user = software.textAt("user_name");
  size_t open = user.find('(');
  if (open != std::string::npos) {
    size_t close = user.find(')', open + 1);
    if (close != std::string::npos) facts.user_name = user.substr(open + 1, close - open - 1);
  }
  facts.os_version = software.textAt("os_version");

  const PlistValue& hardware = firstItem(root, "SPHardwareDataType");
  facts.platform_uuid = runner.run(kPlatformUuidCommand, 40);
  if (facts.platform_uuid.empty()) facts.platform_uuid = hardware.textAt("platform_UUID");
  const PlistValue* packages = hardware.find("packages");
  if (packages && packages->kind == PlistValue::Kind::kInteger) {
    facts.package_count = std::to_string(static_cast<unsigned>(packages->integer));
  }
  facts.processor_count = hardware.numberTextAt("number_processors");
  std::string speed = hardware.textAt("current_processor_speed");
  if (!speed.empty()) {
    double number = std::atof(firstWord(speed).c_str());
    // Old profilers print "2.26 GHz", very old ones "867 MHz".
    facts.processor_speed =
        wholeNumber(speed.find("MHz") != std::string::npos ? number : number * 1000);
  }
  facts.processor_model = hardware.textAt("cpu_type");
  if (facts.processor_model.find("Intel") != std::string::npos)
    facts.processor_maker = "GenuineIntel";
  facts.machine_model = hardware.textAt("machine_model");
  facts.system_maker = "Apple Inc.";
  std::string memory = hardware.textAt("physical_memory");
  if (!memory.empty()) facts.physical_memory = wholeNumber(SizeText::toKilobytes(memory) / 1024.0);

  readDisplays(root, &facts);
  readDisks(root, &facts);
  return facts;
}

std::string readSerialNumber(const PlistValue& root) {
  return firstItem(root, "SPHardwareDataType").textAt("serial_number");
}

}  // namespace cvn
