#include "collect/network_identity.h"

#include <string_view>

namespace cvn {

namespace {

std::string firstAddress(const PlistValue& addresses) {
  if (addresses.array.empty() || !addresses.array.front().isString()) return std::string();
  return addresses.array.front().text;
}

// Manual flag and hardware address of the chosen interface.
void readInterface(const PlistValue& item, bool* manual, std::string* hardware_address) {
  if (const PlistValue* ipv4 = item.findDictionary("IPv4")) {
    const std::string* method = ipv4->findText("ConfigMethod");
    *manual = method && *method == "Manual";
  }
  hardware_address->clear();
  if (const PlistValue* ethernet = item.findDictionary("Ethernet")) {
    if (const std::string* mac = ethernet->findText("MAC Address")) *hardware_address = *mac;
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
    for (const PlistValue& item : interfaces->array) {
      if (!item.isDictionary()) continue;
      const PlistValue* addresses = item.findArray("ip_address");
      if (ip.empty()) {
        const std::string* name = item.findText("interface");
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
    for (const PlistValue& location : locations->array) {
      if (!location.isDictionary()) continue;
      const std::string* active = location.findText("spnetworklocation_isActive");
      if (!active || *active != "yes") continue;
      services = location.findArray("spnetworklocation_services");
      break;
    }
  }
  // An interface without a hardware address matches no service.
  if (!services || hardware_address.empty()) return out->workgroup;

  for (const PlistValue& service : services->array) {
    if (!service.isDictionary()) continue;
    const std::string* address = service.findText("hardware_address");
    if (!address || *address != hardware_address) continue;
    out->mac_address.clear();
    for (char c : hardware_address) out->mac_address += c == ':' ? '-' : upperAscii(c);
    const PlistValue* smb = service.findDictionary("SMB");
    const std::string* workgroup = smb ? smb->findText("Workgroup") : nullptr;
    if (!workgroup) continue;
    for (char c : *workgroup) out->workgroup += upperAscii(c);
    out->workgroup_length = utf16Length(out->workgroup);
    const std::string* netbios = smb->findText("NetBIOSName");
    if (netbios) out->netbios_name = *netbios;
    break;
  }
  return out->workgroup;
}

}  // namespace cvn
