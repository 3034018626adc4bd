#include "collect/network_identity.h"

#include <optional>
#include <string_view>

namespace cvn {

namespace {

std::string firstAddress(const PlistValue& addresses) {
  if (addresses.items().empty() || !addresses.items().front().isString()) return std::string();
  return std::string(addresses.items().front().text());
}

// Manual flag and hardware address of the chosen interface.
void readInterface(const PlistValue& item, bool* manual, std::string* hardware_address) {
  if (const PlistValue* ipv4 = item.findDictionary("IPv4")) {
    std::optional<std::string_view> method = ipv4->findText("ConfigMethod");
    *manual = method && *method == "Manual";
  }
  hardware_address->clear();
  if (const PlistValue* ethernet = item.findDictionary("Ethernet")) {
    if (std::optional<std::string_view> mac = ethernet->findText("MAC Address"))
      *hardware_address = *mac;
  }
}

char upperAscii(char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c; }

size_t utf16Length(const std::string& text) {
  size_t units = 0;
  for (unsigned char c : text) {
    if ((c & 0xC0) == 0x80) continue;
    units += c >= 0xF0 ? 2 : 1;
  }
  return units;
}

}  // namespace

std::string readNetworkIdentity(const PlistValue& root, std::string& ip, NetworkIdentity* out) {
  out->workgroup.clear();
  out->workgroup_length = 0;
  out->netbios_name.clear();
  out->manual = false;

  std::string hardware_address;
  const PlistValue* interfaces = findProfilerItems(root, "SPNetworkDataType");
  if (interfaces) {
    for (const PlistValue& item : interfaces->items()) {
      if (!item.isDictionary()) continue;
      const PlistValue* addresses = item.findArray("ip_address");
      if (ip.empty()) {
        std::optional<std::string_view> name = item.findText("interface");
        if (!name || name->compare(0, 2, "en") != 0 || !addresses) continue;
        ip = firstAddress(*addresses);
      } else {
        if (!addresses || firstAddress(*addresses) != ip) continue;
      }
      readInterface(item, &out->manual, &hardware_address);
      break;
    }
  }
  // With neither an address nor a hardware address the interface counts as
  // unknown (address 0.0.0.0, not manual); the ip setting stays empty.
  if (ip.empty() && hardware_address.empty()) out->manual = false;

  const PlistValue* locations = findProfilerItems(root, "SPNetworkLocationDataType");
  const PlistValue* services = nullptr;
  if (locations) {
    for (const PlistValue& location : locations->items()) {
      if (!location.isDictionary()) continue;
      std::optional<std::string_view> active = location.findText("spnetworklocation_isActive");
      if (!active || *active != "yes") continue;
      services = location.findArray("spnetworklocation_services");
      break;
    }
  }
  // An interface without a hardware address matches no service.
  if (!services || hardware_address.empty()) return out->workgroup;

  for (const PlistValue& service : services->items()) {
    if (!service.isDictionary()) continue;
    std::optional<std::string_view> address = service.findText("hardware_address");
    if (!address || *address != hardware_address) continue;
    out->mac_address.clear();
    for (char c : hardware_address) out->mac_address += c == ':' ? '-' : upperAscii(c);
    const PlistValue* smb = service.findDictionary("SMB");
    std::optional<std::string_view> workgroup = smb ? smb->findText("Workgroup") : std::nullopt;
    if (!workgroup) continue;
    for (char c : *workgroup) out->workgroup += upperAscii(c);
    out->workgroup_length = utf16Length(out->workgroup);
    std::optional<std::string_view> netbios = smb->findText("NetBIOSName");
    if (netbios) out->netbios_name = *netbios;
    break;
  }
  return out->workgroup;
}

}  // namespace cvn
