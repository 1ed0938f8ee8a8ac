#pragma once

#include <dlfcn.h>

namespace host {

/// The base of a table of functions that the host uses of a library, each under its own name.
///
/// The library is opened when the table is made, at its first use, and never closed. To link it
/// would cost every start of the tool, and would leave no tool where the library is missing.
class SharedLibrary {
 public:
  bool isThere() const { return handle != nullptr && isWhole; }  ///< with all of the functions

 protected:
  explicit SharedLibrary(const char* name) : handle(dlopen(name, RTLD_NOW | RTLD_LOCAL)) {}

  /// An address that becomes a pointer to whatever function it is to be.
  struct Symbol {
    template <class Function>
    operator Function*() const {
      return reinterpret_cast<Function*>(address);
    }

    void* address;
  };

  Symbol find(const char* name) {
    void* const found = handle != nullptr ? dlsym(handle, name) : nullptr;
    isWhole = isWhole && found != nullptr;
    return {found};
  }

 private:
  void* const handle;
  bool isWhole = true;
};

}  // namespace host
