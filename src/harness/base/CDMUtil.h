// Free functions used all over the program: text case and blanks, number forms, escapes, small file operations. The
// exact forms matter: the command line, the configuration files and the message files all pass through them.
#pragma once

#include <cstdint>
#include <ctime>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Text.h"

namespace panelglow::CDMUtil {

// ---- case and blanks (ASCII)
std::string ToUpper(std::string_view text);
std::string ToLower(std::string_view text);
wstring ToUpper(std::u16string_view text);
wstring ToLower(std::u16string_view text);

/// True when the two texts are equal without regard to ASCII case.
bool EqualIgnoreCase(std::string_view left, std::string_view right);

/// Removes blank, backspace, form feed, line feed, carriage return, tab and vertical tab from both ends.
std::string Trim(std::string_view text);

/// Replaces `from` by `to`, the first one in the text each time, until `from` no longer occurs. Where `to` contains
/// `from`, each occurrence is replaced once. An empty `from` changes nothing.
void ReplaceAll(std::string& text, std::string_view from, std::string_view to);

/// Appends the pieces of `text` between any characters of `separators`; adjacent separators give no empty piece.
void Split(std::string_view text, std::vector<std::string>& out, std::string_view separators);

/// The text on one line: each line end (CR LF, LF or CR) becomes a blank.
std::string OnOneLine(std::string_view text);

// ---- narrow and wide text

/// Widens each byte by itself: right for ASCII, and for Latin-1.
wstring ToWString(std::string_view text);

/// Narrows character by character; the result ends before the first NUL or character above 0xFF.
std::string ToString(std::u16string_view text);

// ---- numbers to text: decimal, by the stream defaults (six significant digits for double)
std::string ToString(int value);
std::string ToString(unsigned int value);
std::string ToString(unsigned long value);
std::string ToString(long value);
std::string ToString(long long value);
std::string ToString(unsigned long long value);
std::string ToString(double value);
std::string ToString(bool value);

/// Lower-case hexadecimal digits without a prefix; a negative value in two's complement.
std::string ToHexString(int value);

// ---- forms of number text

/// An optional leading "-", then digits only. Not the empty text; a lone "-" is accepted.
bool IsDecimal(std::string_view text);

/// An optional leading "-", then "0x" or "0X", then at least one hexadecimal digit.
bool IsHexadecimal(std::string_view text);
bool IsInteger(std::string_view text);
bool IsBoolean(std::string_view text);

/// An optional sign directly in front of a digit, digits with at most one ".", and a digit behind the ".".
bool IsDouble(std::string_view text);

// ---- text to number: decimal when IsDecimal, hexadecimal when IsHexadecimal, 0 for anything else
int ToInt(std::string_view text);
long ToLong(std::string_view text);

/// 32-bit, as on the program's home system: 0 to 4294967295.
std::uint32_t ToUnsignedLong(std::string_view text);
std::int64_t ToInt64(std::string_view text);

// ---- XML escapes, on single bytes; 146 to 148 are the curly quotation marks of code page 1252
std::string EscapeXml(std::string_view text);

/// As EscapeXml, trimmed, for texts that devices report: every byte of 128 and above, and every control character but
/// those that Trim knows, becomes ".".
std::string EscapeXmlStrict(std::string_view text);

// ---- files, by the program's path forms

/// True when the file can be opened for reading; an empty path gives false and opens nothing.
bool FileExists(std::string_view path);

/// Reads the whole file; the text ends at the first zero byte. False, and `text` as it was, when it does not open.
bool ReadFile(std::string_view path, std::string& text);

/// Empty on failure; at most 260 characters.
std::string CurrentDirectoryPath();

/// "%m/%d/%Y %H:%M:%S" in local time.
std::string FormatTime(std::time_t seconds);

}  // namespace panelglow::CDMUtil
