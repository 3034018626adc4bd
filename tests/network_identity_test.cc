#include "collect/network_identity.h"

#include <gtest/gtest.h>

#include <string>

namespace cvn {
namespace {

const char kEn0WithoutAddress[] =
    "<dict><key>interface</key><string>en0</string><key>_name</key><string>Ethernet</string>"
    "</dict>";
const char kModem[] =
    "<dict><key>interface</key><string>Bluetooth-Modem</string>"
    "<key>ip_address</key><array><string>10.0.0.9</string></array></dict>";
const char kEn1[] =
    "<dict><key>interface</key><string>en1</string>"
    "<key>ip_address</key><array><string>192.168.1.5</string><string>192.168.1.6</string></array>"
    "<key>IPv4</key><dict><key>ConfigMethod</key><string>Manual</string></dict>"
    "<key>Ethernet</key><dict><key>MAC Address</key><string>00:1b:63:aa:bb:cc</string></dict>"
    "</dict>";
const char kEn2WithoutEthernet[] =
    "<dict><key>interface</key><string>en2</string>"
    "<key>ip_address</key><array><string>172.16.0.2</string></array>"
    "<key>IPv4</key><dict><key>ConfigMethod</key><string>DHCP</string></dict></dict>";
const char kFw0[] =
    "<dict><key>interface</key><string>fw0</string>"
    "<key>ip_address</key><array><string>169.254.1.1</string></array>"
    "<key>IPv4</key><dict><key>ConfigMethod</key><string>Manual</string></dict>"
    "<key>Ethernet</key><dict><key>MAC Address</key><string>0a:0b:0c:0d:0e:0f</string></dict>"
    "</dict>";

std::string service(const std::string& hardware_address, const std::string& smb) {
  return "<dict><key>hardware_address</key><string>" + hardware_address + "</string>" + smb +
         "</dict>";
}

std::string smb(const std::string& workgroup, const std::string& netbios) {
  std::string out = "<key>SMB</key><dict>";
  if (!workgroup.empty()) out += "<key>Workgroup</key><string>" + workgroup + "</string>";
  if (!netbios.empty()) out += "<key>NetBIOSName</key><string>" + netbios + "</string>";
  return out + "</dict>";
}

std::string document(const std::string& interfaces, const std::string& services) {
  return "<array>"
         "<dict><key>_dataType</key><string>SPHardwareDataType</string></dict>"
         "<dict><key>_dataType</key><string>SPNetworkLocationDataType</string><key>_items</key>"
         "<array><dict><key>spnetworklocation_isActive</key><string>no</string>"
         "<key>spnetworklocation_services</key><array>" +
         service("00:1b:63:aa:bb:cc", smb("INACTIVE", "Wrong")) +
         "</array></dict>"
         "<dict><key>spnetworklocation_isActive</key><string>yes</string>"
         "<key>spnetworklocation_services</key><array>" +
         services +
         "</array></dict></array></dict>"
         "<dict><key>_dataType</key><string>SPNetworkDataType</string><key>_items</key><array>" +
         interfaces + "</array></dict></array>";
}

// "ip|workgroup|length|mac|netbios|manual" after reading with `ip` given.
std::string identity(const std::string& xml, std::string ip = "") {
  PlistValue root;
  EXPECT_TRUE(parsePlist(xml, &root));
  NetworkIdentity out;
  out.mac_address = "kept";
  out.manual = true;
  std::string workgroup = readNetworkIdentity(root, ip, &out);
  EXPECT_EQ(workgroup, out.workgroup);
  return ip + "|" + out.workgroup + "|" + std::to_string(out.workgroup_length) + "|" +
         out.mac_address + "|" + out.netbios_name + "|" + (out.manual ? "manual" : "auto");
}

TEST(NetworkIdentityTest, ChoosesTheFirstEnInterfaceWithAnAddress) {
  std::string services = service("11:22:33:44:55:66", smb("OTHER", "x")) +
                         service("00:1b:63:aa:bb:cc", "") +
                         service("00:1b:63:aa:bb:cc", smb("", "NoGroup")) +
                         service("00:1b:63:aa:bb:cc", smb("workgroup", "MyMac")) +
                         service("00:1b:63:aa:bb:cc", smb("LATER", "Later"));
  std::string modem_en0_en1 = std::string(kModem) + kEn0WithoutAddress + kEn1;
  EXPECT_EQ(identity(document(modem_en0_en1, services)),
            "192.168.1.5|WORKGROUP|9|00-1B-63-AA-BB-CC|MyMac|manual");
}

TEST(NetworkIdentityTest, EdgeCases) {
  std::string services = service("00:1b:63:aa:bb:cc", smb("Gr\xC3\xBCppe\xF0\x9F\x98\x80", "nb")) +
                         service("0a:0b:0c:0d:0e:0f", smb("fw", "FireWireMac"));
  struct {
    const char* name;
    std::string interfaces;
    std::string ip;
    const char* expected;
  } cases[] = {
      // Non-ASCII stays as it is; the length counts UTF-16 units.
      {"en1", kEn1, "", "192.168.1.5|GR\xC3\xBCPPE\xF0\x9F\x98\x80|8|00-1B-63-AA-BB-CC|nb|manual"},
      {"no Ethernet dictionary", std::string(kEn2WithoutEthernet) + kEn1, "",
       "172.16.0.2||0|kept||auto"},
      {"no en interface with an address", std::string(kModem) + kEn0WithoutAddress + kFw0, "",
       "||0|kept||auto"},
      {"given address matches no interface", kEn1, "10.1.1.1", "10.1.1.1||0|kept||auto"},
      {"given address may be any interface", std::string(kEn1) + kFw0, "169.254.1.1",
       "169.254.1.1|FW|2|0A-0B-0C-0D-0E-0F|FireWireMac|manual"},
      {"only the first address counts", kEn1, "192.168.1.6", "192.168.1.6||0|kept||auto"},
  };
  for (const auto& c : cases)
    EXPECT_EQ(identity(document(c.interfaces, services), c.ip), c.expected) << c.name;
}

TEST(NetworkIdentityTest, MatchingServiceWithoutWorkgroupStillGivesTheMac) {
  EXPECT_EQ(identity(document(kEn1, service("00:1b:63:aa:bb:cc", smb("", "Name")))),
            "192.168.1.5||0|00-1B-63-AA-BB-CC||manual");
}

TEST(NetworkIdentityTest, OddListsReadAsEmpty) {
  const char* documents[] = {
      "<dict><key>_dataType</key><string>SPNetworkDataType</string></dict>",
      "<array><string>x</string><dict><key>_dataType</key><integer>1</integer></dict></array>",
      "<array><dict><key>_dataType</key><string>SPNetworkDataType</string>"
      "<key>_items</key><dict/></dict></array>",
      "<array><dict><key>_dataType</key><string>SPNetworkDataType</string><key>_items</key>"
      "<array><string>item</string><dict><key>interface</key><integer>1</integer></dict>"
      "<dict><key>interface</key><string>en0</string><key>ip_address</key><string>1.2.3.4"
      "</string></dict><dict><key>interface</key><string>en1</string><key>ip_address</key>"
      "<array><integer>5</integer></array><key>IPv4</key><string>Manual</string>"
      "<key>Ethernet</key><array/></dict></array></dict>"
      "<dict><key>_dataType</key><string>SPNetworkLocationDataType</string><key>_items</key>"
      "<array><dict><key>spnetworklocation_isActive</key><string>yes</string>"
      "<key>spnetworklocation_services</key><array><dict><key>hardware_address</key>"
      "<string></string><key>SMB</key><dict><key>Workgroup</key><string>EMPTY</string>"
      "</dict></dict></array></dict></array></dict></array>",
  };
  for (const char* xml : documents) EXPECT_EQ(identity(xml), "||0|kept||auto") << xml;
}

}  // namespace
}  // namespace cvn
