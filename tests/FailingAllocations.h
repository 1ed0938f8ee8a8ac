#pragma once

#include <functional>

/// Calls `work` with its allocation number `nth`, in any thread, throwing `std::bad_alloc`, which
/// may end it. Returns whether there was such an allocation. A program that links this has its
/// operator new.
bool failAllocation(int nth, const std::function<void()>& work);
