// The local-machine registry hive, kept as a text file in the registry editor's
// export format (".reg"): a header line ("Windows Registry Editor Version 5.00"
// or "REGEDIT4"), one "[HKEY_LOCAL_MACHINE\...]" section per key and one
// "Name"=data line per value (dword:, "text", hex:, hex(N):). The file is named
// by PYUPLOADER_REGISTRY, else kDefaultHivePath; it may be UTF-16LE with a byte
// order mark (what the registry editor writes) or UTF-8/ASCII.
//
// Key and value names compare case-insensitively (ASCII letters), as in the
// registry. Value data are kept in the registry's own layout: a dword is four
// little-endian bytes, a string is UTF-16LE with its terminating zero (for
// REGEDIT4 files too), hex data are the bytes listed.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace platform {

inline constexpr char kHivePathVariable[] = "PYUPLOADER_REGISTRY";
inline constexpr char kDefaultHivePath[] = "/etc/pyuploader/registry.reg";

// The values of one key, read once when the key is opened.
class RegistryKey {
 public:
  // Opens `subkey` (e.g. L"SOFTWARE\\Maker\\Product") of the local-machine hive.
  // Empty when the hive file cannot be read or holds no such key. Only a regular
  // file of at most 1 MiB is read; anything else cannot be.
  static std::optional<RegistryKey> OpenLocalMachine(std::wstring_view subkey);

  // The same, from the bytes of a hive file.
  static std::optional<RegistryKey> OpenInHiveFile(std::string_view fileBytes, std::wstring_view subkey);

  // The value's data read as a 32-bit number whatever its type: the first four
  // bytes, little-endian, zero-padded when shorter. Empty when there is no such value.
  std::optional<std::uint32_t> ReadNumber(std::wstring_view name) const;

 private:
  std::map<std::wstring, std::vector<std::uint8_t>> values_;  // by folded name
};

// The hive file in use: PYUPLOADER_REGISTRY when set and not empty, else the default.
std::string HivePath();

}  // namespace platform
