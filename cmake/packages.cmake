# Finds what the build needs and stops at the first thing that is missing, with one line that names
# the Debian package to install.
find_package(Threads REQUIRED)
find_package(PkgConfig QUIET)
if(NOT PKG_CONFIG_FOUND)
  message(FATAL_ERROR "Missing package: install pkg-config")
endif()

function(vell_find_module target module package)
  pkg_check_modules(${target} QUIET IMPORTED_TARGET ${module})
  if(NOT ${target}_FOUND)
    message(FATAL_ERROR "Missing package: install ${package}")
  endif()
endfunction()

function(vell_find_program variable package)
  find_program(${variable} NAMES ${ARGN} PATHS /lib/systemd /usr/lib/systemd)
  if(NOT ${variable})
    message(FATAL_ERROR "Missing package: install ${package}")
  endif()
endfunction()

vell_find_module(SYSTEMD libsystemd libsystemd-dev)
vell_find_module(UTF8PROC libutf8proc libutf8proc-dev)
vell_find_program(JOURNAL_REMOTE systemd-journal-remote systemd-journal-remote)

if(BUILD_TESTING)
  find_package(GTest QUIET)
  if(NOT GTest_FOUND)
    message(FATAL_ERROR "Missing package: install libgtest-dev")
  endif()
  vell_find_program(DBUS_DAEMON dbus-daemon dbus-daemon)
endif()
