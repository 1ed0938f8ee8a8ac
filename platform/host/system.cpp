#include "platform/system.h"

#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

const char* getprogname() { return program_invocation_short_name; }

void platform::runMainEventLoop() {
  for (;;) pause();  // the callbacks of this platform run on threads of their own
}

void platform::logError(const std::string& message) {
  std::string text = message;
  std::ranges::replace(text, '\0', '?');  // which would end it for syslog
  syslog(LOG_ERR, "%s", text.c_str());
}
