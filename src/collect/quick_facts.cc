#include "collect/quick_facts.h"

#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <optional>

#include "collect/command_runner.h"
#include "collect/processor_text.h"
#include "zxml/size_text.h"

namespace cvn {

namespace {

const char kPlatformUuidCommand[] =
    "ioreg -rd1 -c IOPlatformExpertDevice | awk '/IOPlatformUUID/ { split($0, line, \"\\\"\"); "
    "printf(\"%s\", line[4]); }'";
// A UUID is 36 characters.
constexpr size_t kPlatformUuidChunk = 40;

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

// Where the older key is missing, today's profilers give the resolution
// under another key, or only the panel's pixels.
std::string displayResolution(const PlistValue& display) {
  for (const char* key :
       {"spdisplays_resolution", "_spdisplays_resolution", "_spdisplays_pixels"}) {
    if (display.find(key)) return display.textAt(key);
  }
  return std::string();
}

void readDisplays(const PlistValue& root, QuickFacts* facts) {
  const PlistValue* items = findProfilerItems(root, "SPDisplaysDataType");
  if (!items) return;
  bool have_vram = false;
  for (const PlistValue& adapter : items->items()) {
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
    for (const PlistValue& display : displays->items()) {
      if (display.textAt("spdisplays_main") != "spdisplays_yes") continue;
      facts->main_display_resolution = displayResolution(display);
      facts->main_display_edid = display.textAt("_spdisplays_edid");
      return;
    }
  }
}

void readDisks(const PlistValue& root, QuickFacts* facts) {
  double disks = 0, volumes = 0, free = 0;
  bool any_disk = false, any_volume = false;
  // NVMe disks are listed like SATA ones; their volumes are APFS containers
  // without free space, which say nothing about the volumes in them.
  const struct {
    const char* data_type;
    bool with_volumes;
  } kDiskTypes[] = {{"SPSerialATADataType", true}, {"SPNVMeDataType", false}};
  for (const auto& [data_type, with_volumes] : kDiskTypes) {
    const PlistValue* controllers = findProfilerItems(root, data_type);
    if (!controllers) continue;
    for (const PlistValue& controller : controllers->items()) {
      const PlistValue* devices = controller.findArray("_items");
      if (!devices) continue;
      for (const PlistValue& device : devices->items()) {
        std::string size = device.textAt("size");
        if (size.empty()) continue;
        disks += SizeText::toGigabytes(size);
        any_disk = true;
        const PlistValue* vols = with_volumes ? device.findArray("volumes") : nullptr;
        if (!vols) continue;
        for (const PlistValue& volume : vols->items()) {
          volumes += SizeText::toGigabytes(volume.textAt("size"));
          free += SizeText::toGigabytes(volume.textAt("free_space"));
          any_volume = true;
        }
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

std::string readPlatformUuid(CommandRunner& runner) {
  return runner.run(kPlatformUuidCommand, kPlatformUuidChunk);
}

QuickFacts readQuickFacts(const PlistValue& root, const std::string& ioreg_uuid) {
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
  facts.platform_uuid = ioreg_uuid;
  if (facts.platform_uuid.empty()) facts.platform_uuid = hardware.textAt("platform_UUID");
  const PlistValue* packages = hardware.find("packages");
  if (packages && packages->kind() == PlistValue::Kind::kInteger) {
    facts.package_count = std::to_string(static_cast<unsigned>(packages->integer()));
  } else if (!packages && hardware.find("chip_type")) {
    // One chip, as the Processors section records it.
    facts.package_count = "1";
  }
  facts.processor_count = hardware.numberTextAt("number_processors");
  // Apple Silicon counts its cores in a text, "proc 12:6:6".
  if (std::optional<int64_t> cores = coreCountOfProcText(hardware.textAt("number_processors")))
    facts.processor_count = std::to_string(*cores);
  std::string speed = hardware.textAt("current_processor_speed");
  if (!speed.empty()) facts.processor_speed = std::to_string(megahertzOfSpeedText(speed));
  facts.processor_model =
      hardware.find("cpu_type") ? hardware.textAt("cpu_type") : hardware.textAt("chip_type");
  facts.processor_maker = processorMakerOf(facts.processor_model);
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
