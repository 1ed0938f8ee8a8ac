#pragma once

#include <histedit.h>

#include "platform/host/SharedLibrary.h"

namespace host {

/// The functions of libedit that the host uses; editline(3) describes them.
struct Libedit : SharedLibrary {
  Libedit() : SharedLibrary(ZUB_LIBEDIT_NAME) {}

  decltype(&::el_init) el_init = find("el_init");
  decltype(&::el_set) el_set = find("el_set");
  decltype(&::el_get) el_get = find("el_get");
  decltype(&::el_wset) el_wset = find("el_wset");
  decltype(&::el_wgets) el_wgets = find("el_wgets");
  decltype(&::el_wline) el_wline = find("el_wline");
  decltype(&::el_wpush) el_wpush = find("el_wpush");
  decltype(&::el_cursor) el_cursor = find("el_cursor");
  decltype(&::el_resize) el_resize = find("el_resize");
  decltype(&::el_deletestr) el_deletestr = find("el_deletestr");
  decltype(&::el_winsertstr) el_winsertstr = find("el_winsertstr");
  decltype(&::history_winit) history_winit = find("history_winit");
  decltype(&::history_w) history_w = find("history_w");
};

}  // namespace host
