#include "platform/system.h"

#include <syslog.h>
#include <unistd.h>

#include <cerrno>

const char* getprogname() { return program_invocation_short_name; }

void platform::runMainEventLoop() {
  for (;;) pause();  // the callbacks of this platform run on threads of their own
}

void platform::logError(const std::string& message) { syslog(LOG_ERR, "%s", message.c_str()); }
