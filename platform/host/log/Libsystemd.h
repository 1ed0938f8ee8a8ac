#pragma once

#include <dlfcn.h>
#include <systemd/sd-journal.h>

#include <stdexcept>

namespace host {

/// The functions of systemd's library that the host uses; sd-journal(3) describes them.
///
/// The library is opened at its first use, and never closed. To link it would cost every start of
/// the tool, and would leave no tool where the library is missing.
class Libsystemd {
  void* const handle = dlopen(ZUB_LIBSYSTEMD_NAME, RTLD_NOW | RTLD_LOCAL);  // initialized first

 public:
  /// Throws `std::runtime_error` when the library is not there.
  static const Libsystemd& shared() {
    static const Libsystemd library;
    return library;
  }

  decltype(&::sd_journal_next) sd_journal_next = find("sd_journal_next");
  decltype(&::sd_journal_close) sd_journal_close = find("sd_journal_close");
  decltype(&::sd_journal_get_usage) sd_journal_get_usage = find("sd_journal_get_usage");
  decltype(&::sd_journal_add_match) sd_journal_add_match = find("sd_journal_add_match");
  decltype(&::sd_journal_query_unique) sd_journal_query_unique = find("sd_journal_query_unique");
  decltype(&::sd_journal_open_files_fd) sd_journal_open_files_fd = find("sd_journal_open_files_fd");
  decltype(&::sd_journal_enumerate_data) sd_journal_enumerate_data =
      find("sd_journal_enumerate_data");
  decltype(&::sd_journal_add_disjunction) sd_journal_add_disjunction =
      find("sd_journal_add_disjunction");
  decltype(&::sd_journal_enumerate_unique) sd_journal_enumerate_unique =
      find("sd_journal_enumerate_unique");
  decltype(&::sd_journal_get_realtime_usec) sd_journal_get_realtime_usec =
      find("sd_journal_get_realtime_usec");
  decltype(&::sd_journal_set_data_threshold) sd_journal_set_data_threshold =
      find("sd_journal_set_data_threshold");
  decltype(&::sd_journal_seek_realtime_usec) sd_journal_seek_realtime_usec =
      find("sd_journal_seek_realtime_usec");

 private:
  /// An address that becomes a pointer to whatever function it is to be.
  struct Symbol {
    template <class Function>
    operator Function*() const {
      return reinterpret_cast<Function*>(address);
    }

    void* address;
  };

  Libsystemd() = default;

  Symbol find(const char* name) const {
    void* const found = handle != nullptr ? dlsym(handle, name) : nullptr;
    if (found != nullptr) return {found};
    throw std::runtime_error(ZUB_LIBSYSTEMD_NAME " cannot be loaded: is it installed?");
  }
};

}  // namespace host
