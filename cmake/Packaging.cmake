# SPDX-License-Identifier: Apache-2.0
# The contents of an installation, and the Debian packages that scripts/package.sh makes: tintgate
# (the tool, presets, pages), libtintgate1 (the analysis library), libtintgate-dev (its headers),
# tintgate-comgui (the comm plug-in) and tintgate-companions (the companion programs).
#
# The packages share a system root, which is built into the packaged tool (TINTGATE_PACKAGE).
# tintgate-comgui and tintgate-companions each contain a part of what Suite.cmake installs.

set(_share "${CMAKE_INSTALL_DATADIR}/tintgate")
set(_doc "${CMAKE_INSTALL_DATADIR}/doc")
set(_include "${CMAKE_INSTALL_INCLUDEDIR}/tintgate")  # Root of the includes.
set(_made "${PROJECT_BINARY_DIR}/docs")

# Pages generated from the list of exit codes, and files that Debian requires compressed, without a
# time stamp.
set(_codes "${PROJECT_SOURCE_DIR}/docs/exit-codes.csv")
set(_outcomes "${PROJECT_SOURCE_DIR}/docs/job-outcomes.csv")
set(_maker "${PROJECT_SOURCE_DIR}/scripts/make-exit-codes.py")
set(_tables "${PROJECT_SOURCE_DIR}/scripts/tables.py")
set(_page "${PROJECT_SOURCE_DIR}/docs/Tintgate.1.in")
set(_changes "${PROJECT_SOURCE_DIR}/debian/changelog")
set(_pages "${_made}/exit-codes.md" "${_made}/Tintgate.1.gz" "${_made}/changelog.gz")
set(_cli_maker "${PROJECT_SOURCE_DIR}/scripts/make-cli-pages.py")
find_program(GZIP gzip REQUIRED)
file(MAKE_DIRECTORY "${_made}")
add_custom_command(OUTPUT ${_pages}
  COMMAND Python3::Interpreter "${_maker}" table "${_codes}" "${_made}/exit-codes.md"
  COMMAND Python3::Interpreter "${_maker}" man "${_codes}" "${_page}" "${_made}/Tintgate.1"
  COMMAND ${GZIP} -9nc "${_made}/Tintgate.1" > "${_made}/Tintgate.1.gz"
  COMMAND ${GZIP} -9nc "${_changes}" > "${_made}/changelog.gz"
  DEPENDS "${_codes}" "${_outcomes}" "${_maker}" "${_tables}" "${_page}" "${_changes}"
  COMMENT "Making the pages that list exit codes" VERBATIM)

# Pages made from a program's --help: name of the page, and the target that is run.
set(_explained
  tintgate-store=tintgate-store
  tintgate-report=tintgate-report)
foreach(_pair IN LISTS _explained)
  string(REPLACE "=" ";" _pair "${_pair}")
  list(GET _pair 0 _name)
  list(GET _pair 1 _target)
  add_custom_command(OUTPUT "${_made}/${_name}.1.gz" "${_made}/${_name}.completion"
    COMMAND Python3::Interpreter "${_cli_maker}" man $<TARGET_FILE:${_target}> ${PROJECT_VERSION}
      "${_made}/${_name}.1"
    COMMAND Python3::Interpreter "${_cli_maker}" completion $<TARGET_FILE:${_target}>
      "${_made}/${_name}.completion"
    COMMAND ${GZIP} -9nc "${_made}/${_name}.1" > "${_made}/${_name}.1.gz"
    DEPENDS ${_target} "${_cli_maker}"
    COMMENT "Asking ${_name} for its pages" VERBATIM)
  list(APPEND _pages "${_made}/${_name}.1.gz" "${_made}/${_name}.completion")
  install(FILES "${_made}/${_name}.1.gz" DESTINATION "${CMAKE_INSTALL_MANDIR}/man1"
    COMPONENT tintgate-companions)
  install(FILES "${_made}/${_name}.completion" RENAME ${_name}
    DESTINATION "${CMAKE_INSTALL_DATADIR}/bash-completion/completions"
    COMPONENT tintgate-companions)
endforeach()
foreach(_name NerovaMeasure NerovaVerify tintgate-check)
  add_custom_command(OUTPUT "${_made}/${_name}.1.gz"
    COMMAND ${GZIP} -9nc "${PROJECT_SOURCE_DIR}/docs/${_name}.1" > "${_made}/${_name}.1.gz"
    DEPENDS "${PROJECT_SOURCE_DIR}/docs/${_name}.1" VERBATIM)
  list(APPEND _pages "${_made}/${_name}.1.gz")
  install(FILES "${_made}/${_name}.1.gz" DESTINATION "${CMAKE_INSTALL_MANDIR}/man1"
    COMPONENT tintgate-companions)
endforeach()
add_custom_target(pages ALL DEPENDS ${_pages})
install(FILES docs/tintgate-check.completion RENAME tintgate-check
  DESTINATION "${CMAKE_INSTALL_DATADIR}/bash-completion/completions"
  COMPONENT tintgate-companions)

# The service that watches folders, its user, and the system's conditions. They name places of the
# packages, so other installations leave them out.
install(FILES debian/tintgate-check@.service DESTINATION lib/systemd/system
  COMPONENT tintgate-companions EXCLUDE_FROM_ALL)
install(FILES debian/tintgate.sysusers RENAME tintgate.conf DESTINATION lib/sysusers.d
  COMPONENT tintgate-companions EXCLUDE_FROM_ALL)
install(FILES debian/conditions.toml DESTINATION /etc/tintgate
  COMPONENT tintgate-companions EXCLUDE_FROM_ALL)
foreach(_script conffiles postinst)
  configure_file(debian/tintgate-companions.${_script} "${_made}/companions/${_script}" COPYONLY)
endforeach()

install(TARGETS Tintgate RUNTIME COMPONENT tintgate)
install(TARGETS TintgateJob LIBRARY DESTINATION "${CMAKE_INSTALL_LIBDIR}/tintgate"
  COMPONENT tintgate)
install(DIRECTORY presets/ DESTINATION "${_share}/presets" COMPONENT tintgate)
install(FILES "${_made}/Tintgate.1.gz" DESTINATION "${CMAKE_INSTALL_MANDIR}/man1"
  COMPONENT tintgate)
# Installed, README.md is in one folder with the pages that it links to.
file(READ README.md _readme)
string(REPLACE "](docs/" "](" _readme "${_readme}")
file(GENERATE OUTPUT "${_made}/README.md" CONTENT "${_readme}")
set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS README.md)
install(FILES "${_made}/README.md" "${_made}/exit-codes.md" DESTINATION "${_doc}/tintgate"
  COMPONENT tintgate)
install(DIRECTORY docs/ DESTINATION "${_doc}/tintgate" COMPONENT tintgate
  FILES_MATCHING PATTERN "*.md" PATTERN "*.json" PATTERN "*.csv")
install(FILES docs/Tintgate.completion RENAME Tintgate
  DESTINATION "${CMAKE_INSTALL_DATADIR}/bash-completion/completions" COMPONENT tintgate)

# Installs the suite into its root below the prefix. A package omits what the other package
# installs. An installation without a component gets the whole suite, once.
function(install_suite code component)
  install(CODE "
    set(_root \"\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/${TINTGATE_PACKAGE_ROOT}\")
    execute_process(COMMAND \"${CMAKE_COMMAND}\" --install \"${PROJECT_BINARY_DIR}\"
      --component companions --prefix \"\${CMAKE_INSTALL_PREFIX}/${TINTGATE_PACKAGE_ROOT}\"
      OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)
    ${code}" COMPONENT ${component} ${ARGN})
endfunction()
function(install_suite_for component)
  list(TRANSFORM ARGN PREPEND "\${_root}/" OUTPUT_VARIABLE _others)
  list(JOIN _others "\" \"" _others)
  install_suite("
    file(REMOVE_RECURSE \"${_others}\")
    file(GLOB_RECURSE _programs \"\${_root}/ComGUI\" \"\${_root}/Plistbuddy\"
      \"\${_root}/NerovaMeasure\" \"\${_root}/Nerova Verify\")
    execute_process(COMMAND \"${CMAKE_STRIP}\" --strip-unneeded \${_programs}
      COMMAND_ERROR_IS_FATAL ANY)" ${component} EXCLUDE_FROM_ALL)
endfunction()
install_suite("" suite)
install_suite_for(tintgate-comgui Applications Library/Preferences/NerovaMeasure.conf.example
  Library/Preferences/ApplicationsUsingNerovaMeasure_x64.plist)
install_suite_for(tintgate-companions lib usr Library/Preferences/Qen)
# The settings of the measuring tool belong to the print room's administrator. Without packages they
# are a file in the root.
install(CODE "
  set(_settings \"${TINTGATE_PACKAGE_ROOT}/Library/Preferences/NerovaMeasure.conf\")
  file(CREATE_LINK /etc/tintgate/measure.conf
    \"\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/\${_settings}\" SYMBOLIC)
  set(_viewers \"\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/${TINTGATE_PACKAGE_ROOT}/etc/tintgate\")
  file(MAKE_DIRECTORY \"\${_viewers}\")
  file(CREATE_LINK /etc/tintgate/viewer.conf \"\${_viewers}/viewer.conf\" SYMBOLIC)"
  COMPONENT tintgate-companions EXCLUDE_FROM_ALL)

install(TARGETS libTintgate
  LIBRARY COMPONENT libtintgate1 NAMELINK_COMPONENT libtintgate-dev)
install(FILES job/AnalysisLibrary.h job/JobRecords.h DESTINATION "${_include}/job"
  COMPONENT libtintgate-dev)
install(FILES "${PROJECT_BINARY_DIR}/see/exitcodes/ExitCodes.h" DESTINATION "${_include}"
  COMPONENT libtintgate-dev)
# The version is the library's own. The prefix is derived from the file's location.
get_target_property(TINTGATE_PC_VERSION libTintgate VERSION)
file(RELATIVE_PATH TINTGATE_PREFIX_FROM_PC "/${CMAKE_INSTALL_LIBDIR}/pkgconfig" "/")
configure_file(cmake/tintgate.pc.in "${_made}/tintgate.pc" @ONLY)
install(FILES "${_made}/tintgate.pc" DESTINATION "${CMAKE_INSTALL_LIBDIR}/pkgconfig"
  COMPONENT libtintgate-dev)
install(FILES docs/example-library/compare.cpp DESTINATION "${_doc}/libtintgate-dev/examples"
  COMPONENT libtintgate-dev)
install(FILES docs/criteria.md docs/result.md docs/result.schema.json
  DESTINATION "${_doc}/libtintgate-dev" COMPONENT libtintgate-dev)
set(_packages tintgate libtintgate1 libtintgate-dev tintgate-comgui tintgate-companions)
foreach(_package IN LISTS _packages)
  install(FILES debian/copyright "${_made}/changelog.gz" DESTINATION "${_doc}/${_package}"
    COMPONENT ${_package})
endforeach()

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME tintgate)
set(CPACK_PACKAGE_VENDOR "Tintgate")
set(CPACK_PACKAGE_CONTACT "Tintgate maintainers <maintainers@tintgate.example>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "")  # Each package has its own.
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_SET_DESTDIR ON)  # Files written at installation contain their final path.
set(CPACK_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS OWNER_READ OWNER_WRITE OWNER_EXECUTE
  GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
set(CPACK_COMPONENTS_ALL ${_packages})
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS "${CMAKE_LIBRARY_OUTPUT_DIRECTORY}")

set(CPACK_DEBIAN_TINTGATE_PACKAGE_NAME tintgate)
set(CPACK_DEBIAN_TINTGATE_PACKAGE_SECTION graphics)
# Opened on demand for property lists and texts, so the linker does not know about them.
set(_plist "libplist3 (>= 2.2.0)")
file(STRINGS "${ICU_INCLUDE_DIR}/unicode/uvernum.h" _icu REGEX "^#define U_ICU_VERSION_SHORT ")
string(REGEX MATCH "[0-9]+" _icu "${_icu}")
set(CPACK_DEBIAN_TINTGATE_PACKAGE_DEPENDS
  "libtintgate1 (>= ${PROJECT_VERSION}), libicu${_icu}, ${_plist}")
set(CPACK_DEBIAN_TINTGATE_PACKAGE_RECOMMENDS "tintgate-comgui, tintgate-companions")
set(CPACK_DEBIAN_TINTGATE_DESCRIPTION "verifies the colour of print jobs
Compares the colours of a proof, a print or a printing condition with their
targets under a tolerance preset, and says in a JSON file whether they pass.
Reads CGATS and IT8 text and ICC profiles for CMYK.")

set(CPACK_DEBIAN_LIBTINTGATE1_PACKAGE_NAME libtintgate1)
set(CPACK_DEBIAN_LIBTINTGATE1_PACKAGE_SECTION libs)
get_target_property(_version libTintgate SOVERSION)
file(WRITE "${_made}/shlibs" "libTintgate ${_version} libtintgate1 (>= ${PROJECT_VERSION})\n")
file(WRITE "${_made}/triggers" "activate-noawait ldconfig\n")
set(CPACK_DEBIAN_LIBTINTGATE1_PACKAGE_CONTROL_EXTRA "${_made}/shlibs;${_made}/triggers")
set(CPACK_DEBIAN_LIBTINTGATE1_DESCRIPTION "analysis library of Tintgate
Compares colour data, judges the outcome by a tolerance preset and writes it as
JSON.")

set(CPACK_DEBIAN_LIBTINTGATE-DEV_PACKAGE_NAME libtintgate-dev)
set(CPACK_DEBIAN_LIBTINTGATE-DEV_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_LIBTINTGATE-DEV_PACKAGE_DEPENDS
  "libtintgate1 (= ${PROJECT_VERSION}), libwxgtk3.2-dev")
# The texts in ExitCodes.h refer to programs and pages of these packages.
set(CPACK_DEBIAN_LIBTINTGATE-DEV_PACKAGE_SUGGESTS "tintgate, tintgate-companions")
set(CPACK_DEBIAN_LIBTINTGATE-DEV_DESCRIPTION "analysis library of Tintgate, for developers
Compares colour data, judges the outcome by a tolerance preset and writes it as
JSON. This package contains the headers, a pkg-config file and an example.")

set(CPACK_DEBIAN_TINTGATE-COMGUI_PACKAGE_NAME tintgate-comgui)
set(CPACK_DEBIAN_TINTGATE-COMGUI_PACKAGE_SECTION graphics)
set(CPACK_DEBIAN_TINTGATE-COMGUI_PACKAGE_DEPENDS "${_plist}")
# Opened if a store's address names a server.
set(CPACK_DEBIAN_TINTGATE-COMGUI_PACKAGE_RECOMMENDS "libpq5 (>= 14)")
set(CPACK_DEBIAN_TINTGATE-COMGUI_DESCRIPTION "ticket stores for Tintgate
The plug-in that connects Tintgate to a print server's jobs: a store in a
folder, or on a PostgreSQL server.")

set(CPACK_DEBIAN_TINTGATE-COMPANIONS_PACKAGE_NAME tintgate-companions)
set(CPACK_DEBIAN_TINTGATE-COMPANIONS_PACKAGE_SECTION graphics)
set(CPACK_DEBIAN_TINTGATE-COMPANIONS_PACKAGE_DEPENDS
  "tintgate (= ${PROJECT_VERSION}), tintgate-comgui (= ${PROJECT_VERSION}), libtintgate1 (>= ${PROJECT_VERSION})")
set(CPACK_DEBIAN_TINTGATE-COMPANIONS_PACKAGE_CONTROL_EXTRA
  "${_made}/companions/conffiles;${_made}/companions/postinst")
set(CPACK_DEBIAN_TINTGATE-COMPANIONS_PACKAGE_RECOMMENDS "icc-profiles-free, xdg-utils")
# Fonts of labels beyond Latin, and the printing of labels.
set(CPACK_DEBIAN_TINTGATE-COMPANIONS_PACKAGE_SUGGESTS "fonts-noto-cjk, cups-client")
set(CPACK_DEBIAN_TINTGATE-COMPANIONS_DESCRIPTION "programs beside Tintgate
The measuring tool, the viewer of verified jobs, the administration of ticket
stores (tintgate-store), and reports and trends of results (tintgate-report).")
include(CPack)
