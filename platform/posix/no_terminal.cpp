#include "platform/posix/Descriptor.h"
#include "platform/terminal.h"

std::optional<bool> platform::readEditedLine(const std::string& /*prompt*/,
                                             const LineCompleter& /*complete*/,
                                             std::string& /*line*/) {
  return std::nullopt;
}

std::shared_ptr<void> platform::showWork() { return nullptr; }

void posix::beforeOutput() {}
