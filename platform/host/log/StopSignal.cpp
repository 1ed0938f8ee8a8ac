#include "platform/host/log/StopSignal.h"

#include <poll.h>
#include <sys/eventfd.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <system_error>

namespace host {

StopSignal::StopSignal() : event(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
  if (!event) throw std::system_error(errno, std::generic_category(), "eventfd");
}

void StopSignal::raise() noexcept {
  isRaised = true;
  // Nothing ever reads it, so what can fail here is only to add to what is raised already.
  const std::uint64_t one = 1;
  static_cast<void>(!::write(event.get(), &one, sizeof one));
}

bool StopSignal::waitReadable(int descriptor) const {
  std::array<pollfd, 2> polled = {pollfd{event.get(), POLLIN, 0}, pollfd{descriptor, POLLIN, 0}};
  ::poll(polled.data(), polled.size(), -1);  // where that fails, the reading finds out
  return !raised();
}

}  // namespace host
