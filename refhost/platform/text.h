// Text conversions between the plug-in's wide strings and the host's UTF-8, and the small
// formatters the call log uses.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace refhost {

// Wide text (UTF-32 on this platform, UTF-16 where wchar_t is 16 bits) to UTF-8. Invalid code
// points become U+FFFD so that logging never fails.
std::string toUtf8(const std::wstring& text);
// At most `maxChars` characters of a wide buffer, stopping at the first zero. Null gives "".
std::string toUtf8(const wchar_t* text, std::size_t maxChars = std::string::npos);
std::wstring toWide(const std::string& utf8);

// Double-quoted text for the call log; quotes and backslashes inside are escaped.
std::string quoted(const std::string& text);
// Call-log renderings of the plug-in's arguments: texts quoted, ids bare, a null pointer as
// null, GL enums in hex.
std::string logText(const wchar_t* text);
std::string logText(const char* text);
std::string logId(const char* id);
std::string logHex(uint32_t value);

// Shortest text that reads back as the same float ("225", "0.5", "1e+30", "nan").
std::string formatFloat(float value);

}  // namespace refhost
