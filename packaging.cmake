# What is installed where, as Debian expects it, and how cpack makes a package of it.
include(GNUInstallDirs)
option(ZUB_PUBLISH "Package for others, which takes a contact: CPACK_PACKAGE_CONTACT" OFF)
set(CPACK_PACKAGE_CONTACT "" CACHE STRING "Who answers for the package: NAME <ADDRESS>")
set(contact "${CPACK_PACKAGE_CONTACT}")
if(ZUB_PUBLISH AND NOT contact)
  message(FATAL_ERROR "A package to publish needs -DCPACK_PACKAGE_CONTACT='NAME <ADDRESS>'")
elseif(NOT contact)  # who builds it, as with Debian's tools
  execute_process(COMMAND id -un OUTPUT_VARIABLE user OUTPUT_STRIP_TRAILING_WHITESPACE)
  cmake_host_system_information(RESULT machine QUERY FQDN)
  set(contact "${user} <${user}@${machine}>")
endif()

install(TARGETS zubtool)
if(platform STREQUAL host)  # device profiles are that platform's
  install(DIRECTORY devices/ DESTINATION ${CMAKE_INSTALL_DATADIR}/zubtool/devices)
  set(host_pages zub-device.5)
  set(of_another_platform "")
else()
  set(of_another_platform "/^[.].\" On the host {/,/^[.].\" }/d")
endif()
install(FILES completions/zubtool.bash RENAME zubtool
        DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions)
install(FILES completions/_zubtool DESTINATION ${CMAKE_INSTALL_DATADIR}/zsh/vendor-completions)
install(FILES completions/zubtool.fish
        DESTINATION ${CMAKE_INSTALL_DATADIR}/fish/vendor_completions.d)

# Man pages name the version, and the folder that they are installed to; they are compressed where
# that is possible.
find_program(GZIP gzip)
file(MAKE_DIRECTORY ${CMAKE_CURRENT_BINARY_DIR}/docs)
foreach(page zubtool.1 ${host_pages})
  string(REGEX MATCH "[0-9]$" section ${page})
  set(source ${CMAKE_CURRENT_SOURCE_DIR}/docs/${page})
  set(made ${CMAKE_CURRENT_BINARY_DIR}/docs/${page})
  set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${source})
  execute_process(COMMAND sed -e "${of_another_platform}" -e "s/^[.]Os .*/& ${PROJECT_VERSION}/"
                          ${source}
                  OUTPUT_FILE ${made} COMMAND_ERROR_IS_FATAL ANY)
  install(FILES ${made} DESTINATION ${CMAKE_INSTALL_MANDIR}/man${section})
  list(APPEND compressed ${CMAKE_INSTALL_MANDIR}/man${section}/${page})
endforeach()

# Debian's own documents: the changes in its form, and whose the tool is.
set(changes ${CMAKE_CURRENT_BINARY_DIR}/docs/changelog)
set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${CMAKE_CURRENT_SOURCE_DIR}/CHANGELOG.md)
execute_process(COMMAND ${CMAKE_CURRENT_SOURCE_DIR}/packaging/debian-changelog "${contact}"
                INPUT_FILE ${CMAKE_CURRENT_SOURCE_DIR}/CHANGELOG.md OUTPUT_FILE ${changes}
                COMMAND_ERROR_IS_FATAL ANY)
install(FILES ${changes} packaging/copyright DESTINATION ${CMAKE_INSTALL_DOCDIR})
list(APPEND compressed ${CMAKE_INSTALL_DOCDIR}/changelog)

string(CONFIGURE [[
  foreach(name @compressed@)
    set(file "$ENV{DESTDIR}${CMAKE_INSTALL_PREFIX}/${name}")
    file(READ "${file}" text)
    string(REPLACE /usr/share "${CMAKE_INSTALL_PREFIX}/@CMAKE_INSTALL_DATADIR@" text "${text}")
    file(WRITE "${file}" "${text}")
    if(EXISTS "@GZIP@")
      execute_process(COMMAND "@GZIP@" -9nf "${file}" COMMAND_ERROR_IS_FATAL ANY)
      list(TRANSFORM CMAKE_INSTALL_MANIFEST_FILES APPEND .gz REGEX "/${name}$")
    endif()
  endforeach()]] finish @ONLY)
install(CODE "${finish}")

set(CPACK_GENERATOR DEB)
set(CPACK_SET_DESTDIR ON)
set(CPACK_INSTALL_PREFIX /usr)
# With a component named, cpack does not write install_manifest.txt, which `sudo cmake --install` may
# have made root's.
set(CPACK_INSTALL_CMAKE_PROJECTS "${CMAKE_BINARY_DIR};zubtool;Unspecified;/")
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_PROJECT_CONFIG_FILE ${CMAKE_CURRENT_SOURCE_DIR}/packaging/cpack.cmake)
set(CPACK_PRE_BUILD_SCRIPTS ${CMAKE_CURRENT_SOURCE_DIR}/packaging/folders.cmake)
set(CPACK_STRIP_FILES ON)
set(CPACK_DEBIAN_PACKAGE_MAINTAINER "${contact}")
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION utils)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
get_property(opened GLOBAL PROPERTY zub_opened_packages)
list(JOIN opened ", " CPACK_DEBIAN_PACKAGE_RECOMMENDS)
set(CPACK_PACKAGE_DESCRIPTION
    "zubtool asks the baseband manager server to collect telephony logs,
telephony logs with a core dump of the modem, or baseband traces, and
prints where they are. It also exports the recent system log of chosen
processes into a text file.")
if(platform STREQUAL host)
  string(APPEND CPACK_PACKAGE_DESCRIPTION "
.
On an ordinary Linux machine there is no such device. The tool then plays
one: it says Success and a path that does not exist, and exports invented
lines. A device profile, named by the environment variable ZUB_DEVICE,
makes the export real: /usr/share/zubtool/devices/host.device for the
journal of this machine, or a file with the line 'log = FILE' for a log
from elsewhere.")
endif()
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
include(CPack)
