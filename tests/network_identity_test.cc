#include "collect/network_identity.h"

#include <gtest/gtest.h>

#include <string>

namespace cvn {
namespace {

// "<key>key</key><tag>value</tag>", or nothing when the value is empty.
std::string entry(std::string key, std::string value, std::string tag = "string") {
  return value.empty() ? "" : "<key>" + key + "</key><" + tag + ">" + value + "</" + tag + ">";
}

// One SPNetworkDataType item; `addresses` is the inside of the address
// array's first string.
std::string interface(std::string name, std::string addresses, std::string method = "",
                      std::string mac = "") {
  return "<dict>" + entry("interface", name) +
         entry("ip_address", addresses.empty() ? "" : "<string>" + addresses + "</string>",
               "array") +
         entry("IPv4", entry("ConfigMethod", method), "dict") +
         entry("Ethernet", entry("MAC Address", mac), "dict") + "</dict>";
}

std::string service(std::string hardware_address, std::string workgroup, std::string netbios) {
  return "<dict><key>hardware_address</key><string>" + hardware_address + "</string>" +
         entry("SMB", entry("Workgroup", workgroup) + entry("NetBIOSName", netbios), "dict") +
         "</dict>";
}

// The inactive location knows en1 too but must not be read.
std::string document(const std::string& interfaces, const std::string& services) {
  std::string inactive = service("00:1b:63:aa:bb:cc", "INACTIVE", "Wrong");
  return "<array><dict>" + entry("_dataType", "SPNetworkLocationDataType") +
         entry("_items",
               "<dict>" + entry("spnetworklocation_isActive", "no") +
                   entry("spnetworklocation_services", inactive, "array") + "</dict><dict>" +
                   entry("spnetworklocation_isActive", "yes") +
                   entry("spnetworklocation_services", services, "array") + "</dict>",
               "array") +
         "</dict><dict>" + entry("_dataType", "SPNetworkDataType") +
         entry("_items", interfaces, "array") + "</dict></array>";
}

TEST(NetworkIdentityTest, EdgeCases) {
  // Neither can be chosen: not an "en" interface, or no address.
  const std::string passed_over = interface("Bluetooth-Modem", "10.0.0.9") + interface("en0", "");
  const std::string en1 =
      interface("en1", "192.168.1.5</string><string>192.168.1.6", "Manual", "00:1b:63:aa:bb:cc");
  const std::string fw0 = interface("fw0", "169.254.1.1", "Manual", "0a:0b:0c:0d:0e:0f");
  // Services of other interfaces and without a workgroup are passed over.
  const std::string services =
      service("11:22:33:44:55:66", "OTHER", "x") + service("00:1b:63:aa:bb:cc", "", "") +
      service("00:1b:63:aa:bb:cc", "", "NoGroup") +
      service("00:1b:63:aa:bb:cc", "Gr\xC3\xBCppe\xF0\x9F\x98\x80", "MyMac") +
      service("00:1b:63:aa:bb:cc", "LATER", "Later") + service("0a:0b:0c:0d:0e:0f", "fw", "FW");
  struct {
    std::string xml;
    std::string ip;
    const char* expected;  // "ip|workgroup|length|mac|netbios|manual"
  } cases[] = {
      // Non-ASCII stays as it is; the length counts UTF-16 units.
      {document(passed_over + en1, services), "",
       "192.168.1.5|GR\xC3\xBCPPE\xF0\x9F\x98\x80|8|00-1B-63-AA-BB-CC|MyMac|manual"},
      {document(interface("en2", "172.16.0.2", "DHCP") + en1, services), "",
       "172.16.0.2||0|kept||auto"},
      {document(passed_over + fw0, services), "", "||0|kept||auto"},
      {document(en1 + fw0, services), "169.254.1.1",
       "169.254.1.1|FW|2|0A-0B-0C-0D-0E-0F|FW|manual"},
      {document(en1, services), "192.168.1.6", "192.168.1.6||0|kept||auto"},
      {document(en1, service("00:1b:63:aa:bb:cc", "", "Name")), "",
       "192.168.1.5||0|00-1B-63-AA-BB-CC||manual"},
      // Values of unexpected kinds read as missing.
      {"<dict><key>_dataType</key><string>SPNetworkDataType</string></dict>", "", "||0|kept||auto"},
      {document("<string>x</string><dict><key>interface</key><integer>1</integer></dict>"
                "<dict><key>interface</key><string>en0</string><key>ip_address</key>"
                "<string>9.9.9.9</string></dict><dict><key>interface</key><string>en1</string>"
                "<key>ip_address</key><array><string>1.2.3.4</string></array><key>IPv4</key>"
                "<string>Manual</string><key>Ethernet</key><array/></dict>",
                service("", "EMPTY", "")),
       "", "1.2.3.4||0|kept||auto"},
  };
  for (const auto& c : cases) {
    Plist root;
    ASSERT_TRUE(parsePlist(c.xml, &root));
    NetworkIdentity out{"stale", 99, "kept", "stale", true};  // what a previous read left
    std::string ip = c.ip;
    EXPECT_EQ(readNetworkIdentity(root, ip, &out), out.workgroup);
    EXPECT_EQ(ip + "|" + out.workgroup + "|" + std::to_string(out.workgroup_length) + "|" +
                  out.mac_address + "|" + out.netbios_name + "|" + (out.manual ? "manual" : "auto"),
              c.expected)
        << c.xml;
  }
}

}  // namespace
}  // namespace cvn
