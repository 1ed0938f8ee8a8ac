#include "platform/host/WideText.h"

#include "platform/posix/Utf8.h"

namespace host {
namespace {

constexpr char32_t kByte = 0xDC00;

}  // namespace

std::wstring toWide(std::string_view bytes) {
  std::wstring text;
  while (!bytes.empty()) {
    auto rest = bytes;
    const char32_t code = posix::takeCodePoint(rest);
    const auto taken = bytes.substr(0, bytes.size() - rest.size());
    const bool isControl = code >= 0x80 && code < 0xA0;
    if (!isControl && posix::isUtf8(taken)) {
      text += static_cast<wchar_t>(code);
    } else {
      for (const char byte : taken) {
        text += static_cast<wchar_t>(kByte + static_cast<unsigned char>(byte));
      }
    }
    bytes = rest;
  }
  return text;
}

std::string toBytes(std::wstring_view text) {
  std::string bytes;
  for (const wchar_t character : text) {
    const auto code = static_cast<char32_t>(character);
    if (code > kByte && code <= kByte + 0xFF) {
      bytes += static_cast<char>(code - kByte);
    } else {
      posix::appendUtf8(bytes, code);
    }
  }
  return bytes;
}

}  // namespace host
