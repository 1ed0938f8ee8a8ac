#include "tool/ZUBShell.h"

#include <iostream>
#include <system_error>

#include "platform/system.h"
#include "platform/zub_client.h"
#include "tool/ServerState.h"
#include "tool/ZUBCommand.h"

namespace {

constexpr auto kFirstStateWait = std::chrono::milliseconds(500);

/// Subscribes to the server's state. Each copy of the event handler is a member of `group`.
void FollowServerState(const std::shared_ptr<zub::client::Manager>& manager,
                       const dispatch::group& group) {
  const zub::client::EventHandler handler =
      [manager, member = dispatch::membership(group)](
          const lumo::object& payload, const dispatch::group&) { SetServerState(payload); };
  zub::client::RegisterEventHandler(manager, zub::kEventServerStateChange, handler);
  // Off and on again, so that a server which has already reported its state reports it once more.
  zub::client::EventsOff(manager);
  zub::client::EventsOn(manager);
}

}  // namespace

std::shared_ptr<CommandBase> ZUBShell::createRootCommand() {
  try {
    const dispatch::queue queue("zubtool.queue");
    const auto manager = zub::client::CreateManager("zubtool", queue);
    const auto group = dispatch::group::create();
    {
      const dispatch::membership own(group);
      FollowServerState(manager, group);
    }
    // If the library keeps the handler, the group stays open and the wait takes its full time. The
    // result does not matter: commands that need the server check its state.
    static_cast<void>(group.wait(kFirstStateWait));
    return ZUBCommand::create(getprogname(), {}, manager, queue);
  } catch (const std::system_error& failure) {
    std::cerr << "Cannot connect to the server: " << failure.what() << std::endl;
    return nullptr;
  }
}
