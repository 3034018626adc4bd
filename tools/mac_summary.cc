#include "mac_summary.h"

#include "field_display.h"

namespace cvn {

namespace {

std::string fieldOf(const QaxNode* node, std::string_view name) {
  const QaxProperty* property = node ? node->findProperty(name) : nullptr;
  return property ? property->value : std::string();
}

const QaxNode* childOf(const QaxNode* node, std::string_view name) {
  return node ? node->findChild(name) : nullptr;
}

std::string firstOf(std::string a, std::string b) { return a.empty() ? b : a; }

// Disk models come padded with blanks to their ATA field width.
std::string trimmed(std::string text) {
  size_t end = text.find_last_not_of(" \t");
  text.erase(end == std::string::npos ? 0 : end + 1);
  text.erase(0, text.find_first_not_of(" \t") == std::string::npos ? text.size()
                                                                   : text.find_first_not_of(" \t"));
  return text;
}

std::string processorText(const QaxNode* control, const QaxNode* snapshot) {
  const QaxNode* processors = childOf(snapshot, "Processors");
  const QaxNode* first =
      processors && !processors->children.empty() ? &processors->children.front() : nullptr;
  std::string model = firstOf(fieldOf(control, "cpu-model"), first ? first->value : std::string());
  std::string cores = firstOf(fieldOf(control, "cpu-count-virtual"), fieldOf(first, "core-count"));
  std::string speed = firstOf(fieldOf(control, "cpu-speed"), fieldOf(first, "current-clock-speed"));
  std::string packages = fieldOf(control, "cpu-count");
  std::string text =
      packages.empty() || packages == "1" || packages == "0" ? model : packages + " x " + model;
  if (!cores.empty())
    text += (text.empty() ? "" : ", ") + cores + (cores == "1" ? " core" : " cores");
  if (!speed.empty() && speed != "0")
    text += ", " + displayValue("Processor", "current-clock-speed", speed);
  return text;
}

std::vector<std::string> diskTexts(const QaxNode* storage) {
  std::vector<std::string> texts;
  const QaxNode* disks = childOf(storage, "Physical-disks");
  for (const QaxNode& disk : disks ? disks->children : std::vector<QaxNode>()) {
    std::string size = fieldOf(&disk, "size");
    if (size.empty()) continue;
    std::string text = firstOf(trimmed(fieldOf(&disk, "model")), trimmed(disk.value));
    text += (text.empty() ? "" : ", ") + displayValue(recordKind(disk.name), "size", size);
    std::string interface = fieldOf(&disk, "interface");
    texts.push_back(interface.empty() ? text : text + ", " + interface);
  }
  return texts;
}

std::vector<std::string> volumeTexts(const QaxNode* storage) {
  std::vector<std::string> texts;
  const QaxNode* volumes = childOf(storage, "Logical-disks");
  for (const QaxNode& volume : volumes ? volumes->children : std::vector<QaxNode>()) {
    std::string text = volume.value.empty() ? volume.name : volume.value;
    std::string mount = fieldOf(&volume, "mount-point");
    if (!mount.empty()) text += " (" + mount + ")";
    std::string size = fieldOf(&volume, "size"), used = fieldOf(&volume, "used%");
    if (!size.empty()) text += ", " + displayValue("partition", "size", size);
    if (!used.empty()) text += ", " + displayValue("partition", "used%", used) + " used";
    texts.push_back(text);
  }
  return texts;
}

std::string systemText(const QaxNode* control, const QaxNode* snapshot) {
  const QaxNode* os = childOf(childOf(snapshot, "OS"), "os:1");
  std::string name = firstOf(fieldOf(os, "name"), fieldOf(control, "os-name"));
  std::string version = firstOf(fieldOf(os, "version"), fieldOf(control, "os-ver"));
  if (version.empty() || name.find(version) != std::string::npos) return name;
  return name.empty() ? version : name + ", version " + version;
}

}  // namespace

const QaxNode* findTreeTop(const QaxFile& file, std::string_view type) {
  const QaxBlock* block = file.findBlock(type);
  return block && block->kind == QaxBlock::Kind::kTree ? block->tree.top() : nullptr;
}

MacSummary summarizeMac(const QaxFile& file, std::string_view file_name) {
  const QaxNode* snapshot = findTreeTop(file, "snapshot");
  const QaxNode* asset = findTreeTop(file, "assetinfo");
  const QaxNode* control = childOf(asset, "control");
  const QaxNode* system = childOf(snapshot, "System");
  const QaxNode* storage = childOf(snapshot, "Storage");
  const QaxBlock* snapshot_block = file.findBlock("snapshot");
  MacSummary summary;
  std::string model = firstOf(fieldOf(control, "system-model"),
                              fieldOf(childOf(system, "Computer-system"), "model"));
  std::string host = firstOf(fieldOf(snapshot, "hostname"), fieldOf(asset, "hostname"));
  summary.name = firstOf(host, firstOf(fieldOf(asset, "int-name"), model));
  std::string memory =
      firstOf(fieldOf(childOf(childOf(snapshot, "Memory"), "General-info"), "physical-memory"),
              fieldOf(control, "phys-memory"));
  summary.scanned =
      displayScanTime(firstOf(fieldOf(snapshot, "timestamp"),
                              firstOf(snapshot_block ? snapshot_block->timestamp : std::string(),
                                      fieldOf(asset, "last-scan"))));
  auto line = [&summary](const char* label, std::vector<std::string> values) {
    if (values.size() == 1 && values.front().empty()) values.clear();
    summary.lines.push_back(MacSummaryLine{label, std::move(values)});
  };
  line("Model", {model});
  line("Serial number",
       {firstOf(fieldOf(asset, "serial-number"), fieldOf(childOf(system, "Chassis"), "serial"))});
  line("Processor", {processorText(control, snapshot)});
  line("Memory",
       {memory.empty() ? memory : displayValue("General-info", "physical-memory", memory)});
  line("Disks", diskTexts(storage));
  line("Volumes", volumeTexts(storage));
  line("Operating system", {systemText(control, snapshot)});
  line("Host", {firstOf(host, fieldOf(asset, "int-name"))});
  line("User", {firstOf(fieldOf(snapshot, "user-name"), fieldOf(asset, "user-name"))});
  line("MAC address", {fieldOf(asset, "mac-address")});
  line("Scanned", {summary.scanned});
  line("File", {std::string(file_name)});
  return summary;
}

}  // namespace cvn
