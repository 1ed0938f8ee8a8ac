#pragma once

#include <dlfcn.h>
#include <histedit.h>

namespace host {

/// The functions of libedit that the host uses, under their own names; editline(3) describes them.
///
/// The library is opened when this is made, at the first prompt on a terminal. To link it would
/// cost every start of the tool, and would leave no tool where the library is missing.
struct Libedit {
  bool isThere = true;  ///< all of the functions are
  void* const library = dlopen(ZUB_LIBEDIT_NAME, RTLD_NOW | RTLD_LOCAL);  // never closed
  decltype(&::el_init) el_init = find<decltype(el_init)>("el_init");
  decltype(&::el_set) el_set = find<decltype(el_set)>("el_set");
  decltype(&::el_get) el_get = find<decltype(el_get)>("el_get");
  decltype(&::el_wset) el_wset = find<decltype(el_wset)>("el_wset");
  decltype(&::el_wgets) el_wgets = find<decltype(el_wgets)>("el_wgets");
  decltype(&::el_wline) el_wline = find<decltype(el_wline)>("el_wline");
  decltype(&::el_wpush) el_wpush = find<decltype(el_wpush)>("el_wpush");
  decltype(&::el_cursor) el_cursor = find<decltype(el_cursor)>("el_cursor");
  decltype(&::el_resize) el_resize = find<decltype(el_resize)>("el_resize");
  decltype(&::el_deletestr) el_deletestr = find<decltype(el_deletestr)>("el_deletestr");
  decltype(&::el_winsertstr) el_winsertstr = find<decltype(el_winsertstr)>("el_winsertstr");
  decltype(&::history_winit) history_winit = find<decltype(history_winit)>("history_winit");
  decltype(&::history_w) history_w = find<decltype(history_w)>("history_w");

 private:
  template <class Function>
  Function find(const char* name) {
    void* const found = library != nullptr ? dlsym(library, name) : nullptr;
    isThere = isThere && found != nullptr;
    return reinterpret_cast<Function>(found);
  }
};

}  // namespace host
