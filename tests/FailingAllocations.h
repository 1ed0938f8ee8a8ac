#pragma once

/// Has one allocation fail, in any thread: a program that links this has its operator new.
class FailingAllocation {
 public:
  /// The `nth` allocation from now on throws `std::bad_alloc`.
  explicit FailingAllocation(int nth);
  ~FailingAllocation();

  static bool hasFailed();
};
