#pragma once

#include "framework/CommandBase.h"
#include "platform/zub_client.h"

/// A command node of the tool, which can talk to the server. All nodes share one manager and one
/// queue.
class ZUBCommandBase : public CommandBase {
 public:
  const std::shared_ptr<zub::client::Manager> manager;
  const dispatch::queue queue;  ///< on which the manager's callbacks run

 protected:
  ZUBCommandBase(const std::string& name, std::weak_ptr<CommandBase> parent,
                 std::shared_ptr<zub::client::Manager> manager, dispatch::queue queue)
      : CommandBase(name, std::move(parent)),
        manager(std::move(manager)),
        queue(std::move(queue)) {}
};
