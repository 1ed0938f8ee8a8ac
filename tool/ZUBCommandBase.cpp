#include "tool/ZUBCommandBase.h"

ZUBCommandBase::ZUBCommandBase(const std::string& name, std::weak_ptr<CommandBase> parent,
                               std::shared_ptr<zub::client::Manager> manager, dispatch::queue queue)
    : CommandBase(name, std::move(parent)), manager(std::move(manager)), queue(std::move(queue)) {}

ZUBCommandBase::~ZUBCommandBase() = default;
