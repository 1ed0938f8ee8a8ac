# What is installed where, as Debian expects it, and how cpack makes a package of it.
include(GNUInstallDirs)

install(TARGETS zubtool)
if(platform STREQUAL host)  # device profiles are that platform's
  install(DIRECTORY devices/ DESTINATION ${CMAKE_INSTALL_DATADIR}/zubtool/devices)
  set(host_pages zub-device.5)
endif()
install(FILES completions/zubtool.bash RENAME zubtool
        DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions)
install(FILES completions/_zubtool DESTINATION ${CMAKE_INSTALL_DATADIR}/zsh/vendor-completions)
install(FILES completions/zubtool.fish
        DESTINATION ${CMAKE_INSTALL_DATADIR}/fish/vendor_completions.d)

# Man pages are compressed, the same bytes each time, where that is possible.
find_program(GZIP gzip)
foreach(page zubtool.1 ${host_pages})
  string(REGEX MATCH "[0-9]$" section ${page})
  set(installed ${CMAKE_CURRENT_SOURCE_DIR}/docs/${page})
  if(GZIP)
    set(source ${installed})
    set(installed ${CMAKE_CURRENT_BINARY_DIR}/docs/${page}.gz)
    add_custom_command(OUTPUT ${installed} DEPENDS ${source} VERBATIM
                       COMMAND ${CMAKE_COMMAND} -E make_directory docs
                       COMMAND sh -c [["$1" -9nc "$2" > "$3"]] sh ${GZIP} ${source} ${installed})
    list(APPEND compressed_pages ${installed})
  endif()
  install(FILES ${installed} DESTINATION ${CMAKE_INSTALL_MANDIR}/man${section})
endforeach()
add_custom_target(man_pages ALL DEPENDS ${compressed_pages})

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_PACKAGE_CONTACT "zubtool maintainers <zubtool@localhost>" CACHE STRING
    "Who answers for the package")
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION utils)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_DEBIAN_PACKAGE_SUGGESTS systemd)  # journalctl, for the log of this machine
set(CPACK_PACKAGE_DESCRIPTION
    "zubtool asks the baseband manager server to collect telephony logs,
telephony logs with a core dump of the modem, or baseband traces, and
prints where they are. It also exports the recent system log of chosen
processes into a text file.
.
On an ordinary Linux machine it runs on a device that a small text file
describes.")
find_program(DPKG_SHLIBDEPS dpkg-shlibdeps)
if(DPKG_SHLIBDEPS)
  set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
endif()
include(CPack)
