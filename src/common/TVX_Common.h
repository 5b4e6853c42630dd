// Free helpers: text forms of names, the firmware version parser, facts about the host.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace cimrt {

/// Result of helpers that can fail.
inline constexpr int TVX_FAILED = 0x8001;

/// Room that a WWN's text needs: 16 digits and a NUL.
inline constexpr std::size_t TVX_WWN_TEXT_SIZE = 17;
/// Room that a MAC address's text needs: six pairs, five hyphens and a NUL.
inline constexpr std::size_t TVX_MAC_TEXT_SIZE = 18;

/// True if the root file system is mounted read-only. The first successful look is kept for the
/// life of the process; a failed one answers false and is repeated next time. Any thread.
bool IsReadOnlyFS();

/// Writes eight bytes as 16 upper-case hexadecimal digits into `text` (`TVX_WWN_TEXT_SIZE` bytes).
/// A null `text` is ignored. Always 0.
int WWPNToText(const std::uint8_t* wwn, char* text);
int WWNNToText(const std::uint8_t* wwn, char* text);        ///< the same
int FabricNameToText(const std::uint8_t* wwn, char* text);  ///< the same
/// The same as a string.
std::string WWNToString(const std::uint8_t* wwn);

/// Writes six bytes as "aa-bb-cc-dd-ee-ff" into `text` (`TVX_MAC_TEXT_SIZE` bytes). 0, or 0x8001
/// if `text` is null.
int MACToText(const std::uint8_t* mac, char* text);

/// A 128-bit identifier as 32 upper-case hexadecimal digits.
std::string UUIDToString(const std::uint8_t* bytes);

/// Appends two upper-case digits for each byte of [first, last) to `text`. Nothing if either
/// pointer is null or the range is empty.
void appendHex(const std::uint8_t* first, const std::uint8_t* last, std::string& text);

/// Reads exactly 16 hexadecimal digits into eight bytes. 0, or 0x8001 with "INVALID WWN" logged
/// and `wwn` unspecified.
int textToWWN(const char* text, std::uint8_t* wwn);

/// Gives "label: 1,2,3", logs it under the label at `TVX_DBG`.
std::string arrayToText(const char* label, const std::vector<int>& values);

/// Log a label and a value at `TVX_DBG`.
void logValue(const char* label, int value);
void logValue(const char* label, const char* value);

/// What `parseVersion` finds.
struct ParsedVersion {
  std::uint16_t Major = 0;
  std::uint16_t Minor = 0;
  std::uint16_t Revision = 0;
  std::uint16_t Build = 0;
  std::string ReleaseType;         ///< one letter
  std::string TestReleaseVersion;  ///< empty in practice
};

/// Takes a firmware version such as "2.01a4" apart, one digit for each number; what follows the
/// sixth character is ignored. 0, or 0x8001 with `version` as it was.
int parseVersion(const char* text, ParsedVersion& version);

/// First line of "/proc/version" and contents of "/etc/issue", each "Unknown" if it can't be had.
/// 0, or 1 when memory runs out.
int getOSInformation(std::string& name, std::string& extended);

/// Cuts a dotted version ("10.2.107-7") at "." and "-" into four numbers, 0 for each that is not
/// there, and logs them. A null text gives four zeros.
void versionNumbers(const char* text, std::uint16_t (&numbers)[4]);

/// The re-entrant `strtok`: first call with the text, further calls with null and the same `rest`.
char* tvxStrtok(char* text, const char* delimiters, char** rest);

}  // namespace cimrt
