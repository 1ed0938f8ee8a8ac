#include "platform/system.h"

#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

const char* getprogname() { return program_invocation_short_name; }

void platform::runMainEventLoop() {
  for (;;) pause();  // callbacks run on other threads
}

void platform::logError(const std::string& message) {
  std::string text = message;
  std::ranges::replace(text, '\0', '?');  // which would end the text of syslog(3)
  syslog(LOG_ERR, "%s", text.c_str());
}
