#include "tool/ZUBShell.h"

#include <iostream>
#include <system_error>

#include "platform/system.h"
#include "platform/zub_client.h"
#include "tool/ServerState.h"
#include "tool/ZUBCommand.h"

namespace {

constexpr auto kFirstStateWait = std::chrono::milliseconds(500);

/// Has the server's state followed from now on. Each live reference to the event handler, the
/// library's own included, is a member of `group`.
void FollowServerState(const std::shared_ptr<zub::client::Manager>& manager,
                       const dispatch::group& group) {
  const zub::client::EventHandler handler =
      [manager, member = dispatch::membership(group)](
          const lumo::object& payload, const dispatch::group&) { SetServerState(payload); };
  zub::client::RegisterEventHandler(manager, zub::kEventServerStateChange, handler);
  // Off and on again: a server that has reported its state before then reports it anew.
  zub::client::EventsOff(manager);
  zub::client::EventsOn(manager);
}

/// Connects to the server and builds the tree over that connection.
std::shared_ptr<CommandBase> Connect() {
  const dispatch::queue queue("zubtool.queue");
  const auto manager = zub::client::CreateManager("zubtool", queue);
  const auto group = dispatch::group::create();
  {
    const dispatch::membership own(group);
    FollowServerState(manager, group);
  }
  // A library that keeps the handler keeps the group open, and the wait lasts its full time. Either
  // way the tool starts: commands that need the server ask for its state themselves.
  static_cast<void>(group.wait(kFirstStateWait));
  return ZUBCommand::create(getprogname(), {}, manager, queue);
}

}  // namespace

std::shared_ptr<CommandBase> ZUBShell::createRootCommand() {
  try {
    return Connect();
  } catch (const std::system_error& failure) {
    std::cerr << "Cannot connect to the server: " << failure.what() << std::endl;
    return nullptr;
  }
}
