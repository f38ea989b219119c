# SPDX-License-Identifier: Apache-2.0
# All dependencies are Debian packages; scripts/setup.sh installs them.

find_package(PkgConfig REQUIRED)
find_package(Threads REQUIRED)

# Only the base library of wxWidgets: the default of `wx-config` would pull in GTK.
find_program(WX_CONFIG NAMES wx-config REQUIRED)
execute_process(COMMAND ${WX_CONFIG} --cxxflags base
  OUTPUT_VARIABLE _wx_cxxflags OUTPUT_STRIP_TRAILING_WHITESPACE COMMAND_ERROR_IS_FATAL ANY)
execute_process(COMMAND ${WX_CONFIG} --libs base
  OUTPUT_VARIABLE _wx_libs OUTPUT_STRIP_TRAILING_WHITESPACE COMMAND_ERROR_IS_FATAL ANY)
# For programs that use the installed library.
set(TINTGATE_PC_WX_CFLAGS "${_wx_cxxflags}")
set(TINTGATE_PC_WX_LIBS "${_wx_libs}")
separate_arguments(_wx_cxxflags UNIX_COMMAND "${_wx_cxxflags}")
separate_arguments(_wx_libs UNIX_COMMAND "${_wx_libs}")
list(TRANSFORM _wx_cxxflags REPLACE "^-I" "-isystem")
# For the records at the library's boundary, wx's inline code is sufficient.
add_library(wxheaders INTERFACE)
target_compile_options(wxheaders INTERFACE ${_wx_cxxflags})
add_library(wx INTERFACE)
target_link_libraries(wx INTERFACE wxheaders ${_wx_libs})

pkg_check_modules(lcms2 REQUIRED IMPORTED_TARGET lcms2)
pkg_check_modules(libplist REQUIRED IMPORTED_TARGET libplist-2.0)
pkg_check_modules(sqlite3 REQUIRED IMPORTED_TARGET sqlite3)
pkg_check_modules(libsodium REQUIRED IMPORTED_TARGET libsodium)
pkg_check_modules(expat REQUIRED IMPORTED_TARGET expat)
pkg_check_modules(libmd REQUIRED IMPORTED_TARGET libmd)
# Compiled in from its header: what it hashes is short, and the library need not be loaded.
pkg_check_modules(libxxhash REQUIRED libxxhash)
add_library(xxhash INTERFACE)
target_include_directories(xxhash SYSTEM INTERFACE ${libxxhash_INCLUDE_DIRS})
pkg_check_modules(tomlplusplus REQUIRED IMPORTED_TARGET tomlplusplus)
pkg_check_modules(libsystemd REQUIRED IMPORTED_TARGET libsystemd)
# Widths of characters on a terminal.
pkg_check_modules(glib REQUIRED IMPORTED_TARGET glib-2.0)
# Labels and certificates; pangocairo brings cairo with its PDF and SVG surfaces.
pkg_check_modules(pangocairo REQUIRED IMPORTED_TARGET pangocairo cairo-pdf cairo-svg)
pkg_check_modules(libqrencode REQUIRED IMPORTED_TARGET libqrencode)
pkg_check_modules(zlib REQUIRED IMPORTED_TARGET zlib)
# The store's plug-in loads libpq on demand, so only the headers are needed to build.
pkg_check_modules(libpq REQUIRED IMPORTED_TARGET libpq)
add_library(libpqheaders INTERFACE)
target_include_directories(libpqheaders SYSTEM INTERFACE ${libpq_INCLUDE_DIRS})
find_package(pugixml REQUIRED)
find_package(nlohmann_json REQUIRED)

if(TINTGATE_TESTS)
  find_package(GTest REQUIRED)
endif()
if(TINTGATE_BENCH)
  find_package(benchmark REQUIRED)
endif()
