// USB devices: removable storage joins the disks under "Storage" (asking
// diskutil for its media name), every other device goes under
// "Peripherals"/"USB". Hubs are walked through, not recorded. From macOS 26
// the devices are only in the USB host data type, which has its own keys.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>
#include <string_view>

#include "collect/command_runner.h"
#include "collect/shell_quote.h"
#include "sections/builder_util.h"
#include "sections/sections.h"
#include "sections/volume_fields.h"
#include "sections/written_volumes.h"
#include "zxml/size_text.h"
#include "zxml/trim_text.h"

namespace cvn {
namespace {

constexpr size_t kDiskutilChunkSize = 200;
constexpr std::string_view kMediaNameLabel = "Device / Media Name:";
constexpr std::string_view kMediaNameEnd = " Media\n";
// USB allows seven tiers of hubs; anything deeper is a damaged tree, and
// walking it must not exhaust the stack.
constexpr int kMaxHubDepth = 32;

constexpr std::string_view kDescriptorKeys[] = {"product_id", "vendor_id",     "bcd_device",
                                                "serial_num", "device_speed",  "manufacturer",
                                                "bus_power",  "bus_power_used"};

// Raw keys and the fields (or texts) they give.
struct KeyText {
  std::string_view key;
  const char* text;
};

constexpr KeyText kDeviceFields[] = {
    {"product_id", "product-id"},        {"vendor_id", "vendor-id"}, {"bcd_device", "bcd-device"},
    {"serial_num", "serial-number"},     {"manufacturer", "manuf"},  {"bus_power", "bus-power"},
    {"bus_power_used", "bus-power-used"}};
constexpr KeyText kHostDeviceFields[] = {{"USBDeviceKeyProductID", "product-id"},
                                         {"USBDeviceKeyVendorID", "vendor-id"},
                                         {"USBDeviceKeyProductVersion", "bcd-device"},
                                         {"USBDeviceKeySerialNumber", "serial-number"},
                                         {"USBDeviceKeyVendorName", "manuf"}};
constexpr KeyText kSpeedMegabits[] = {
    {"full_speed", "12"}, {"low_speed", "1.5"}, {"high_speed", "480"}};

template <size_t N>
const char* fieldFor(const KeyText (&table)[N], std::string_view key) {
  for (const KeyText& entry : table)
    if (entry.key == key) return entry.text;
  return nullptr;
}

// The profilers of 10.5 and 10.6 sort the USB descriptor keys by a letter
// prefix ("a_product_id", "h_bus_power"); behind it is the key that later
// profilers write plainly.
std::string_view descriptorKey(std::string_view key) {
  if (key.size() > 2 && key[0] >= 'a' && key[0] <= 'z' && key[1] == '_') {
    std::string_view rest = key.substr(2);
    for (std::string_view known : kDescriptorKeys) {
      if (rest == known) return rest;
    }
  }
  return key;
}

// The media name sits between the label and " Media" at the end of its line.
std::optional<std::string> findMediaName(const std::string& diskutil_output) {
  size_t label = diskutil_output.find(kMediaNameLabel);
  if (label == std::string::npos) return std::nullopt;
  size_t start = label + kMediaNameLabel.size();
  size_t end = diskutil_output.find(kMediaNameEnd, start);
  if (end == std::string::npos) return std::nullopt;
  return trimText(std::string_view(diskutil_output).substr(start, end - start), " \n\r", kTrimBoth);
}

// The megabits per second of a link speed text of the USB host type ("12
// Mb/s", "5 Gb/s", "USB 2.0 (480 Mb/s)"): the first number followed by a
// rate unit, as text. Nothing for a form that says no rate.
std::optional<std::string> linkSpeedMegabits(std::string_view text) {
  constexpr std::string_view kDigits = "0123456789";
  for (size_t start = text.find_first_of(kDigits); start != std::string_view::npos;) {
    size_t end = std::min(text.find_first_not_of("0123456789.,", start), text.size());
    std::string number(text.substr(start, end - start));
    for (char& c : number)
      if (c == ',') c = '.';
    std::string_view unit = text.substr(end);
    unit.remove_prefix(std::min(unit.find_first_not_of(' '), unit.size()));
    double rate = std::strtod(number.c_str(), nullptr);
    if (unit.substr(0, 2) == "Gb") rate *= 1000;
    if ((unit.substr(0, 2) == "Gb" || unit.substr(0, 2) == "Mb") && rate > 0 && rate < 1e9) {
      char buffer[32];
      std::snprintf(buffer, sizeof buffer, "%.10g", rate);
      return std::string(buffer);
    }
    start = text.find_first_of(kDigits, end);
  }
  return std::nullopt;
}

class UsbWriter {
 public:
  UsbWriter(Tag& top, CommandRunner& runner, WrittenVolumes& written)
      : top_(top), runner_(runner), written_(written) {}

  void addDevice(const Tag& device, int depth = 0) {
    const TagValue* removable = rawValue(device, "removable_media");
    if (removable && removable->isText() && removable->text() == "yes") {
      addRemovable(device, device);
      return;
    }
    // Today's profilers keep a storage device's disks in a "Media" list.
    if (const Tag* media = device.findChild("Media"); media && !media->children().empty()) {
      for (const auto& medium : media->children()) addRemovable(device, *medium);
      return;
    }
    if (const Tag* children = device.findChild("_items")) {
      if (depth < kMaxHubDepth) {
        for (const auto& child : children->children()) addDevice(*child, depth + 1);
      }
      return;
    }
    addPeripheral(device);
  }

  /// A device of the USB host type; hubs are walked through.
  void addHostDevice(const Tag& device, int depth = 0) {
    if (const Tag* children = device.findChild("_items")) {
      if (depth < kMaxHubDepth) {
        for (const auto& child : children->children()) addHostDevice(*child, depth + 1);
      }
      return;
    }
    Tag& record = addDeviceRecord(device);
    for (const auto& prop : device.properties()) {
      std::string_view key = prop->name();
      if (key == "USBDeviceKeyLinkSpeed") {
        if (std::optional<std::string> speed = linkSpeedMegabits(prop->value().text()))
          record.setProperty("device-speed", TagValue(*speed));
      } else if (const char* field = fieldFor(kHostDeviceFields, key)) {
        record.setProperty(field, prop->value());
      }
    }
  }

 private:
  void addPeripheral(const Tag& device) {
    Tag& record = addDeviceRecord(device);
    for (const auto& prop : device.properties()) {
      std::string_view key = descriptorKey(prop->name());
      if (key == "device_speed") {
        // Megabits per second; speeds without a known rate are left out.
        if (const char* rate = fieldFor(kSpeedMegabits, prop->value().text()))
          record.setProperty("device-speed", TagValue(rate));
      } else if (const char* field = fieldFor(kDeviceFields, key)) {
        record.setProperty(field, prop->value());
      }
    }
  }

  Tag& addDeviceRecord(const Tag& device) {
    ++devices_;
    Tag& record =
        top_.addChild("Peripherals").addChild("USB").addChild(formatText("Device:%d", devices_));
    if (const TagValue* name = rawValue(device, "_name")) record.setValue(*name);
    return record;
  }

  // `medium` holds the size, the disk's name and the volumes: the device
  // itself on older profilers, an entry of its "Media" list on today's.
  void addRemovable(const Tag& device, const Tag& medium) {
    Tag& physical = top_.addChild("Storage").addChild("Physical-disks");
    Tag& disk = physical.addChild(physical.nextNumberedName("Removable:"));
    if (const TagValue* name = rawValue(device, "_name")) disk.setValue(*name);
    disk.setProperty("media-type", TagValue("2"));
    writeRemovableKeys(disk, device, false);
    if (&medium != &device) writeRemovableKeys(disk, medium, true);
    disk.setProperty("interface", TagValue("USB"));
    int64_t partitions = 0;
    if (const Tag* volumes = medium.findChild("volumes")) {
      for (const auto& volume : volumes->children()) {
        if (addVolume(*volume)) ++partitions;
      }
    }
    disk.setProperty("partitions", TagValue(partitions));
  }

  // `in_media_list`: the keys of a "Media" entry, whose size texts are
  // decimal, so its byte count is the better source.
  void writeRemovableKeys(Tag& disk, const Tag& device, bool in_media_list) {
    for (const auto& prop : device.properties()) {
      std::string_view key = descriptorKey(prop->name());
      const TagValue& value = prop->value();
      if (key == "bcd_device") {
        disk.setProperty("bcd-device", value);
      } else if (key == "serial_num") {
        disk.setProperty("serial", value);
      } else if (key == "device_speed") {
        std::string_view speed = value.text();
        const char* code = speed == "full_speed" ? "1" : speed == "low_speed" ? "0" : "2";
        disk.setProperty("device-speed", TagValue(code));
      } else if (key == "manufacturer") {
        disk.setProperty("manufacturer", value);
      } else if (key == "bus_power") {
        disk.setProperty("bus-power", value);
      } else if (key == "bus_power_used") {
        disk.setProperty("bus-power-used", value);
      } else if (key == "size") {
        writeRemovableSize(disk, device, value, in_media_list);
      } else if (key == "bsd_name") {
        writeMediaName(disk, value.text());
      }
    }
  }

  static void writeRemovableSize(Tag& disk, const Tag& device, const TagValue& size,
                                 bool in_media_list) {
    double gigabytes = SizeText::toDecimalGigabytes(size.text(), true);
    const TagValue* count = rawValue(device, "size_in_bytes");
    if (in_media_list && count && count->isInt()) {
      // Rounded as the text is: a fraction above .4 counts up.
      double exact = bytesToDecimalGigabytes(count->asInt());
      gigabytes = static_cast<double>(truncateToInt64(exact));
      if (exact - gigabytes > 0.4) gigabytes += 1.0;
    }
    TagValue whole(truncateToInt64(gigabytes));
    if (const TagValue* bytes = rawValue(device, "size_in_bytes")) {
      std::string base = formatText("%lld", static_cast<long long>(rawBytes(*bytes)));
      disk.setProperty("size", whole, "base-value", base.c_str());
    } else {
      disk.setProperty("size", whole);
    }
  }

  void writeMediaName(Tag& disk, std::string_view bsd_name) {
    // No name, nothing to ask diskutil about.
    if (bsd_name.empty()) return;
    std::string output = runner_.run("diskutil info " + shellQuote("/dev/" + std::string(bsd_name)),
                                     kDiskutilChunkSize);
    if (std::optional<std::string> media = findMediaName(output)) {
      disk.setProperty("model", TagValue(*media));
    }
  }

  // Volumes the profiler lists without free space (not mounted) are left out.
  // One already written (by the disk section, or under another device) is
  // counted but not written again.
  bool addVolume(const Tag& volume) {
    if (!hasKey(volume, "_name") || !hasKey(volume, "free_space")) return false;
    if (written_.holds(volume)) return true;
    written_.add(volume);
    Tag& logical = top_.addChild("Storage").addChild("Logical-disks");
    Tag& partition = logical.setChildValue(logical.nextNumberedName("partition:"),
                                           TagValue(rawText(volume, "_name")));
    writeFileSystem(partition, volume);
    copyFieldIfPresent(partition, "bsd-name", volume, "bsd_name");
    copyFieldIfPresent(partition, "mount-point", volume, "mount_point");
    VolumeSpace space = writeVolumeSpace(partition, volume);
    writeUsedPercent(partition, space);
    return true;
  }

  Tag& top_;
  CommandRunner& runner_;
  WrittenVolumes& written_;
  int devices_ = 0;
};

}  // namespace

void buildUsbSection(TagTree& snapshot, const TagTree& raw, CommandRunner& runner,
                     WrittenVolumes& written) {
  UsbWriter writer(snapshot.top(), runner, written);
  bool any_device = false;
  if (const Tag* buses = findItems(raw, "SPUSBDataType")) {
    for (const auto& bus : buses->children()) {
      const Tag* devices = bus->findChild("_items");
      if (!devices) continue;
      for (const auto& device : devices->children()) {
        writer.addDevice(*device);
        any_device = true;
      }
    }
  }
  // macOS 26 and later leave the older type empty.
  if (any_device) return;
  const Tag* host_buses = findItems(raw, "SPUSBHostDataType");
  if (!host_buses) return;
  for (const auto& bus : host_buses->children()) {
    const Tag* devices = bus->findChild("_items");
    if (!devices) continue;
    for (const auto& device : devices->children()) writer.addHostDevice(*device);
  }
}

}  // namespace cvn
