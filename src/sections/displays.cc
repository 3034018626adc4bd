#include <string>

#include "sections/builder_util.h"
#include "sections/edid.h"
#include "sections/sections.h"
#include "zxml/size_text.h"

namespace cvn {
namespace {

// A text field that lists several items carries its separator.
void setListField(Tag& record, std::string_view field, const std::string& list) {
  record.setProperty(field, TagValue(list), "split", ", ");
}

void writeVideoMemory(Tag& adapter, const Tag& item) {
  // Integrated graphics report the memory they borrow under a key of their own.
  const char* key = hasKey(item, "spdisplays_vram") ? "spdisplays_vram" : "spdisplays_vram_shared";
  const TagValue* value = rawValue(item, key);
  if (!value || !value->isText()) return;
  // Shared memory reads "64 MB of Shared System Memory"; the size is the
  // number and unit in front.
  std::string_view text = value->text();
  size_t blank = text.find(' ');
  if (blank != std::string_view::npos) text = text.substr(0, text.find(' ', blank + 1));
  int64_t bytes = SizeText::toBytes(text);
  if (bytes <= 0) return;
  adapter.setProperty("video-memory", TagValue(sizeInMegabytes(text)), "base-value",
                      formatText("%lld", static_cast<long long>(bytes)).c_str());
}

void writeAdapter(Tag& adapter, const Tag& item) {
  copyField(adapter, "model", item, "sppci_model");
  copyField(adapter, "vendor", item, "spdisplays_vendor");
  writeVideoMemory(adapter, item);
  copyField(adapter, "device-id", item, "spdisplays_device-id");
  copyField(adapter, "revision-id", item, "spdisplays_revision-id");
  copyField(adapter, "bus", item, "sppci_bus");
}

void writeEdidFields(Tag& monitor, const EdidInfo& edid) {
  monitor.setProperty("manufacturer", TagValue(edid.manufacturer));
  monitor.setProperty("product-code", TagValue(edid.product_code));
  monitor.setProperty("serial-number", TagValue(edid.serial_number));
  monitor.setProperty("manuf-week", TagValue(edid.week));
  monitor.setProperty("manuf-year", TagValue(edid.year));
  monitor.setProperty("max-resolution", TagValue(edid.max_resolution));
  monitor.setProperty("video-input", TagValue(edid.video_input));
  setListField(monitor, "synch-input", edid.synch_input);
  monitor.setProperty("serial-digital", TagValue(edid.serial_digital));
  setListField(monitor, "color-features", edid.color_features);
  setListField(monitor, "dpms-mode-support", edid.dpms_mode_support);
  monitor.setProperty("gamma", TagValue(edid.gamma));
  monitor.setProperty("aspect-ratio", TagValue(edid.aspect_ratio));
  if (edid.has_image_size) {
    Tag& size = addComplexRecord(monitor, "max-visible-image-size");
    size.setProperty("width", TagValue(edid.image_width));
    size.setProperty("height", TagValue(edid.image_height));
    size.setProperty("diagonal", TagValue(edid.image_diagonal));
  }
  if (edid.has_range_limits) {
    Tag& h_freq = addComplexRecord(monitor, "h-freq");
    h_freq.setProperty("min", TagValue(edid.h_freq.min));
    h_freq.setProperty("max", TagValue(edid.h_freq.max));
    Tag& v_freq = addComplexRecord(monitor, "v-freq");
    v_freq.setProperty("min", TagValue(edid.v_freq.min));
    v_freq.setProperty("max", TagValue(edid.v_freq.max));
  }
  if (!edid.video_modes.empty()) {
    Tag& modes = monitor.addChild("Video-Modes");
    int number = 0;
    for (const std::string& mode : edid.video_modes) {
      modes.setProperty(formatText("v-mode:%d", ++number), TagValue(mode));
    }
  }
}

// Today's profilers moved the resolution to "_spdisplays_resolution"
// ("1800 x 1125 @ 120.00Hz"); some give only the panel's pixels.
const char* resolutionKey(const Tag& display) {
  for (const char* key :
       {"spdisplays_resolution", "_spdisplays_resolution", "_spdisplays_pixels"}) {
    if (hasKey(display, key)) return key;
  }
  return "spdisplays_resolution";
}

void writeMonitor(Tag& monitor, const Tag& display) {
  copyField(monitor, "name", display, "_name");
  copyField(monitor, "resolution", display, resolutionKey(display));
  monitor.setProperty("main-display",
                      TagValue(flagText(rawText(display, "spdisplays_main"), "spdisplays_yes")));
  EdidInfo edid;
  if (decodeEdidText(rawText(display, "_spdisplays_edid"), &edid)) writeEdidFields(monitor, edid);
}

// Older systems list every unused connector of a card as a display.
bool isEmptyConnector(const Tag& display) {
  return rawText(display, "spdisplays_status") == "spdisplays_not_connected";
}

}  // namespace

void buildDisplaysSection(TagTree& snapshot, const TagTree& raw) {
  const Tag* items = findItems(raw, "SPDisplaysDataType");
  if (!items || items->children().empty()) return;
  Tag& video = snapshot.top().addChild("Video");
  Tag& devices = video.addChild("Video-devices");
  // Made even when no display is attached, so that the summary counts 0.
  Tag& monitors = video.addChild("Monitors");
  int adapter_number = 0;
  int monitor_number = 0;
  for (const auto& item : items->children()) {
    if (!item) continue;
    writeAdapter(addComplexRecord(devices, formatText("Video-adapter:%d", ++adapter_number)),
                 *item);
    const Tag* displays = item->findChild("spdisplays_ndrvs");
    if (!displays) continue;
    for (const auto& display : displays->children()) {
      if (!display || isEmptyConnector(*display)) continue;
      writeMonitor(addComplexRecord(monitors, formatText("Monitor:%d", ++monitor_number)),
                   *display);
    }
  }
}

}  // namespace cvn
