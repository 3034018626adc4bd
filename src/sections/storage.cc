// "Storage": the disks and drives of the serial ATA, NVMe, parallel SCSI and
// parallel ATA buses, the volumes of each disk, and the mounted volumes that
// today's profilers list on their own.
#include <string>

#include "sections/builder_util.h"
#include "sections/sections.h"
#include "sections/volume_fields.h"
#include "sections/written_volumes.h"
#include "zxml/size_text.h"

namespace cvn {
namespace {

enum class DiskBus { kSerialAta, kNvme, kParallelScsi };

bool hasFreeSpace(const Tag& volume) {
  return hasKey(volume, "free_space") || hasKey(volume, "free_space_in_bytes");
}

// APFS keeps its volumes inside container partitions, which the disk types
// list with a size but never mounted; the volumes themselves come from
// SPStorageDataType. A SATA disk is only judged so by its APFS content, so
// the partitions of older systems count as they always did; an NVMe disk is
// too new to have any other kind of unmounted partition worth a record.
bool isUnmountedContainer(const Tag& volume, DiskBus bus) {
  if (!rawText(volume, "mount_point").empty() || hasFreeSpace(volume)) return false;
  if (bus == DiskBus::kNvme) return true;
  return rawText(volume, "iocontent").compare(0, 10, "Apple_APFS") == 0;
}

// A mounted installer or download is no disk of the machine.
bool isDiskImage(const Tag& volume) {
  const Tag* drive = volume.findChild("physical_drive");
  return drive && rawText(*drive, "protocol") == "Disk Image";
}

// The three numberings run across all data types, so a SCSI disk found after
// two SATA disks is the third disk.
class StorageWriter {
 public:
  StorageWriter(Tag& top, WrittenVolumes& written) : top_(top), written_(written) {}

  void addDrive(const Tag& device) {
    Tag& drive = physicalDisks().addChild(formatText("CD:%d", ++drives_));
    copyFieldIfPresent(drive, "model", device, "device_model");
  }

  void addDisk(const Tag& device, DiskBus bus) {
    Tag& disk = physicalDisks().addChild(formatText("HDD:%d", ++disks_));
    copyFieldIfPresent(disk, "model", device, "device_model");
    if (bus != DiskBus::kParallelScsi) {
      disk.setProperty("interface", TagValue(bus == DiskBus::kNvme ? "NVMe" : "SATA"));
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
        if (!isUnmountedContainer(*volume, bus) && addVolume(*volume)) ++partitions;
      }
    }
    disk.setProperty("partitions", TagValue(partitions));
  }

  // A volume of SPStorageDataType, unless a disk already gave it.
  void addMountedVolume(const Tag& volume) {
    if (!hasKey(volume, "_name") || isDiskImage(volume)) return;
    std::string_view mount_point = rawText(volume, "mount_point");
    if (mount_point.empty() && !hasFreeSpace(volume)) return;
    if (written_.holds(volume)) return;
    written_.add(volume);
    Tag& partition = logicalDisks().setChildValue(formatText("partition:%d", ++volumes_),
                                                  TagValue(rawText(volume, "_name")));
    writeFileSystem(partition, volume);
    VolumeSpace space = writeMountedVolumeSpace(partition, volume);
    copyFieldIfPresent(partition, "mount-point", volume, "mount_point");
    writeUsedPercent(partition, space);
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
      std::string_view text = rawText(device, "size");
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
    written_.add(volume);
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
  WrittenVolumes& written_;
  int disks_ = 0;
  int drives_ = 0;
  int volumes_ = 0;
};

const Tag* childItems(const Tag& tag) { return tag.findChild("_items"); }

// Each entry of the "_items" list of each entry of `parents`: the disks of
// controllers and buses.
template <typename Visit>
void forEachItemBelow(const Tag& parents, Visit visit) {
  for (const auto& parent : parents.children()) {
    if (const Tag* items = childItems(*parent)) {
      for (const auto& item : items->children()) visit(*item);
    }
  }
}

// SATA and NVMe list their disks alike, under controllers.
void addControllerDisks(StorageWriter& writer, const TagTree& raw, DiskBus bus) {
  const Tag* controllers =
      findItems(raw, bus == DiskBus::kNvme ? "SPNVMeDataType" : "SPSerialATADataType");
  if (!controllers) return;
  forEachItemBelow(*controllers, [&](const Tag& device) {
    const TagValue* smart = rawValue(device, "smart_status");
    // Optical drives report no SMART status, or "Not Supported".
    if (!smart || (smart->isText() && smart->text() == "Not Supported")) {
      writer.addDrive(device);
    } else {
      writer.addDisk(device, bus);
    }
  });
}

void addParallelScsi(StorageWriter& writer, const TagTree& raw) {
  const Tag* cards = findItems(raw, "SPParallelSCSIDataType");
  if (!cards) return;
  forEachItemBelow(*cards, [&](const Tag& bus) {
    if (const Tag* devices = childItems(bus)) {
      for (const auto& device : devices->children())
        writer.addDisk(*device, DiskBus::kParallelScsi);
    }
  });
}

void addMountedVolumes(StorageWriter& writer, const TagTree& raw) {
  const Tag* volumes = findItems(raw, "SPStorageDataType");
  if (!volumes) return;
  for (const auto& volume : volumes->children()) writer.addMountedVolume(*volume);
}

void addParallelAta(StorageWriter& writer, const TagTree& raw) {
  const Tag* buses = findItems(raw, "SPParallelATADataType");
  if (!buses) return;
  forEachItemBelow(*buses, [&](const Tag& device) { writer.addDrive(device); });
}

}  // namespace

void buildStorageSection(TagTree& snapshot, const TagTree& raw, WrittenVolumes& written) {
  StorageWriter writer(snapshot.top(), written);
  addControllerDisks(writer, raw, DiskBus::kSerialAta);
  addControllerDisks(writer, raw, DiskBus::kNvme);
  addParallelScsi(writer, raw);
  addParallelAta(writer, raw);
  addMountedVolumes(writer, raw);
}

}  // namespace cvn
