#include <algorithm>

#include "platform/posix/Utf8.h"
#include "platform/telephony.h"

bool util::equal_nocase(std::string_view left, std::string_view right) {
  return std::ranges::equal(left, right, {}, posix::lowered, posix::lowered);
}
