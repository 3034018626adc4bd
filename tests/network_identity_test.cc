#include "collect/network_identity.h"

#include <gtest/gtest.h>

#include <string>

namespace cvn {
namespace {

// One SPNetworkDataType item; `addresses` is the inside of the address
// array's first string, and empty parts are left out.
std::string interface(std::string name, std::string addresses, std::string method = "",
                      std::string mac = "") {
  std::string out = "<dict><key>interface</key><string>" + name + "</string>";
  if (!addresses.empty())
    out += "<key>ip_address</key><array><string>" + addresses + "</string></array>";
  if (!method.empty())
    out += "<key>IPv4</key><dict><key>ConfigMethod</key><string>" + method + "</string></dict>";
  if (!mac.empty())
    out += "<key>Ethernet</key><dict><key>MAC Address</key><string>" + mac + "</string></dict>";
  return out + "</dict>";
}

// One service of a location; no SMB dictionary when both names are empty.
std::string service(std::string hardware_address, std::string workgroup, std::string netbios) {
  std::string smb;
  if (!workgroup.empty()) smb += "<key>Workgroup</key><string>" + workgroup + "</string>";
  if (!netbios.empty()) smb += "<key>NetBIOSName</key><string>" + netbios + "</string>";
  return "<dict><key>hardware_address</key><string>" + hardware_address + "</string>" +
         (smb.empty() ? "" : "<key>SMB</key><dict>" + smb + "</dict>") + "</dict>";
}

// The inactive location knows en1 too but must not be read.
std::string document(const std::string& interfaces, const std::string& services) {
  return "<array><dict><key>_dataType</key><string>SPNetworkLocationDataType</string>"
         "<key>_items</key><array><dict><key>spnetworklocation_isActive</key><string>no</string>"
         "<key>spnetworklocation_services</key><array>" +
         service("00:1b:63:aa:bb:cc", "INACTIVE", "Wrong") +
         "</array></dict><dict><key>spnetworklocation_isActive</key><string>yes</string>"
         "<key>spnetworklocation_services</key><array>" +
         services +
         "</array></dict></array></dict>"
         "<dict><key>_dataType</key><string>SPNetworkDataType</string><key>_items</key><array>" +
         interfaces + "</array></dict></array>";
}

TEST(NetworkIdentityTest, EdgeCases) {
  const std::string en0 = interface("en0", "");
  const std::string modem = interface("Bluetooth-Modem", "10.0.0.9");
  const std::string en1 =
      interface("en1", "192.168.1.5</string><string>192.168.1.6", "Manual", "00:1b:63:aa:bb:cc");
  const std::string en2 = interface("en2", "172.16.0.2", "DHCP");
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
      {document(modem + en0 + en1, services), "",
       "192.168.1.5|GR\xC3\xBCPPE\xF0\x9F\x98\x80|8|00-1B-63-AA-BB-CC|MyMac|manual"},
      {document(en2 + en1, services), "", "172.16.0.2||0|kept||auto"},
      {document(modem + en0 + fw0, services), "", "||0|kept||auto"},
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
    PlistValue root;
    ASSERT_TRUE(parsePlist(c.xml, &root));
    NetworkIdentity out;
    out.mac_address = "kept";
    out.manual = true;
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
