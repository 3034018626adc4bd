#include "asset/asset_info.h"

#include <cctype>
#include <cstdio>
#include <utility>

#include "collect/quick_facts.h"
#include "sections/edid.h"
#include "zxml/QAXfile.h"

namespace cvn {
namespace {

// Fields shared by the normal and the debug tree, in their order.
void writeAssetFields(TagTree& tree, const AssetIdentity& identity, const std::string& host_name,
                      const std::string& user_name, const std::string& virtual_type,
                      const char* scan_type, const char* scan_subtype, const std::string& date,
                      const std::string& uuid) {
  tree.setValue("/hostname", TagValue(host_name));
  tree.setValue("/ip-address", TagValue(identity.ip));
  tree.setValue("/static-ip", TagValue(identity.manual_ip ? "1" : "0"));
  tree.setValue("/int-name", TagValue(identity.computer_name));
  tree.setValue("/alias", TagValue(identity.computer_name));
  tree.setValue("/description", TagValue(""));
  tree.setValue("/comment", TagValue(""));
  tree.setValue("/inv-number", TagValue(""));
  tree.setValue("/login", TagValue(identity.login));
  tree.setValue("/user-name", TagValue(user_name));
  tree.setValue("/asset-type", TagValue("natMacOS"));
  tree.setValue("/virtual-type", TagValue(virtual_type));
  tree.setValue("/scan-type", TagValue(scan_type));
  tree.setValue("/scan-subtype", TagValue(scan_subtype));
  tree.setValue("/auto-icon-type", TagValue("nitMacDesktop"));
  tree.setValue("/icon-type", TagValue("nitMacDesktop"));
  tree.setValue("/first-scan", TagValue(date));
  tree.setValue("/last-scan", TagValue(date));
  tree.setValue("/snapshot-list", TagValue(date));
  tree.setValue("/snapshot-types", TagValue("mac:1"));
  tree.setValue("/mac-address", TagValue(identity.mac_address));
  tree.setValue("/uuid", TagValue(uuid));
  tree.setValue("/serial-number", TagValue(identity.serial_number));
  // A fixed placeholder: the console fills in real asset tags.
  tree.setValue("/asset-tag", TagValue("1234567890000"));
}

// The summary's quick facts, in the order the summary lists them.
using FactField = std::pair<const char*, std::string QuickFacts::*>;
const FactField kSummaryBeforeChassis[] = {
    {"/control/cpu-count", &QuickFacts::package_count},
    {"/control/cpu-count-virtual", &QuickFacts::processor_count},
    {"/control/cpu-speed", &QuickFacts::processor_speed},
    {"/control/cpu-model", &QuickFacts::processor_model},
    {"/control/cpu-manuf", &QuickFacts::processor_maker},
    {"/control/system-model", &QuickFacts::machine_model},
    {"/control/system-manuf", &QuickFacts::system_maker},
};
const FactField kSummaryAfterChassis[] = {
    {"/control/phys-memory", &QuickFacts::physical_memory},
    {"/control/video-ram", &QuickFacts::video_memory},
    {"/control/video-res", &QuickFacts::main_display_resolution},
};

void copyOsField(TagTree& tree, const Tag* os_entry, const char* field, const char* path) {
  if (!os_entry) return;
  if (const TagProperty* p = os_entry->findProperty(field)) tree.setValue(path, p->value());
}

void writeDiskEntries(TagTree& tree, const TagTree& snapshot) {
  const Tag* storage = snapshot.top().findChild("Storage");
  const Tag* disks = storage ? storage->findChild("Logical-disks") : nullptr;
  if (!disks) return;
  int position = 0;
  char path[64];
  for (const auto& disk : disks->children()) {
    ++position;  // a disk without free space still uses up its number
    const TagProperty* free = disk->findProperty("free");
    if (!free) continue;
    std::snprintf(path, sizeof path, "/control/disk:%d", position);
    TagProperty& entry = tree.setValue(path, free->value());
    const Annotation* base = free->findAnnotation("base-value");
    if (base) entry.addAnnotation("free", base->text);
    const TagProperty* used = disk->findProperty("used%");
    if (used && used->value().isInt()) {
      entry.addAnnotation("free%", std::to_string(100 - used->value().asInt()));
    }
    const TagProperty* mount = disk->findProperty("mount-point");
    if (mount && mount->value().isText() && mount->value().text() == "/") {
      entry.addAnnotation("sys", "1");
    }
  }
}

}  // namespace

std::string virtualTypeOf(const std::string& machine_model) {
  std::string lower;
  lower.reserve(machine_model.size());
  for (char c : machine_model)
    lower += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  if (lower.find("vmware") != std::string::npos) return "nvtVMware";
  if (lower.find("virtualbox") != std::string::npos) return "nvtVirtualBox";
  if (lower.find("parallels") != std::string::npos) return "nvtParallels";
  return "nvtPhysical";
}

std::unique_ptr<TagTree> buildAssetInfo(bool native, const TagTree& snapshot,
                                        const std::string& date, const QuickFacts& facts,
                                        const AssetIdentity& identity) {
  auto tree = std::make_unique<TagTree>(native, "AssetInfo");
  TagTree& t = *tree;
  writeAssetFields(t, identity, identity.netbios_name, facts.user_name,
                   virtualTypeOf(facts.machine_model), "nstSSH", "sstService", date,
                   facts.platform_uuid);

  t.setValue("/control/domain", TagValue(identity.workgroup));
  const Tag* os = snapshot.top().findChild("OS");
  const Tag* os_entry = os ? os->findChild("os:1") : nullptr;
  copyOsField(t, os_entry, "name", "/control/os-name");
  copyOsField(t, os_entry, "update", "/control/os-sp");
  copyOsField(t, os_entry, "version", "/control/os-ver");
  t.setValue("/control/os-manuf", TagValue("Apple Inc."));
  copyOsField(t, os_entry, "architecture", "/control/os-arch");
  for (const auto& [path, fact] : kSummaryBeforeChassis) t.setValue(path, TagValue(facts.*fact));
  t.setValue("/control/chassis-manuf", TagValue("Apple Inc."));
  t.setValue("/control/mb-manuf", TagValue("Apple Inc."));
  for (const auto& [path, fact] : kSummaryAfterChassis) t.setValue(path, TagValue(facts.*fact));
  const Tag* video = snapshot.top().findChild("Video");
  const Tag* monitors = video ? video->findChild("Monitors") : nullptr;
  t.setValue("/control/monitor-count",
             TagValue(std::to_string(monitors ? monitors->children().size() : 0)));
  t.setValue("/control/monitor-diag", TagValue(edidDiagonalText(facts.main_display_edid)));
  t.setValue("/control/hdd-capacity", TagValue(facts.disk_capacity));
  writeDiskEntries(t, snapshot);
  // Fixed: the console reads the firewall from the snapshot itself.
  t.setValue("/control/fw-status", TagValue("5"));
  return tree;
}

void addDebugAssetInfo(SnapshotFile& file, bool native, const std::string& host_name,
                       const std::string& date, const AssetIdentity& identity,
                       const std::string& profiler_output) {
  TagTree tree(native, "AssetInfo");
  writeAssetFields(tree, identity, host_name, std::string(), "nvtPhysical", "nstNone", "sstNone",
                   date, std::string());
  tree.setValue("/scan-attempt", TagValue("1"));
  tree.setValue("/error-message", TagValue("Debug scan"));
  file.addTree(tree, kAssetInfoBlock, kWholeText, kCompressed);
  file.addRawData(reinterpret_cast<const uint8_t*>(profiler_output.data()), profiler_output.size());
}

}  // namespace cvn
