#pragma once

#include <string>
#include <string_view>

/// Bytes as wide characters and back, in whatever locale: UTF-8 as its code points, and each byte
/// that is not part of any, or of a control character beyond ASCII, as 0xDC00 and the byte, which
/// is no code point. What goes to and fro comes back as it was. Threads: any.
namespace host {

std::wstring toWide(std::string_view bytes);
std::string toBytes(std::wstring_view text);

}  // namespace host
