#!/usr/bin/env python3
"""Writes the profiler fixtures of the sample Mac (a MacBookPro5,5 on 10.6.8).

The machine's facts live here once, so every data type agrees with the
others (the en0 MAC in the network and location lists, the flash drive's
bsd name and diskutil's record, the UUID and ioreg). Run it from any
directory; it rewrites profiler/*.xml next to this script. The committed XML
is what the tests read; this script only keeps the facts consistent when
someone edits them.
"""

import datetime
import os
import plistlib

HERE = os.path.dirname(os.path.abspath(__file__))
OUT = os.path.join(HERE, "profiler")

HEADER = (b'<?xml version="1.0" encoding="UTF-8"?>\n'
          b'<!DOCTYPE plist PUBLIC "-//Apple//DTD PLIST 1.0//EN" '
          b'"http://www.apple.com/DTDs/PropertyList-1.0.dtd">\n'
          b'<plist version="1.0">\n<array>\n')
FOOTER = b"</array>\n</plist>\n"
assert len(HEADER) == 172 and len(FOOTER) == 18

SERIAL = "W89311JK66E"
UUID = "5F3C7A2E-9B41-4D8A-A6E2-1C0B7D94E3F1"
EN0_MAC = "00:26:bb:5c:3a:91"
EN1_MAC = "00:26:4a:0e:71:d8"
FW0_MAC = "00:26:bb:ff:fe:5c:3a:90"
EN0_IP = "192.168.1.23"
EN1_IP = "192.168.1.24"
ROUTER = "192.168.1.1"

SCAN = datetime.datetime(2011, 9, 14, 8, 31, 5)


def stamp(seconds):
    return SCAN + datetime.timedelta(seconds=seconds)


def edid(mfg, product, week, year, size_cm, established, standard, descriptors):
    """Builds a 128-byte EDID 1.3 base block with a correct checksum."""
    b = bytearray(128)
    b[0:8] = bytes([0x00, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0x00])
    code = 0
    for ch in mfg:
        code = (code << 5) | (ord(ch) - 64)
    b[8], b[9] = code >> 8, code & 0xFF
    b[10], b[11] = product & 0xFF, product >> 8
    b[16], b[17] = week, year - 1990
    b[18], b[19] = 1, 3
    b[20] = 0x80
    b[21], b[22] = size_cm
    b[23] = 0x78
    b[24] = 0x0A
    b[25:35] = bytes([0xEE, 0x91, 0xA3, 0x54, 0x4C, 0x99, 0x26, 0x0F, 0x50, 0x54])
    b[35:38] = bytes(established)
    pairs = list(standard) + [(1, 1)] * (8 - len(standard))
    for i, (x, y) in enumerate(pairs):
        b[38 + 2 * i], b[39 + 2 * i] = x, y
    for i, d in enumerate(descriptors):
        assert len(d) == 18
        b[54 + 18 * i:72 + 18 * i] = d
    b[126] = 0
    b[127] = (-sum(b[:127])) & 0xFF
    assert sum(b) % 256 == 0
    return "0x" + b.hex()


def text_descriptor(kind, text):
    body = text.encode("ascii")
    if len(body) < 13:
        body += b"\n" + b" " * (12 - len(body))
    return bytes([0, 0, 0, kind, 0]) + body


def timing_descriptor(hex_text):
    d = bytes.fromhex(hex_text)
    assert len(d) == 18
    return d


BUILTIN_EDID = edid(
    "APP", 0x9CB6, 12, 2009, (0x1D, 0x12), (0x21, 0x08, 0x00), [(0x81, 0x00)],
    [
        # 1280 x 800 at 60 Hz, 71 MHz pixel clock, 286 x 179 mm.
        timing_descriptor("bc1b00a05020173030203600" "1eb310000018"),
        bytes([0, 0, 0, 0x10, 0]) + bytes(13),
        text_descriptor(0xFC, "Color LCD"),
        # Standard-timing descriptor: 1152 x 864 (4:3), rest unused.
        bytes([0, 0, 0, 0xFA, 0, 0x71, 0x40, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 0x0A]),
    ])

EXTERNAL_EDID = edid(
    "SAM", 0x0F4A, 45, 2008, (0x2F, 0x1E), (0xAF, 0x3B, 0x80),
    [(0x81, 0x80), (0xB3, 0x00), (0x95, 0x00), (0x71, 0x40), (0x81, 0x40),
     (0x61, 0x40)],
    [
        # 1680 x 1050 at 60 Hz, 119 MHz pixel clock, 474 x 296 mm.
        timing_descriptor("7c2e90a0601a1e4030203600da281100001a"),
        bytes.fromhex("000000fd00384b1e5111000a202020202020"),
        text_descriptor(0xFC, "SyncMaster"),
        text_descriptor(0xFF, "HS9P704512"),
    ])


def data_type(name, parent, detail, version_key, version, items, properties,
              seconds, extra=None):
    d = {
        "_dataType": name,
        "_detailLevel": detail,
        "_items": items,
        "_parentDataType": parent,
        "_properties": properties,
        "_timeStamp": stamp(seconds),
        "_versionInfo": {"com.apple.SystemProfiler." + version_key: version},
    }
    if extra:
        d.update(extra)
    return d


def order(*pairs):
    """_properties as 10.6 prints them: display order per key."""
    props = {"volumes": {"_detailLevel": "0"}}
    for key, value in pairs:
        entry = {"_order": str(value)}
        if key == "_name":
            entry["_isColumn"] = "YES"
        props[key] = entry
    return props


def hardware():
    return data_type(
        "SPHardwareDataType", "SPRootDataType", "-2", "SPPlatformReporter",
        "1000.3", [{
            "_name": "hardware_overview",
            "boot_rom_version": "MBP55.00AC.B03",
            "bus_speed": "1.07 GHz",
            "cpu_type": "Intel Core 2 Duo",
            "current_processor_speed": "2.26 GHz",
            "l2_cache": "3 MB",
            "machine_model": "MacBookPro5,5",
            "machine_name": "MacBook Pro",
            "number_processors": 2,
            "packages": 1,
            "physical_memory": "4 GB",
            "platform_UUID": UUID,
            "serial_number": SERIAL,
            "smc_version_system": "1.47f2",
            "sms_state": "sms_enabled",
        }],
        order(("machine_name", 10), ("machine_model", 11), ("cpu_type", 15),
              ("current_processor_speed", 17), ("packages", 20),
              ("number_processors", 22), ("l2_cache", 26),
              ("physical_memory", 40), ("bus_speed", 45),
              ("boot_rom_version", 51), ("smc_version_system", 80),
              ("serial_number", 90), ("platform_UUID", 98)), 0)


def network():
    proxies = {"ExceptionsList": ["*.local", "169.254/16"], "FTPPassive": "yes"}
    items = [
        {
            "IPv4": {"ConfigMethod": "PPP"},
            "IPv6": {"ConfigMethod": "Automatic"},
            "Proxies": {"FTPPassive": "yes"},
            "_name": "Bluetooth DUN",
            "hardware": "Modem",
            "interface": "Bluetooth-Modem",
            "ip_assigned": "no",
            "spnetwork_service_order": 0,
            "type": "PPP (PPPSerial)",
        },
        {
            "DNS": {"DomainName": "home.example", "ServerAddresses": [ROUTER]},
            "Ethernet": {
                "MAC Address": EN0_MAC,
                "MediaOptions": ["Full Duplex", "flow-control"],
                "MediaSubType": "1000baseT",
            },
            "IPv4": {
                "Addresses": [EN0_IP],
                "ConfigMethod": "DHCP",
                "InterfaceName": "en0",
                "NetworkSignature": "IPv4.Router=" + ROUTER +
                                    ";IPv4.RouterHardwareAddress=00:1f:33:b2:41:0c",
                "Router": ROUTER,
                "SubnetMasks": ["255.255.255.0"],
            },
            "IPv6": {"ConfigMethod": "Automatic"},
            "Proxies": proxies,
            "SubnetMasks": ["255.255.255.0"],
            "_name": "Ethernet",
            "dhcp": {
                "dhcp_domain_name": "home.example",
                "dhcp_domain_name_servers": ROUTER,
                "dhcp_lease_duration": 86400,
                "dhcp_message_type": "0x05",
                "dhcp_routers": ROUTER,
                "dhcp_server_identifier": ROUTER,
                "dhcp_subnet_mask": "255.255.255.0",
            },
            "hardware": "Ethernet",
            "interface": "en0",
            "ip_address": [EN0_IP],
            "ip_assigned": "yes",
            "spnetwork_service_order": 1,
            "type": "Ethernet",
        },
        {
            "Ethernet": {
                "MAC Address": FW0_MAC,
                "MediaOptions": ["Full Duplex"],
                "MediaSubType": "autoselect",
            },
            "IPv4": {"ConfigMethod": "DHCP"},
            "IPv6": {"ConfigMethod": "Automatic"},
            "Proxies": proxies,
            "_name": "FireWire",
            "hardware": "FireWire",
            "interface": "fw0",
            "ip_assigned": "no",
            "spnetwork_service_order": 2,
            "type": "FireWire",
        },
        {
            "DNS": {"DomainName": "home.example", "ServerAddresses": [ROUTER]},
            "Ethernet": {
                "MAC Address": EN1_MAC,
                "MediaOptions": [],
                "MediaSubType": "autoselect",
            },
            "IPv4": {
                "Addresses": [EN1_IP],
                "ConfigMethod": "DHCP",
                "InterfaceName": "en1",
                "Router": ROUTER,
                "SubnetMasks": ["255.255.255.0"],
            },
            "IPv6": {"ConfigMethod": "Automatic"},
            "Proxies": proxies,
            "SubnetMasks": ["255.255.255.0"],
            "_name": "AirPort",
            "hardware": "AirPort",
            "interface": "en1",
            "ip_address": [EN1_IP],
            "ip_assigned": "yes",
            "spnetwork_service_order": 3,
            "type": "AirPort",
        },
    ]
    return data_type(
        "SPNetworkDataType", "SPRootDataType", -1, "SPNetworkReporter", "500.4",
        items,
        order(("_name", 0), ("type", 10), ("hardware", 15), ("interface", 20),
              ("ip_assigned", 29), ("ip_address", 30)), 1)


def software():
    return data_type(
        "SPSoftwareDataType", "SPRootDataType", -2, "SPOSReporter", "500.4", [{
            "64bit_kernel_and_kexts": "no",
            "_name": "os_overview",
            "boot_mode": "normal_boot",
            "boot_volume": "Macintosh HD",
            "kernel_version": "Darwin 10.8.0",
            "local_host_name": "Jane Appleseed\u2019s MacBook Pro",
            "os_version": "Mac OS X 10.6.8 (10K549)",
            "secure_vm": "secure_vm_enabled",
            "uptime": "up 6:21:42:9",
            "user_name": "Jane Appleseed (jane)",
        }],
        order(("os_version", 10), ("kernel_version", 20), ("boot_volume", 30),
              ("boot_mode", 35), ("local_host_name", 40), ("user_name", 50),
              ("secure_vm", 60), ("64bit_kernel_and_kexts", 65),
              ("uptime", 70)), 2)


def parallel_ata():
    return data_type("SPParallelATADataType", "SPHardwareDataType", -1,
                     "SPParallelATAReporter", "1.0.3", [],
                     order(("_name", 0), ("device_model", 20)), 3)


def audio():
    return data_type(
        "SPAudioDataType", "SPHardwareDataType", -1, "SPAudioReporter",
        "4.0.5", [{
            "_items": [
                {"_name": "hda_device_speaker", "hda_connector": "hda_internal"},
                {"_name": "hda_device_hp_out",
                 "hda_connector": "hda_connector_combination_output"},
                {"_name": "hda_device_int_mic_in", "hda_connector": "hda_internal"},
                {"_name": "hda_device_line_in",
                 "hda_connector": "hda_connector_combination_input"},
                {"_name": "hda_device_spdif_out",
                 "hda_connector": "hda_connector_combination_output"},
            ],
            "_name": "hda_compatible_hardware",
            "hda_audio_id": 65,
        }],
        order(("_name", 0), ("hda_audio_id", 10), ("hda_connector", 20)), 4)


def bluetooth():
    return data_type(
        "SPBluetoothDataType", "SPHardwareDataType", -1, "SPBluetoothReporter",
        "2.4.5f3", [{
            "apple_bluetooth_version": "2.4.5f3",
            "device_title": [{
                "Magic Mouse": {
                    "device_addr": "00-1f-f3-aa-12-7c",
                    "device_connected": "attrib_Yes",
                    "device_isfavorite": "attrib_Yes",
                    "device_ispaired": "attrib_Yes",
                    "device_majorClassOfDevice_string": "Peripheral",
                    "device_manufacturer": "Broadcom (0x3, 0x22C)",
                    "device_minorClassOfDevice_string": "Mouse",
                    "device_productID": "0x030d",
                    "device_vendorID": "0x05ac",
                },
            }],
            "local_device_title": {
                "general_address": "00-26-bb-f1-2d-07",
                "general_autoseek_keyboard": "attrib_Yes",
                "general_autoseek_pointing": "attrib_Yes",
                "general_discoverable": "attrib_Yes",
                "general_fw_version": "v51 c4390",
                "general_hw_vendor_id": "0x5ac",
                "general_mfg": "Broadcom",
                "general_name": "Jane Appleseed\u2019s MacBook Pro",
                "general_power": "attrib_On",
                "general_product_id": "0x8213",
            },
        }],
        order(("apple_bluetooth_version", 10), ("local_device_title", 20),
              ("device_title", 30)), 5,
        {"_name": "SPBluetoothDataType"})


def firewire():
    return data_type(
        "SPFireWireDataType", "SPHardwareDataType", -1, "SPFireWireReporter",
        "2.9.4", [{"_name": "sp_fw_bus", "max_device_speed": "800mbit_speed"}],
        order(("_name", 0), ("max_device_speed", 10), ("connected_speed", 20)),
        6)


def displays():
    return data_type(
        "SPDisplaysDataType", "SPHardwareDataType", -1, "SPDisplaysReporter",
        "461.4.1", [{
            "_name": "NVIDIA GeForce 9400M",
            "spdisplays_device-id": "0x0863",
            "spdisplays_ndrvs": [
                {
                    "_name": "Color LCD",
                    "_spdisplays_display-product-id": "9cb6",
                    "_spdisplays_display-serial-number": "0",
                    "_spdisplays_display-vendor-id": "610",
                    "_spdisplays_display-week": "12",
                    "_spdisplays_display-year": "2009",
                    "_spdisplays_edid": BUILTIN_EDID,
                    "_spdisplays_pixels": "1280 x 800",
                    "spdisplays_builtin": "spdisplays_yes",
                    "spdisplays_depth": "CGSThirtytwoBitColor",
                    "spdisplays_display_type": "spdisplays_LCD",
                    "spdisplays_main": "spdisplays_yes",
                    "spdisplays_mirror": "spdisplays_off",
                    "spdisplays_online": "spdisplays_yes",
                    "spdisplays_resolution": "1280 x 800",
                },
                {
                    "_name": "SyncMaster",
                    "_spdisplays_display-product-id": "f4a",
                    "_spdisplays_display-serial-number": "484d5350",
                    "_spdisplays_display-vendor-id": "4c2d",
                    "_spdisplays_display-week": "45",
                    "_spdisplays_display-year": "2008",
                    "_spdisplays_edid": EXTERNAL_EDID,
                    "_spdisplays_pixels": "1680 x 1050",
                    "spdisplays_depth": "CGSThirtytwoBitColor",
                    "spdisplays_mirror": "spdisplays_off",
                    "spdisplays_online": "spdisplays_yes",
                    "spdisplays_resolution": "1680 x 1050 @ 60 Hz",
                    "spdisplays_rotation": "spdisplays_supported",
                },
            ],
            "spdisplays_revision-id": "0x00b1",
            "spdisplays_vendor": "NVIDIA (0x10de)",
            "spdisplays_vram": "256 MB",
            "sppci_bus": "spdisplays_pci_device",
            "sppci_device_type": "spdisplays_gpu",
            "sppci_model": "NVIDIA GeForce 9400M",
        }],
        order(("_name", 0), ("sppci_model", 1), ("sppci_device_type", 20),
              ("sppci_bus", 25), ("spdisplays_vram", 135),
              ("spdisplays_resolution", 145), ("spdisplays_depth", 150),
              ("spdisplays_vendor", 155), ("spdisplays_main", 165),
              ("spdisplays_mirror", 166), ("spdisplays_online", 168),
              ("spdisplays_revision-id", 170)), 7)


def bank(name, serial):
    return {
        "_name": name,
        "dimm_manufacturer": "0x80CE",
        "dimm_part_number": "0x" + "M471B5673FH0-CF8  ".encode().hex().upper(),
        "dimm_serial_number": serial,
        "dimm_size": "2 GB",
        "dimm_speed": "1067 MHz",
        "dimm_status": "ok",
        "dimm_type": "DDR3",
    }


def memory():
    return data_type(
        "SPMemoryDataType", "SPHardwareDataType", -1, "SPMemoryReporter",
        "6.4.1", [{
            "_items": [bank("BANK 0/DIMM0", "0x4A21C8F3"),
                       bank("BANK 1/DIMM0", "0x4A21C90E")],
            "_name": "global_name",
            "global_ecc_state": "ecc_disabled",
        }],
        order(("_name", 10), ("dimm_size", 20), ("dimm_type", 30),
              ("dimm_speed", 40), ("dimm_status", 50),
              ("dimm_manufacturer", 60), ("dimm_part_number", 70),
              ("dimm_serial_number", 80)), 8)


def printers():
    items = [
        {
            "_name": "HP LaserJet P2055dn",
            "cupsversion": "1.4.7 (cups-218.32)",
            "default": "yes",
            "driverversion": "10.4",
            "fax": "no",
            "ppd": "HP LaserJet P2050 Series",
            "ppdfileversion": "1.1.0.105",
            "printserver": "Local",
            "psversion": "(3010.107) 0",
            "scanner": "no",
            "shared": "no",
            "status": "idle",
            "uri": "dnssd://HP%20LaserJet%20P2055dn._pdl-datastream._tcp.local./?bidi",
        },
        {
            "_name": "Canon MX870 series",
            "cupsversion": "1.4.7 (cups-218.32)",
            "default": "no",
            "driverversion": "7.20.0",
            "fax": "yes",
            "ppd": "Canon MX870 series",
            "ppdfileversion": "1.0",
            "printserver": "Local",
            "psversion": "(3011.104) 0",
            "scanner": "yes",
            "scannerUUID": "7B0E3D52-8A1F-4C6E-9D27-3F5A0C81B6E4",
            "scannerappbundlepath": "/Applications/Image Capture.app",
            "scannerappversion": "6.0.1",
            "shared": "no",
            "status": "idle",
            "uri": "usb://Canon/MX870%20series?serial=21A4B7",
        },
        {
            "_name": "CanoScan LiDE 210",
            "scanner": "yes",
            "scannerUUID": "C1D9A8E4-2B7F-4E03-8A6D-95F1E2B0C3D7",
            "scannerapppath": "/Applications/Image Capture.app",
            "scannerappversion": "6.0.1",
        },
    ]
    return data_type(
        "SPPrintersDataType", "SPHardwareDataType", "-2", "SPPrintersReporter",
        "5.2.2", items,
        order(("_name", 10), ("status", 20), ("printserver", 30),
              ("driverversion", 40), ("default", 50), ("shared", 60),
              ("uri", 70), ("ppd", 80), ("ppdfileversion", 90),
              ("psversion", 100), ("cupsversion", 110), ("fax", 120),
              ("scanner", 130), ("scannerapppath", 140),
              ("scannerappbundlepath", 150), ("scannerappversion", 160),
              ("scannerUUID", 170)), 9)


def serial_ata():
    controller = {
        "_name": "NVidia MCP79 AHCI",
        "spsata_negotiatedlinkspeed": "3 Gigabit",
        "spsata_portdescription": "AHCI Version 1.20 Supported",
        "spsata_portspeed": "3 Gigabit",
        "spsata_product": "MCP79 AHCI",
        "spsata_vendor": "NVidia",
    }
    disk = dict(controller)
    disk["_items"] = [{
        "_name": "Hitachi HTS545050B9SA02",
        "bsd_name": "disk0",
        "detachable_drive": "no",
        "device_model": "Hitachi HTS545050B9SA02                 ",
        "device_revision": "PB4AC60W",
        "device_serial": "      100621PBN40317E4K6SP",
        "partition_map_type": "guid_partition_map_type",
        "removable_media": "no",
        "size": "500.11 GB",
        "size_in_bytes": 500107862016,
        "smart_status": "Verified",
        "spsata_medium_type": "Rotational",
        "spsata_ncq": "Yes",
        "spsata_ncq_depth": "32",
        "volumes": [
            {
                "_name": "Macintosh HD",
                "bsd_name": "disk0s2",
                "file_system": "Journaled HFS+",
                "free_space": "312.45 GB",
                "free_space_in_bytes": 312450187264,
                "mount_point": "/",
                "size": "399.76 GB",
                "size_in_bytes": 399763888128,
                "writable": "yes",
            },
            {
                "_name": "BOOTCAMP",
                "bsd_name": "disk0s3",
                "file_system": "NTFS",
                "free_space": "41.27 GB",
                "free_space_in_bytes": 41270001664,
                "mount_point": "/Volumes/BOOTCAMP",
                "size": "100.13 GB",
                "size_in_bytes": 100133584896,
                "writable": "no",
            },
        ],
    }]
    optical = dict(controller)
    optical["spsata_negotiatedlinkspeed"] = "1.5 Gigabit"
    optical["_items"] = [{
        "_name": "MATSHITADVD-R   UJ-868",
        "detachable_drive": "no",
        "device_model": "MATSHITADVD-R   UJ-868                  ",
        "device_revision": "KB19    ",
        "device_serial": "            BC2A0937219",
        "spsata_async_notify": "No",
        "spsata_power_off": "Yes",
    }]
    return data_type(
        "SPSerialATADataType", "SPHardwareDataType", -1,
        "SPSerialATAReporter", "1.0.9", [disk, optical],
        order(("_name", 0), ("spsata_vendor", 28), ("spsata_product", 30),
              ("spsata_portspeed", 34), ("spsata_negotiatedlinkspeed", 35),
              ("device_model", 42), ("device_revision", 44),
              ("device_serial", 46), ("removable_media", 56),
              ("bsd_name", 62), ("size", 10), ("free_space", 12),
              ("mount_point", 64), ("smart_status", 70)), 10)


def parallel_scsi():
    return data_type("SPParallelSCSIDataType", "SPHardwareDataType", -1,
                     "SPParallelSCSIReporter", "1.6.2", [],
                     order(("_name", 0), ("device_model", 20)), 11)


def usb():
    def device(name, **keys):
        d = {"_name": name}
        d.update(keys)
        return d

    flash = device(
        "Flash Disk",
        bcd_device="1.00",
        bsd_name="disk2",
        bus_power="500",
        bus_power_used="100",
        detachable_drive="yes",
        device_speed="high_speed",
        location_id="0x26210000",
        manufacturer="Generic",
        partition_map_type="mbr_partition_map_type",
        product_id="0x1000",
        removable_media="yes",
        serial_num="3FA90B2C5E71",
        size="4.03 GB",
        size_in_bytes=4027580416,
        smart_status="Not Supported",
        vendor_id="0x090c  (Silicon Motion, Inc. - Taiwan)",
        volumes=[{
            "_name": "JANE_USB",
            "bsd_name": "disk2s1",
            "file_system": "MS-DOS FAT32",
            "free_space": "3.12 GB",
            "free_space_in_bytes": 3119513600,
            "mount_point": "/Volumes/JANE_USB",
            "size": "4.03 GB",
            "size_in_bytes": 4026531840,
            "writable": "yes",
        }])
    mouse = device(
        "USB Optical Mouse",
        bcd_device="3.40",
        bus_power="500",
        bus_power_used="100",
        device_speed="low_speed",
        location_id="0x26220000",
        manufacturer="Logitech",
        product_id="0xc018",
        vendor_id="0x046d  (Logitech Inc.)")
    scanner = device(
        "CanoScan",
        bcd_device="1.00",
        bus_power="500",
        bus_power_used="500",
        device_speed="high_speed",
        location_id="0x26230000",
        manufacturer="Canon",
        product_id="0x190a",
        vendor_id="0x04a9  (Canon Inc.)")
    hub = device(
        "USB2.0 Hub",
        _items=[flash, mouse, scanner],
        bcd_device="1.11",
        bus_power="500",
        bus_power_used="100",
        device_speed="high_speed",
        location_id="0x26200000",
        product_id="0x0608",
        vendor_id="0x05e3  (Genesys Logic, Inc.)")
    isight = device(
        "Built-in iSight",
        bcd_device="4.55",
        bus_power="500",
        bus_power_used="500",
        device_speed="high_speed",
        location_id="0x24400000",
        manufacturer="Apple Inc.",
        product_id="0x8507",
        serial_num="8J9AB41G8MNA2L00",
        vendor_id="apple_vendor_id")
    keyboard = device(
        "Apple Internal Keyboard / Trackpad",
        bcd_device="0.70",
        bus_power="500",
        bus_power_used="40",
        device_speed="full_speed",
        location_id="0x04600000",
        manufacturer="Apple Inc.",
        product_id="0x0237",
        vendor_id="apple_vendor_id")
    ir = device(
        "IR Receiver",
        bcd_device="0.16",
        bus_power="500",
        bus_power_used="100",
        device_speed="low_speed",
        location_id="0x04500000",
        manufacturer="Apple Computer, Inc.",
        product_id="0x8242",
        vendor_id="apple_vendor_id")
    bt = device(
        "BRCM2046 Hub",
        _items=[device(
            "Bluetooth USB Host Controller",
            bcd_device="1.00",
            bus_power="500",
            bus_power_used="0",
            device_speed="full_speed",
            location_id="0x06110000",
            manufacturer="Apple Inc.",
            product_id="0x8213",
            vendor_id="apple_vendor_id")],
        bcd_device="1.00",
        bus_power="500",
        bus_power_used="0",
        device_speed="full_speed",
        location_id="0x06100000",
        manufacturer="Apple Inc.",
        product_id="0x4500",
        vendor_id="0x0a5c  (Broadcom Corp.)")

    def bus(name, controller, pci_device, number, devices):
        b = {
            "_name": name,
            "host_controller": controller,
            "pci_device": pci_device + " ",
            "pci_revision": "0x00b1 ",
            "pci_vendor": "0x10de ",
            "usb_bus_number": number + " ",
        }
        if devices:
            b["_items"] = devices
        return b

    buses = [
        bus("USB20Bus", "AppleUSBEHCI", "0x0aa9", "0x26", [hub]),
        bus("USB20Bus", "AppleUSBEHCI", "0x0aa9", "0x24", [isight]),
        bus("USBBus", "AppleUSBOHCI", "0x0aa7", "0x04", [keyboard, ir]),
        bus("USBBus", "AppleUSBOHCI", "0x0aa7", "0x06", [bt]),
        bus("USBBus", "AppleUSBOHCI", "0x0aa7", "0x26", []),
    ]
    return data_type(
        "SPUSBDataType", "SPHardwareDataType", -1, "SPUSBReporter", "400.4.1",
        buses,
        order(("_name", 0), ("product_id", 1), ("vendor_id", 2),
              ("bcd_device", 3), ("serial_num", 4), ("device_speed", 5),
              ("manufacturer", 6), ("location_id", 7), ("bus_power", 8),
              ("bus_power_used", 9), ("size", 10), ("free_space", 12),
              ("removable_media", 34), ("bsd_name", 42), ("mount_point", 44)),
        12)


def airport():
    return data_type(
        "SPAirPortDataType", "SPNetworkDataType", -1, "SPAirPortReporter",
        "6.0", [{
            "spairport_airport_interfaces": [{
                "_name": "en1",
                "spairport_current_network_information": {
                    "_name": "HomeNet",
                    "spairport_network_bssid": "00:1f:33:b2:41:0d",
                    "spairport_network_channel": 6,
                    "spairport_network_country_code": "US",
                    "spairport_network_phymode": "802.11n",
                    "spairport_network_rate": 130,
                    "spairport_security_mode": "spairport_security_mode_wpa2_personal",
                    "spairport_signal_noise": "-52 dBm / -91 dBm",
                },
                "spairport_status_information": "spairport_status_connected",
                "spairport_supported_channels": [1, 2, 3, 4, 5, 6, 7, 8, 9, 10,
                                                 11, 36, 40, 44, 48, 149, 153,
                                                 157, 161, 165],
                "spairport_supported_phymodes": "802.11 a/b/g/n",
                "spairport_wake_on_wireless": "spairport_wake_on_wireless_supported",
                "spairport_wireless_card_type": "AirPort Extreme  (0x14E4, 0x8D)",
                "spairport_wireless_country_code": "US",
                "spairport_wireless_firmware_version": "Broadcom BCM43xx 1.0 (5.10.131.42.4)",
                "spairport_wireless_locale": "FCC",
            }],
            "spairport_software_information": {
                "spairport_airportutility_version": "5.5.3 (553.20)",
                "spairport_configd_version": "6.2.8 (628.1)",
                "spairport_extra_version": "6.2.2 (622.2)",
                "spairport_family_version": "3.2.1 (321.1)",
                "spairport_networkpref_version": "6.2.2 (622.2)",
                "spairport_profiler_version": "6.0 (600.9)",
            },
        }],
        order(("spairport_software_information", 10),
              ("spairport_airport_interfaces", 20)), 13,
        {"_name": "_name"})


def firewall():
    return data_type(
        "SPFirewallDataType", "SPNetworkDataType", 0, "SPFirewallReporter",
        "500.4", [{
            "_name": "spfirewall_settings",
            "spfirewall_applications": {
                "com.apple.iChat": "spfirewall_allow_all",
                "com.skype.skype": "spfirewall_block_all",
                "org.mozilla.firefox": "spfirewall_allow_all",
            },
            "spfirewall_globalstate": "spfirewall_globalstate_limit_connections",
            "spfirewall_loggingenabled": "Yes",
            "spfirewall_services": {
                "File Sharing (AFP, SMB)": "spfirewall_allow_all",
                "Printer Sharing": "spfirewall_block_all",
                "Remote Login (SSH)": "spfirewall_allow_all",
            },
            "spfirewall_stealthenabled": "No",
        }],
        order(("spfirewall_globalstate", 10), ("spfirewall_services", 20),
              ("spfirewall_applications", 30)), 14)


def network_location():
    proxies = {"ExceptionsList": ["*.local", "169.254/16"], "FTPPassive": "yes"}
    smb = {"NetBIOSName": "Jane-MBP", "Workgroup": "workgroup"}
    office = {
        "_name": "Office",
        "spnetworklocation_isActive": "no",
        "spnetworklocation_services": [{
            "IPv4": {"Addresses": ["10.20.0.57"], "ConfigMethod": "Manual",
                     "Router": "10.20.0.1", "SubnetMasks": ["255.255.0.0"]},
            "IPv6": {"ConfigMethod": "Automatic"},
            "Proxies": proxies,
            "SMB": {"NetBIOSName": "JANE-OFFICE", "Workgroup": "CORP"},
            "_name": "Ethernet",
            "bsd_device_name": "en0",
            "hardware_address": EN0_MAC,
            "type": "Ethernet",
        }],
    }
    automatic = {
        "_name": "Automatic",
        "spnetworklocation_isActive": "yes",
        "spnetworklocation_services": [
            {
                "IPv4": {"ConfigMethod": "PPP"},
                "IPv6": {"ConfigMethod": "Automatic"},
                "PPP": {"ACSPEnabled": "no", "CommRedialCount": 1,
                        "DialOnDemand": "no", "DisconnectOnIdle": "yes",
                        "DisconnectOnIdleTimer": 600,
                        "Logfile": "/var/log/ppp.log"},
                "Proxies": {"FTPPassive": "yes"},
                "_name": "Bluetooth DUN",
                "type": "PPP",
            },
            {
                "IPv4": {"ConfigMethod": "DHCP"},
                "IPv6": {"ConfigMethod": "Automatic"},
                "Proxies": proxies,
                "SMB": smb,
                "_name": "Ethernet",
                "bsd_device_name": "en0",
                "hardware_address": EN0_MAC,
                "type": "Ethernet",
            },
            {
                "IPv4": {"ConfigMethod": "DHCP"},
                "IPv6": {"ConfigMethod": "Automatic"},
                "Proxies": proxies,
                "_name": "FireWire",
                "bsd_device_name": "fw0",
                "hardware_address": FW0_MAC,
                "type": "FireWire",
            },
            {
                "IEEE80211": {
                    "JoinMode": "Automatic",
                    "JoinModeFallback": "Prompt",
                    "PowerEnabled": True,
                    "RememberRecentNetworks": True,
                },
                "IPv4": {"ConfigMethod": "DHCP"},
                "IPv6": {"ConfigMethod": "Automatic"},
                "Proxies": proxies,
                "_name": "AirPort",
                "bsd_device_name": "en1",
                "hardware_address": EN1_MAC,
                "type": "IEEE80211",
            },
        ],
    }
    return data_type(
        "SPNetworkLocationDataType", "SPNetworkDataType", 0,
        "SPNetworkLocationReporter", "500.4", [office, automatic],
        order(("_name", 0), ("spnetworklocation_isActive", 1), ("type", 10),
              ("bsd_device_name", 20), ("hardware_address", 25), ("IPv4", 100),
              ("IPv6", 200), ("DNS", 400), ("Proxies", 600),
              ("Ethernet", 700)), 15)


def network_volume():
    return data_type(
        "SPNetworkVolumeDataType", "SPNetworkDataType", 0,
        "SPNetworkVolumeReporter", "500.4", [
            {"_name": "net", "spnetworkvolume_automounted": "Yes",
             "spnetworkvolume_fsmtnonname": "/net",
             "spnetworkvolume_fstypename": "autofs",
             "spnetworkvolume_mntfromname": "map -hosts"},
            {"_name": "home", "spnetworkvolume_automounted": "Yes",
             "spnetworkvolume_fsmtnonname": "/home",
             "spnetworkvolume_fstypename": "autofs",
             "spnetworkvolume_mntfromname": "map auto_home"},
        ],
        order(("_name", 0), ("spnetworkvolume_fstypename", 1),
              ("spnetworkvolume_fsmtnonname", 2),
              ("spnetworkvolume_mntfromname", 3)), 16)


def app(name, path, modified, version=None, has64="yes", runtime="arch_x86",
        info=None):
    a = {"_name": name, "lastModified": modified, "path": path}
    if version is not None:
        a["version"] = version
    if has64 is not None:
        a["has64BitIntelCode"] = has64
    if runtime is not None:
        a["runtime_environment"] = runtime
    if info is not None:
        a["info"] = info
    return a


def applications():
    d = datetime.datetime
    items = [
        app("Safari", "/Applications/Safari.app", d(2011, 7, 21, 19, 4, 12),
            "5.1", info="5.1, Copyright \u00a9 2003-2011 Apple Inc."),
        app("Mail", "/Applications/Mail.app", d(2011, 6, 15, 22, 41, 3),
            "4.5", info="4.5, Copyright \u00a9 1995-2011 Apple Inc."),
        app("iTunes", "/Applications/iTunes.app", d(2011, 8, 23, 17, 55, 40),
            "10.4.1", info="iTunes 10.4.1, \u00a9 2000-2011 Apple Inc. All rights reserved."),
        app("Terminal", "/Applications/Utilities/Terminal.app",
            d(2011, 6, 15, 22, 40, 51), "2.1.2",
            info="2.1.2, \u00a9 1995-2010 Apple Inc. All Rights Reserved."),
        app("Preview", "/Applications/Preview.app", d(2011, 6, 15, 22, 41, 20),
            "5.0.3", info="5.0.3, Copyright 2002-2010 Apple Inc."),
        app("Firefox", "/Applications/Firefox.app", d(2011, 8, 26, 9, 12, 7),
            "6.0.1", runtime="universal",
            info="Firefox 6.0.1\nCopyright \u00a9 1998-2011 Contributors"),
        app("Microsoft Word", "/Applications/Microsoft Office 2008/Microsoft Word.app",
            d(2010, 11, 9, 14, 2, 33), "12.2.8", has64="no", runtime="arch_i386",
            info="12.2.8 (101117), \u00a9 2007 Microsoft Corporation. All rights reserved."),
        app("Skype", "/Applications/Skype.app", d(2011, 5, 30, 11, 20, 45),
            "5.1.0.935", has64=None, runtime="arch_i386",
            info="Skype version 5.1.0.935 (935)"),
        app("AppleWorks 6", "/Applications/AppleWorks 6/AppleWorks 6.app",
            d(2004, 3, 2, 8, 0, 0), "6.2.9", has64="no", runtime="arch_ppc"),
        app("Grapher", "/Applications/Utilities/Grapher.app",
            d(2009, 6, 27, 6, 51, 30), "2.1"),
        app("Jane's Budget Tool", "/Users/jane/Applications/Jane's Budget Tool.app",
            d(2011, 2, 14, 20, 30, 0), has64="no", runtime="arch_i386"),
        app("Re\u0301sume\u0301 Builder", "/Applications/Re\u0301sume\u0301 Builder.app",
            d(2010, 4, 18, 16, 45, 12), "2.3", runtime="universal"),
        app("VLC", "/Applications/VLC.app", d(2011, 7, 16, 12, 3, 58),
            "1.1.11", info="VLC media player 1.1.11, Copyright \u00a9 1996-2011 VideoLAN."),
        app("VLC", "/Volumes/JANE_USB/VLC.app", d(2011, 7, 16, 12, 3, 58),
            "1.1.11", info="VLC media player 1.1.11, Copyright \u00a9 1996-2011 VideoLAN."),
        app("Xcode", "/Developer/Applications/Xcode.app", d(2011, 2, 22, 3, 15, 9),
            "3.2.6", info="Xcode version 3.2.6"),
    ]
    return data_type(
        "SPApplicationsDataType", "SPSoftwareDataType", 1,
        "SPApplicationsReporter", "500.4", items,
        order(("_name", 0), ("version", 1), ("lastModified", 2),
              ("runtime_environment", 3), ("has64BitIntelCode", 4)), 17)


def startup_items():
    return data_type(
        "SPStartupItemDataType", "SPSoftwareDataType", 1,
        "SPStartupItemReporter", "500.4", [{
            "Description": "Canon inkjet printer status monitor",
            "OrderPreference": "None",
            "Provides": ["CanonIJMonitor"],
            "_name": "CanonIJMonitor",
            "spstartupitem_enabled": "yes",
            "spstartupitem_location": "/Library/StartupItems/CanonIJMonitor",
        }],
        order(("_name", 0), ("spstartupitem_enabled", 10),
              ("spstartupitem_location", 20)), 18)


def disc_burning():
    return data_type(
        "SPDiscBurningDataType", "SPHardwareDataType", -1,
        "SPDiscBurningReporter", "182", [{
            "_name": "MATSHITA DVD-R   UJ-868",
            "burn_support": "DRDeviceSupportLevelAppleShipping",
            "device_cache": "2048 KB",
            "device_cdwrite": "-R, -RW",
            "device_dvdwrite": "-R, -R DL, -RW, +R, +R DL, +RW",
            "device_media": "media_none",
            "device_readdvd": "yes",
            "device_strategies": "CD-TAO, CD-SAO, DVD-DAO",
            "firmware": "KB19",
            "interconnect": "ATAPI",
        }],
        order(("_name", 0), ("firmware", 10), ("interconnect", 20),
              ("burn_support", 30)), 19)


def power():
    return data_type(
        "SPPowerDataType", "SPHardwareDataType", "0", "SPPowerReporter", "1.6",
        [
            {
                "_name": "spbattery_information",
                "sppower_battery_charge_info": {
                    "sppower_battery_at_warn_level": "FALSE",
                    "sppower_battery_current_capacity": 4238,
                    "sppower_battery_fully_charged": "FALSE",
                    "sppower_battery_is_charging": "TRUE",
                    "sppower_battery_max_capacity": 4913,
                },
                "sppower_battery_health_info": {
                    "sppower_battery_cycle_count": 212,
                    "sppower_battery_health": "Good",
                },
                "sppower_battery_installed": "TRUE",
                "sppower_battery_model_info": {
                    "sppower_battery_cell_revision": "0102",
                    "sppower_battery_device_name": "bq20z951",
                    "sppower_battery_firmware_version": "0110",
                    "sppower_battery_hardware_revision": "0002",
                    "sppower_battery_manufacturer": "SMP",
                    "sppower_battery_serial_number": "9G9262DSCJTEA",
                },
                "sppower_current_amperage": 1528,
                "sppower_current_voltage": 12384,
            },
            {
                "AC Power": {
                    "Automatic Restart On Power Loss": "No",
                    "Current Power Source": "TRUE",
                    "Disk Sleep Timer": 10,
                    "Display Sleep Timer": 10,
                    "Display Sleep Uses Dim": "Yes",
                    "Hibernate Mode": 3,
                    "System Sleep Timer": 10,
                    "Wake On AC Change": "No",
                    "Wake On Clamshell Open": "Yes",
                    "Wake On LAN": "Yes",
                },
                "Battery Power": {
                    "Disk Sleep Timer": 10,
                    "Display Sleep Timer": 2,
                    "Display Sleep Uses Dim": "Yes",
                    "Hibernate Mode": 3,
                    "ReduceBrightness": "Yes",
                    "System Sleep Timer": 5,
                    "Wake On AC Change": "No",
                    "Wake On Clamshell Open": "Yes",
                },
                "_name": "sppower_information",
            },
            {"_name": "sppower_hwconfig_information",
             "sppower_ups_installed": "FALSE"},
            {
                "_name": "sppower_ac_charger_information",
                "sppower_ac_charger_ID": "0x0100",
                "sppower_ac_charger_family": "0x0085",
                "sppower_ac_charger_revision": "0x0000",
                "sppower_ac_charger_serial_number": "0x00c4e19f",
                "sppower_ac_charger_watts": "60",
                "sppower_battery_charger_connected": "TRUE",
                "sppower_battery_is_charging": "TRUE",
            },
        ],
        order(("_name", 0), ("sppower_battery_charge_info", 10),
              ("sppower_battery_health_info", 20)), 20)


def logs():
    return data_type(
        "SPLogsDataType", "SPSoftwareDataType", 1, "SPLogsReporter", "500.4", [{
            "_name": "system.log",
            "byteSize": 2048,
            "contents": "Sep 14 10:29:51 Jane-MBP kernel[0]: USBMSC Identifier "
                        "(non-unique): 3FA90B2C5E71 0x90c 0x1000 0x1100\n"
                        "Sep 14 10:29:52 Jane-MBP fseventsd[34]: "
                        "event logs in /Volumes/JANE_USB/.fseventsd out of sync",
            "lastModified": datetime.datetime(2011, 9, 14, 8, 29, 52),
            "source": "/private/var/log/system.log",
        }],
        order(("_name", 0), ("source", 10), ("lastModified", 20)), 21,
        {"_splitPercentage": 0.2})


def fonts():
    return data_type(
        "SPFontsDataType", "SPSoftwareDataType", "1", "SPFontsReporter",
        "500.4", [{
            "_name": "Helvetica.dfont",
            "enabled": "yes",
            "path": "/System/Library/Fonts/Helvetica.dfont",
            "type": "dfont",
            "typefaces": [{
                "_name": "Helvetica",
                "copyright": "\u00a9 1990-2006 Apple Computer Inc. "
                             "\u00a9 1981 Linotype AG \u00a9 1990-91 Type Solutions Inc.",
                "family": "Helvetica",
                "fullname": "Helvetica",
                "style": "Regular",
                "unique": "Helvetica; 6.1d18e1; 2009-06-30",
                "valid": "yes",
                "version": "6.1d18e1",
            }],
            "valid": "yes",
        }],
        order(("_name", 0), ("type", 10), ("path", 20)), 22)


# The order the agent asks for them; full.xml keeps the profiler's own order.
COLLECTED = [hardware, network, software, parallel_ata, audio, bluetooth,
             firewire, displays, memory, printers, serial_ata, parallel_scsi,
             usb, airport, firewall, network_location, network_volume,
             applications, startup_items, disc_burning, power]
FULL_ORDER = ["SPHardwareDataType", "SPParallelATADataType",
              "SPApplicationsDataType", "SPAudioDataType",
              "SPBluetoothDataType", "SPDiscBurningDataType",
              "SPFireWireDataType", "SPFirewallDataType", "SPFontsDataType",
              "SPDisplaysDataType", "SPNetworkLocationDataType",
              "SPLogsDataType", "SPMemoryDataType", "SPNetworkDataType",
              "SPParallelSCSIDataType", "SPPowerDataType",
              "SPPrintersDataType", "SPSerialATADataType",
              "SPSoftwareDataType", "SPStartupItemDataType", "SPUSBDataType",
              "SPNetworkVolumeDataType", "SPAirPortDataType"]


def render(dicts):
    text = plistlib.dumps(dicts, fmt=plistlib.FMT_XML, sort_keys=True)
    assert text.startswith(HEADER) and text.endswith(FOOTER), text[:200]
    return text


def main():
    os.makedirs(OUT, exist_ok=True)
    by_name = {}
    for make in COLLECTED + [logs, fonts]:
        d = make()
        by_name[d["_dataType"]] = d
    for make in COLLECTED:
        name = make()["_dataType"]
        with open(os.path.join(OUT, name + ".xml"), "wb") as f:
            f.write(render([by_name[name]]))
    assert sorted(FULL_ORDER) == sorted(by_name)
    with open(os.path.join(OUT, "full.xml"), "wb") as f:
        f.write(render([by_name[n] for n in FULL_ORDER]))


if __name__ == "__main__":
    main()
