// "Storage": the disks and drives of the serial ATA, parallel SCSI and
// parallel ATA buses, and the volumes of each disk.
#include <string>

#include "sections/builder_util.h"
#include "sections/sections.h"
#include "sections/volume_fields.h"
#include "zxml/size_text.h"

namespace cvn {
namespace {

enum class DiskBus { kSerialAta, kParallelScsi };

// The three numberings run across all data types, so a SCSI disk found after
// two SATA disks is the third disk.
class StorageWriter {
 public:
  explicit StorageWriter(Tag& top) : top_(top) {}

  void addDrive(const Tag& device) {
    Tag& drive = physicalDisks().addChild(formatText("CD:%d", ++drives_));
    copyFieldIfPresent(drive, "model", device, "device_model");
  }

  void addDisk(const Tag& device, DiskBus bus) {
    Tag& disk = physicalDisks().addChild(formatText("HDD:%d", ++disks_));
    copyFieldIfPresent(disk, "model", device, "device_model");
    if (bus == DiskBus::kSerialAta) {
      disk.setProperty("interface", TagValue("SATA"));
      disk.setProperty("mediatype", TagValue(int64_t{3}), "type", "media-type");
    } else {
      // The console has always received the SCSI media type as text.
      disk.setProperty("interface", TagValue("SCSI"));
      disk.setProperty("mediatype", TagValue("3"), "type", "media-type");
    }
    writeDiskSize(disk, device);
    copyFieldIfPresent(disk, "serial", device, "device_serial");
    copyFieldIfPresent(disk, "fw-rev", device, "device_revision");
    int64_t partitions = 0;
    if (const Tag* volumes = device.findChild("volumes")) {
      for (const auto& volume : volumes->children()) {
        if (addVolume(*volume)) ++partitions;
      }
    }
    disk.setProperty("partitions", TagValue(partitions));
  }

 private:
  Tag& physicalDisks() { return top_.addChild("Storage").addChild("Physical-disks"); }
  Tag& logicalDisks() { return top_.addChild("Storage").addChild("Logical-disks"); }

  static void writeDiskSize(Tag& disk, const Tag& device) {
    int64_t bytes = 0;
    double gigabytes = 0.0;
    if (const TagValue* size_in_bytes = rawValue(device, "size_in_bytes")) {
      bytes = rawBytes(*size_in_bytes);
      gigabytes = bytesToDecimalGigabytes(bytes);
    } else if (hasKey(device, "size")) {
      // The text form ("500,11 GB") is rounded: a fraction above .4 counts up.
      std::string text = rawText(device, "size");
      gigabytes = SizeText::toDecimalGigabytes(text, true);
      bytes = SizeText::toBytes(text);
    } else {
      return;
    }
    std::string base = formatText("%lld", static_cast<long long>(bytes));
    disk.setProperty("size", TagValue(truncateToInt64(gigabytes)), "base-value", base.c_str());
  }

  bool addVolume(const Tag& volume) {
    if (!hasKey(volume, "_name")) return false;
    Tag& partition = logicalDisks().setChildValue(formatText("partition:%d", ++volumes_),
                                                  TagValue(rawText(volume, "_name")));
    if (rawText(volume, "iocontent") == "Apple_CoreStorage") {
      partition.setProperty("kind", TagValue("encrypted"));
    }
    writeFileSystem(partition, volume);
    VolumeSpace space = writeVolumeSpace(partition, volume);
    copyFieldIfPresent(partition, "mount-point", volume, "mount_point");
    writeUsedPercent(partition, space);
    return true;
  }

  Tag& top_;
  int disks_ = 0;
  int drives_ = 0;
  int volumes_ = 0;
};

const Tag* childItems(const Tag& tag) { return tag.findChild("_items"); }

void addSerialAta(StorageWriter& writer, const TagTree& raw) {
  const Tag* controllers = findItems(raw, "SPSerialATADataType");
  if (!controllers) return;
  for (const auto& controller : controllers->children()) {
    const Tag* devices = childItems(*controller);
    if (!devices) continue;
    for (const auto& device : devices->children()) {
      const TagValue* smart = rawValue(*device, "smart_status");
      // Optical drives report no SMART status, or "Not Supported".
      if (!smart || (smart->isText() && smart->text() == "Not Supported")) {
        writer.addDrive(*device);
      } else {
        writer.addDisk(*device, DiskBus::kSerialAta);
      }
    }
  }
}

void addParallelScsi(StorageWriter& writer, const TagTree& raw) {
  const Tag* cards = findItems(raw, "SPParallelSCSIDataType");
  if (!cards) return;
  for (const auto& card : cards->children()) {
    const Tag* buses = childItems(*card);
    if (!buses) continue;
    for (const auto& bus : buses->children()) {
      const Tag* devices = childItems(*bus);
      if (!devices) continue;
      for (const auto& device : devices->children())
        writer.addDisk(*device, DiskBus::kParallelScsi);
    }
  }
}

void addParallelAta(StorageWriter& writer, const TagTree& raw) {
  const Tag* buses = findItems(raw, "SPParallelATADataType");
  if (!buses) return;
  for (const auto& bus : buses->children()) {
    const Tag* devices = childItems(*bus);
    if (!devices) continue;
    for (const auto& device : devices->children()) writer.addDrive(*device);
  }
}

}  // namespace

void buildStorageSection(TagTree& snapshot, const TagTree& raw) {
  StorageWriter writer(snapshot.top());
  addSerialAta(writer, raw);
  addParallelScsi(writer, raw);
  addParallelAta(writer, raw);
}

}  // namespace cvn
