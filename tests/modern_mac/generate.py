#!/usr/bin/env python3
"""Writes the profiler fixtures of the modern sample Mac.

A MacBook Pro (14-inch, Nov 2023, Mac15,6) with an Apple M3 Pro on macOS
15.3.2 in a German locale (decimal commas in sizes): the NVMe disk, the
mounted APFS volumes in SPStorageDataType, a USB stick whose disk sits in a
"Media" list, an external main display with EDID beside a built-in panel
without one. The facts live here once so every data type agrees with the
others. Run it from any directory; it rewrites profiler/*.xml next to this
script. The EDID helpers and the document layout come from the older sample
Mac's generator.
"""

import datetime
import os
import sys

HERE = os.path.dirname(os.path.abspath(__file__))
OUT = os.path.join(HERE, "profiler")
sys.dont_write_bytecode = True  # no cache beside the older sample
sys.path.insert(0, os.path.join(HERE, "..", "sample_mac"))
import generate as older  # noqa: E402  (edid, order, render)

SERIAL = "K7XQ2N9W4R"
UUID = "8D1E6B2A-3C4F-4E7A-9B5D-2F6C8A1E7D3B"
EN0_MAC = "f4:d4:88:6a:1c:e2"
EN0_IP = "192.168.178.42"
ROUTER = "192.168.178.1"
SCAN = datetime.datetime(2025, 3, 18, 9, 12, 40)

# The one APFS container of the internal disk, shared by its volumes.
CONTAINER_BYTES = 994662584320
CONTAINER_FREE = 612348252160
STICK_BYTES = 30752636928
STICK_VOLUME_BYTES = 30741102592
STICK_FREE = 21317627904


def data_type(name, parent, version_key, version, items, properties, seconds):
    """A data type's dictionary as macOS 15 prints it."""
    return {
        "_SPCommandLineArguments": ["/usr/sbin/system_profiler", "-nospawn", "-xml",
                                    name, "-detailLevel", "full"],
        "_SPCompletionInterval": 0.05 + seconds / 100,
        "_SPResponseTime": 0.08 + seconds / 100,
        "_dataType": name,
        "_detailLevel": -1,
        "_items": items,
        "_parentDataType": parent,
        "_properties": properties,
        "_timeStamp": SCAN + datetime.timedelta(seconds=seconds),
        "_versionInfo": {"com.apple.SystemProfiler." + version_key: version},
    }


def empty(name, parent, version_key, seconds):
    """A type this Mac no longer has: a document without items."""
    return data_type(name, parent, version_key, "1.0", [],
                     older.order(("_name", 0)), seconds)


def hardware():
    return data_type(
        "SPHardwareDataType", "SPRootDataType", "SPPlatformReporter", "1500", [{
            "_name": "hardware_overview",
            "activation_lock_status": "activation_lock_disabled",
            "boot_rom_version": "11881.81.4",
            "chip_type": "Apple M3 Pro",
            "machine_model": "Mac15,6",
            "machine_name": "MacBook Pro",
            "model_number": "Z1AU0029PD/A",
            "number_processors": "proc 12:6:6",
            "os_loader_version": "11881.81.4",
            "physical_memory": "18 GB",
            "platform_UUID": UUID,
            "provisioning_UDID": "00006030-001A2C3E0E91802E",
            "serial_number": SERIAL,
        }],
        older.order(("machine_name", 10), ("machine_model", 11), ("model_number", 12),
                    ("chip_type", 15), ("number_processors", 22),
                    ("physical_memory", 40), ("boot_rom_version", 51),
                    ("serial_number", 90), ("platform_UUID", 98)), 0)


def network():
    proxies = {"ExceptionsList": ["*.local", "169.254/16"], "FTPPassive": "yes"}
    items = [
        {
            "DNS": {"ServerAddresses": [ROUTER]},
            "Ethernet": {"MAC Address": EN0_MAC, "MediaOptions": [],
                         "MediaSubType": "autoselect"},
            "IPv4": {
                "Addresses": [EN0_IP],
                "ConfigMethod": "DHCP",
                "InterfaceName": "en0",
                "Router": ROUTER,
                "SubnetMasks": ["255.255.255.0"],
            },
            "IPv6": {"ConfigMethod": "Automatic"},
            "Proxies": proxies,
            "SubnetMasks": ["255.255.255.0"],
            "_name": "Wi-Fi",
            "hardware": "AirPort",
            "interface": "en0",
            "ip_address": [EN0_IP],
            "spnetwork_service_order": 0,
            "type": "AirPort",
        },
        {
            "IPv4": {"ConfigMethod": "DHCP"},
            "IPv6": {"ConfigMethod": "Automatic"},
            "Proxies": proxies,
            "_name": "Thunderbolt Bridge",
            "hardware": "Bridge",
            "interface": "bridge0",
            "spnetwork_service_order": 1,
            "type": "Bridge",
        },
    ]
    return data_type("SPNetworkDataType", "SPRootDataType", "SPNetworkReporter", "2.1",
                     items, older.order(("_name", 0), ("type", 10), ("interface", 20),
                                        ("ip_address", 30)), 1)


def software():
    return data_type(
        "SPSoftwareDataType", "SPRootDataType", "SPOSReporter", "1.0", [{
            "_name": "os_overview",
            "boot_mode": "normal_boot",
            "boot_volume": "Macintosh HD",
            "kernel_version": "Darwin 24.3.0",
            "local_host_name": "Sam Rivera\u2019s MacBook Pro",
            "os_version": "macOS 15.3.2 (24D81)",
            "secure_vm": "secure_vm_enabled",
            "system_integrity": "integrity_enabled",
            "uptime": "up 2:03:14:09",
            "user_name": "Sam Rivera (sam)",
        }],
        older.order(("os_version", 10), ("kernel_version", 20), ("boot_volume", 30),
                    ("boot_mode", 35), ("local_host_name", 40), ("user_name", 50),
                    ("secure_vm", 60), ("system_integrity", 65), ("uptime", 70)), 2)


def audio():
    return data_type(
        "SPAudioDataType", "SPHardwareDataType", "SPAudioReporter", "600.2", [{
            "_items": [
                {"_name": "MacBook Pro Microphone", "coreaudio_default_audio_input_device":
                 "spaudio_yes", "coreaudio_device_input": 1,
                 "coreaudio_device_manufacturer": "Apple Inc.",
                 "coreaudio_device_srate": 48000, "coreaudio_device_transport":
                 "coreaudio_device_type_builtin"},
                {"_name": "MacBook Pro Speakers", "coreaudio_default_audio_output_device":
                 "spaudio_yes", "coreaudio_device_manufacturer": "Apple Inc.",
                 "coreaudio_device_output": 2, "coreaudio_device_srate": 48000,
                 "coreaudio_device_transport": "coreaudio_device_type_builtin"},
            ],
            "_name": "coreaudio_device",
        }], older.order(("_name", 0)), 4)


def bluetooth():
    return data_type(
        "SPBluetoothDataType", "SPHardwareDataType", "SPBluetoothReporter", "1.0", [{
            "controller_properties": {
                "controller_address": "F4:D4:88:6A:1C:E3",
                "controller_chipset": "BCM_4388",
                "controller_state": "attrib_on",
                "controller_transport": "PCIe",
            },
            "device_connected": [{"Magic Mouse": {
                "device_address": "AC:49:DB:12:7F:30",
                "device_minorType": "Mouse",
                "device_batteryLevelMain": "81 %",
            }}],
        }], older.order(("_name", 0)), 5)


def displays():
    external = older.edid(
        "DEL", 0x41F9, 10, 2023, (60, 34), (0x21, 0x08, 0x00),
        [(0xD1, 0xC0), (0x81, 0x80), (0xA9, 0xC0), (0x71, 0x40)],
        [
            # 3840 x 2160 at 60 Hz, 533.25 MHz pixel clock, 597 x 336 mm.
            older.timing_descriptor("4dd000a0f0703e803020350055502100001a"),
            bytes.fromhex("000000fd00184b1e8c3c000a202020202020"),
            older.text_descriptor(0xFC, "DELL U2723QE"),
            older.text_descriptor(0xFF, "7KQ4Z83"),
        ])
    return data_type(
        "SPDisplaysDataType", "SPHardwareDataType", "SPDisplaysReporter", "1.0", [{
            "_name": "Apple M3 Pro",
            "spdisplays_mtlgpufamilysupport": "spdisplays_metal4",
            "spdisplays_ndrvs": [
                {
                    "_name": "Color LCD",
                    "_spdisplays_display-product-id": "a053",
                    "_spdisplays_display-serial-number": "fd626d62",
                    "_spdisplays_display-vendor-id": "610",
                    "_spdisplays_displayID": "1",
                    "_spdisplays_pixels": "3024 x 1964",
                    "_spdisplays_resolution": "1512 x 982 @ 120.00Hz",
                    "spdisplays_ambient_brightness": "spdisplays_yes",
                    "spdisplays_connection_type": "spdisplays_internal",
                    "spdisplays_display_type": "spdisplays_built-in-liquid-retina-xdr",
                    "spdisplays_mirror": "spdisplays_off",
                    "spdisplays_online": "spdisplays_yes",
                    "spdisplays_pixelresolution": "spdisplays_3024x1964Retina",
                },
                {
                    "_name": "DELL U2723QE",
                    "_spdisplays_display-product-id": "41f9",
                    "_spdisplays_display-serial-number": "4c4b5a37",
                    "_spdisplays_display-vendor-id": "10ac",
                    "_spdisplays_display-week": "10",
                    "_spdisplays_display-year": "2023",
                    "_spdisplays_displayID": "2",
                    "_spdisplays_edid": external,
                    "_spdisplays_pixels": "3840 x 2160",
                    "_spdisplays_resolution": "3840 x 2160 @ 60.00Hz",
                    "spdisplays_main": "spdisplays_yes",
                    "spdisplays_mirror": "spdisplays_off",
                    "spdisplays_online": "spdisplays_yes",
                    "spdisplays_pixelresolution": "spdisplays_4k",
                },
            ],
            "spdisplays_vendor": "sppci_vendor_Apple",
            "sppci_bus": "spdisplays_builtin",
            "sppci_cores": "18",
            "sppci_device_type": "spdisplays_gpu",
            "sppci_model": "Apple M3 Pro",
        }], older.order(("_name", 0), ("sppci_model", 10)), 7)


def memory():
    return data_type(
        "SPMemoryDataType", "SPHardwareDataType", "SPMemoryReporter", "1.0", [{
            "SPMemoryDataType": "18 GB",
            "dimm_manufacturer": "Micron",
            "dimm_type": "LPDDR5",
        }], older.order(("SPMemoryDataType", 10), ("dimm_type", 20)), 8)


def printers():
    return data_type(
        "SPPrintersDataType", "SPHardwareDataType", "SPPrintersReporter", "1.0", [{
            "_name": "Brother HL-L2350DW",
            "cupsversion": "2.3.4",
            "default": "yes",
            "driverversion": "2.1.0",
            "fax": "no",
            "ppd": "Brother HL-L2350DW series",
            "ppdfileversion": "1.1",
            "printserver": "Local",
            "psversion": "(3010.000) 0",
            "scanner": "no",
            "shared": "no",
            "status": "idle",
            "uri": "ipps://Brother%20HL-L2350DW._ipps._tcp.local./",
        }], older.order(("_name", 0), ("status", 10)), 9)


def usb():
    stick_volume = {
        "_name": "SAMS_STICK",
        "bsd_name": "disk4s1",
        "file_system": "MS-DOS FAT32",
        "free_space": "21,32 GB",
        "free_space_in_bytes": STICK_FREE,
        "iocontent": "Windows_FAT_32",
        "mount_point": "/Volumes/SAMS_STICK",
        "size": "30,74 GB",
        "size_in_bytes": STICK_VOLUME_BYTES,
        "volume_uuid": "5C1F3B2A-0000-0000-0000-000000000000",
        "writable": "yes",
    }
    stick = {
        "Media": [{
            "_name": "Ultra USB 3.0",
            "bsd_name": "disk4",
            "partition_map_type": "master_boot_record_partition_map_type",
            "removable_media": "yes",
            "size": "30,75 GB",
            "size_in_bytes": STICK_BYTES,
            "smart_status": "Verified",
            "volumes": [stick_volume],
        }],
        "_name": "Ultra USB 3.0",
        "bcd_device": "1.00",
        "bus_power": "900",
        "bus_power_used": "224",
        "device_speed": "super_speed",
        "extra_current_used": "0",
        "location_id": "0x01100000 / 1",
        "manufacturer": "SanDisk",
        "product_id": "0x5591",
        "serial_num": "4C530001110817115362",
        "vendor_id": "0x0781  (SanDisk Corporation)",
    }
    hub = {
        "_items": [
            {"_name": "Magic Keyboard with Touch ID", "bcd_device": "3.90",
             "bus_power": "500", "bus_power_used": "500", "device_speed": "full_speed",
             "extra_current_used": "0", "location_id": "0x02110000 / 3",
             "manufacturer": "Apple Inc.", "product_id": "0x0281",
             "serial_num": "F0T3412009AN1WNAG", "vendor_id": "apple_vendor_id"},
            {"_name": "USB Receiver", "bcd_device": "12.11", "bus_power": "500",
             "bus_power_used": "98", "device_speed": "full_speed",
             "extra_current_used": "0", "location_id": "0x02120000 / 4",
             "manufacturer": "Logitech", "product_id": "0xc52b",
             "vendor_id": "0x046d  (Logitech Inc.)"},
        ],
        "_name": "USB2.0 Hub",
        "bcd_device": "6.07",
        "bus_power": "900",
        "bus_power_used": "0",
        "device_speed": "high_speed",
        "location_id": "0x02100000 / 2",
        "manufacturer": "GenesysLogic",
        "product_id": "0x0610",
        "vendor_id": "0x05e3  (Genesys Logic, Inc.)",
    }
    buses = [
        {"_name": "USB31Bus", "host_controller": "AppleT6030USBXHCI"},
        {"_items": [stick], "_name": "USB31Bus", "host_controller": "AppleT6030USBXHCI"},
        {"_items": [hub], "_name": "USB31Bus", "host_controller": "AppleT6030USBXHCI"},
    ]
    return data_type("SPUSBDataType", "SPHardwareDataType", "SPUSBReporter", "900.4.2",
                     buses, older.order(("_name", 0), ("bsd_name", 15), ("size", 20)), 12)


def usb_host():
    def device(name, vendor_id, product_id, vendor, version, speed, location, serial=None):
        d = {"_name": name, "USBDeviceKeyLinkSpeed": speed,
             "USBDeviceKeyProductID": product_id, "USBDeviceKeyProductVersion": version,
             "USBDeviceKeyVendorID": vendor_id, "USBDeviceKeyVendorName": vendor,
             "USBKeyLocationID": location}
        if serial:
            d["USBDeviceKeySerialNumber"] = serial
        return d
    hub = device("USB2.0 Hub", "0x05E3", "0x0610", "GenesysLogic", "6.07", "480 Mb/s",
                 "0x02100000")
    hub["_items"] = [
        device("Magic Keyboard with Touch ID", "0x05AC", "0x0281", "Apple Inc.", "3.90",
               "12 Mb/s", "0x02110000", "F0T3412009AN1WNAG"),
        device("USB Receiver", "0x046D", "0xC52B", "Logitech", "12.11", "12 Mb/s",
               "0x02120000"),
    ]
    buses = [
        {"Driver": "AppleT6030USBXHCI", "USBKeyHardwareType": "Built-in",
         "USBKeyLocationID": "0x00100000", "_name": "USB 3.1 Bus"},
        {"Driver": "AppleT6030USBXHCI", "USBKeyHardwareType": "Built-in",
         "USBKeyLocationID": "0x01100000", "_name": "USB 3.1 Bus",
         "_items": [device("Ultra USB 3.0", "0x0781", "0x5591", "SanDisk", "1.00",
                           "5 Gb/s", "0x01100000", "4C530001110817115362")]},
        {"Driver": "AppleT6030USBXHCI", "USBKeyHardwareType": "Built-in",
         "USBKeyLocationID": "0x02100000", "_name": "USB 3.1 Bus", "_items": [hub]},
    ]
    return data_type("SPUSBHostDataType", "SPHardwareDataType", "SPUSBHostReporter",
                     "1.0", buses, older.order(("_name", 0)), 22)


def airport():
    return data_type(
        "SPAirPortDataType", "SPNetworkDataType", "SPAirPortReporter", "1583.4", [{
            "spairport_airport_interfaces": [{
                "_name": "en0",
                "spairport_current_network_information": {
                    "_name": "FRITZ!Box 7590",
                    "spairport_network_channel": "44 (5GHz, 80MHz)",
                    "spairport_network_phymode": "802.11ax",
                    "spairport_security_mode": "spairport_security_mode_wpa3_personal",
                },
                "spairport_status_information": "spairport_status_connected",
                "spairport_wireless_card_type": "Wi-Fi (0x14E4, 0x4388)",
                "spairport_wireless_mac_address": EN0_MAC,
            }],
        }], older.order(("_name", 0)), 13)


def firewall():
    return data_type(
        "SPFirewallDataType", "SPNetworkDataType", "SPFirewallReporter", "1.0", [{
            "_name": "spfirewall_settings",
            "spfirewall_applications": {
                "com.apple.sharingd": "spfirewall_allow_all",
                "us.zoom.xos": "spfirewall_allow_all",
            },
            "spfirewall_globalstate": "spfirewall_globalstate_limit_connections",
            "spfirewall_loggingenabled": "No",
            "spfirewall_stealthenabled": "Yes",
        }], older.order(("spfirewall_globalstate", 10),
                        ("spfirewall_applications", 30)), 14)


def network_location():
    return data_type(
        "SPNetworkLocationDataType", "SPNetworkDataType", "SPNetworkLocationReporter",
        "1.0", [{
            "_name": "Automatic",
            "spnetworklocation_isActive": "yes",
            "spnetworklocation_services": [
                {"IPv4": {"ConfigMethod": "DHCP"}, "IPv6": {"ConfigMethod": "Automatic"},
                 "_name": "Wi-Fi", "bsd_device_name": "en0", "hardware_address": EN0_MAC,
                 "type": "IEEE80211"},
                {"IPv4": {"ConfigMethod": "DHCP"}, "IPv6": {"ConfigMethod": "Automatic"},
                 "_name": "Thunderbolt Bridge", "bsd_device_name": "bridge0",
                 "type": "Bridge"},
            ],
        }], older.order(("_name", 0), ("spnetworklocation_isActive", 1)), 15)


def network_volume():
    return data_type(
        "SPNetworkVolumeDataType", "SPNetworkDataType", "SPNetworkVolumeReporter", "1.0",
        [{"_name": "home", "spnetworkvolume_automounted": "Yes",
          "spnetworkvolume_fsmtnonname": "/System/Volumes/Data/home",
          "spnetworkvolume_fstypename": "autofs",
          "spnetworkvolume_mntfromname": "map auto_home"}],
        older.order(("_name", 0)), 16)


def applications():
    d = datetime.datetime

    def app(name, path, modified, version, kind="arch_arm_i64", source="apple", info=None):
        a = {"_name": name, "arch_kind": kind, "lastModified": modified,
             "obtained_from": source, "path": path, "version": version}
        if info:
            a["info"] = info
        return a
    items = [
        app("Safari", "/Applications/Safari.app", d(2025, 2, 28, 6, 14, 2), "18.3.1"),
        app("Xcode", "/Applications/Xcode.app", d(2025, 1, 27, 19, 33, 51), "16.2",
            source="mac_app_store"),
        app("Microsoft Word", "/Applications/Microsoft Word.app", d(2025, 3, 11, 8, 2, 17),
            "16.95", source="identified_developer"),
        app("Firefox", "/Applications/Firefox.app", d(2025, 3, 4, 16, 40, 0), "136.0",
            source="identified_developer", info="Firefox 136.0"),
        app("Pages", "/Applications/Pages.app", d(2025, 2, 19, 22, 5, 44), "14.3",
            source="mac_app_store"),
        # Intel-only: runs under Rosetta on this Mac.
        app("Steam", "/Applications/Steam.app", d(2024, 11, 2, 12, 0, 30), "1.0",
            kind="arch_i64", source="identified_developer"),
        app("zoom.us", "/Applications/zoom.us.app", d(2025, 3, 6, 10, 21, 8),
            "6.4.0 (51467)", kind="arch_arm", source="identified_developer"),
        app("Rosetta 2 Updater", "/System/Library/CoreServices/Rosetta 2 Updater.app",
            d(2025, 2, 28, 6, 14, 2), "1.0", kind="arch_arm"),
        # An AppleScript droplet: its main program is a script, so no code kind.
        app("Droplet with Settable Properties",
            "/Library/Application Support/Script Editor/Templates/Droplets/"
            "Droplet with Settable Properties.app",
            d(2025, 2, 28, 6, 14, 2), "1.0", kind="arch_other", source="unknown"),
    ]
    return data_type("SPApplicationsDataType", "SPSoftwareDataType",
                     "SPApplicationsReporter", "1.0", items,
                     older.order(("_name", 0), ("version", 1), ("lastModified", 2)), 17)


def power():
    ac = {"Current Power Source": "TRUE", "Disk_Sleep_Timer": 10,
          "Display_Sleep_Timer": 10, "Sleep_On_Power_Button": "Yes",
          "System_Sleep_Timer": 1, "Wake_On_LAN": "Yes"}
    battery = {"Disk_Sleep_Timer": 10, "Display_Sleep_Timer": 2,
               "ReduceBrightness": "Yes", "Sleep_On_Power_Button": "Yes",
               "System_Sleep_Timer": 1}
    return data_type(
        "SPPowerDataType", "SPHardwareDataType", "SPPowerReporter", "1.0", [
            {"_name": "spbattery_information",
             "sppower_battery_charge_info": {"sppower_battery_fully_charged": "FALSE",
                                             "sppower_battery_is_charging": "TRUE",
                                             "sppower_battery_state_of_charge": 87},
             "sppower_battery_health_info": {
                 "sppower_battery_cycle_count": 142,
                 "sppower_battery_health": "Good",
                 "sppower_battery_health_maximum_capacity": "91%"},
             "sppower_battery_model_info": {"sppower_battery_device_name": "bq40z651",
                                            "sppower_battery_firmware_version": "0e05"}},
            {"AC_Power": ac, "Battery_Power": battery, "_name": "sppower_information"},
            {"_name": "sppower_ac_charger_information",
             "sppower_battery_charger_connected": "TRUE",
             "sppower_ac_charger_watts": "70"},
        ], older.order(("_name", 0)), 20)


def nvme():
    def partition(name, bsd, content, size, size_bytes):
        return {"_name": name, "bsd_name": bsd, "iocontent": content, "size": size,
                "size_in_bytes": size_bytes}
    return data_type(
        "SPNVMeDataType", "SPHardwareDataType", "SPNVMeReporter", "2.7", [{
            "_items": [{
                "_name": "APPLE SSD AP1024Z",
                "bsd_name": "disk0",
                "detachable_drive": "no",
                "device_model": "APPLE SSD AP1024Z",
                "device_revision": "1093.81.",
                "device_serial": "0ba02c7e41d3b256",
                "partition_map_type": "guid_partition_map_type",
                "removable_media": "no",
                "size": "1 TB",
                "size_in_bytes": 1000555581440,
                "smart_status": "Verified",
                "spnvme_trim_support": "Yes",
                "volumes": [
                    partition("iSCPreboot", "disk0s1", "Apple_APFS_ISC", "524,3 MB",
                              524288000),
                    partition("Macintosh HD", "disk0s2", "Apple_APFS", "994,66 GB",
                              CONTAINER_BYTES),
                    partition("Recovery", "disk0s3", "Apple_APFS_Recovery", "5,37 GB",
                              5368664064),
                ],
            }],
            "_name": "Apple SSD Controller",
        }], older.order(("_name", 0), ("device_model", 42), ("size", 10)), 21)


def storage():
    def volume(name, bsd, fs, mount, size, free, writable, drive):
        return {"_name": name, "bsd_name": bsd, "file_system": fs,
                "free_space_in_bytes": free, "ignore_ownership": "no",
                "mount_point": mount, "physical_drive": drive, "size_in_bytes": size,
                "volume_uuid": "00000000-0000-0000-0000-%012d" % size,
                "writable": writable}
    internal = {"device_name": "APPLE SSD AP1024Z", "is_internal_disk": "yes",
                "media_name": "AppleAPFSMedia", "medium_type": "ssd",
                "partition_map_type": "unknown_partition_map_type",
                "protocol": "Apple Fabric", "smart_status": "Verified"}
    stick = {"device_name": "Ultra USB 3.0", "is_internal_disk": "no",
             "media_name": "Ultra USB 3.0 Media",
             "partition_map_type": "master_boot_record_partition_map_type",
             "protocol": "USB", "smart_status": "Verified"}
    image = {"device_name": "Disk Image", "is_internal_disk": "no",
             "media_name": "Apple UDIF read-only compressed (zlib) Media",
             "partition_map_type": "guid_partition_map_type", "protocol": "Disk Image"}
    items = [
        volume("Macintosh HD - Data", "disk3s5", "APFS", "/System/Volumes/Data",
               CONTAINER_BYTES, CONTAINER_FREE, "yes", internal),
        volume("Macintosh HD", "disk3s1s1", "APFS", "/", CONTAINER_BYTES, CONTAINER_FREE,
               "no", internal),
        volume("SAMS_STICK", "disk4s1", "MS-DOS FAT32", "/Volumes/SAMS_STICK",
               STICK_VOLUME_BYTES, STICK_FREE, "yes", stick),
        volume("Firefox", "disk5s2", "HFS+", "/Volumes/Firefox", 142606336, 3674112, "no",
               image),
    ]
    return data_type("SPStorageDataType", "SPHardwareDataType", "SPStorageReporter",
                     "1.0", items, older.order(("_name", 0), ("mount_point", 20)), 23)


# The order the agent asks for them, the three of today's types last.
COLLECTED = [
    hardware, network, software,
    lambda: empty("SPParallelATADataType", "SPHardwareDataType", "SPParallelATAReporter", 3),
    audio, bluetooth,
    lambda: empty("SPFireWireDataType", "SPHardwareDataType", "SPFireWireReporter", 6),
    displays, memory, printers,
    lambda: empty("SPSerialATADataType", "SPHardwareDataType", "SPSerialATAReporter", 10),
    lambda: empty("SPParallelSCSIDataType", "SPHardwareDataType",
                  "SPParallelSCSIReporter", 11),
    usb, airport, firewall, network_location, network_volume, applications,
    lambda: empty("SPStartupItemDataType", "SPSoftwareDataType", "SPStartupItemReporter",
                  18),
    lambda: empty("SPDiscBurningDataType", "SPHardwareDataType", "SPDiscBurningReporter",
                  19),
    power, nvme, storage, usb_host,
]


def main():
    os.makedirs(OUT, exist_ok=True)
    dicts = [make() for make in COLLECTED]
    for d in dicts:
        with open(os.path.join(OUT, d["_dataType"] + ".xml"), "wb") as f:
            f.write(older.render([d]))
    by_name = sorted(dicts, key=lambda d: d["_dataType"])
    with open(os.path.join(OUT, "full.xml"), "wb") as f:
        f.write(older.render(by_name))


if __name__ == "__main__":
    main()
