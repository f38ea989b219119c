# What an installation holds, and the Debian packages made of it by `cpack` in the build folder:
# tintgate (programs, presets, pages), libtintgate1 (the analysis library) and libtintgate-dev (its
# headers).

set(_share "${CMAKE_INSTALL_DATADIR}/tintgate")
set(_doc "${CMAKE_INSTALL_DATADIR}/doc")
set(_include "${CMAKE_INSTALL_INCLUDEDIR}/tintgate") # Includes are written from the root in here.
set(_made "${PROJECT_BINARY_DIR}/docs")

# Pages that are made from the list of exit codes, and what Debian wants compressed, without a time
# stamp.
set(_codes "${PROJECT_SOURCE_DIR}/docs/exit-codes.csv")
set(_maker "${PROJECT_SOURCE_DIR}/scripts/make-exit-codes.py")
set(_page "${PROJECT_SOURCE_DIR}/docs/Tintgate.1.in")
set(_changes "${PROJECT_SOURCE_DIR}/debian/changelog")
set(_pages "${_made}/exit-codes.md" "${_made}/Tintgate.1.gz" "${_made}/changelog.gz")
find_program(GZIP gzip REQUIRED)
file(MAKE_DIRECTORY "${_made}")
add_custom_command(OUTPUT ${_pages}
  COMMAND Python3::Interpreter "${_maker}" table "${_codes}" "${_made}/exit-codes.md"
  COMMAND Python3::Interpreter "${_maker}" man "${_codes}" "${_page}" "${_made}/Tintgate.1"
  COMMAND ${GZIP} -9nc "${_made}/Tintgate.1" > "${_made}/Tintgate.1.gz"
  COMMAND ${GZIP} -9nc "${_changes}" > "${_made}/changelog.gz"
  DEPENDS "${_codes}" "${_maker}" "${_page}" "${_changes}"
  COMMENT "Making the pages that list exit codes" VERBATIM)
add_custom_target(pages ALL DEPENDS ${_pages})

install(TARGETS Tintgate RUNTIME COMPONENT tintgate)
install(DIRECTORY presets/ DESTINATION "${_share}/presets" COMPONENT tintgate)
install(FILES "${_made}/Tintgate.1.gz" DESTINATION "${CMAKE_INSTALL_MANDIR}/man1"
  COMPONENT tintgate)
install(FILES README.md "${_made}/exit-codes.md" DESTINATION "${_doc}/tintgate"
  COMPONENT tintgate)
install(DIRECTORY docs/ DESTINATION "${_doc}/tintgate" COMPONENT tintgate
  FILES_MATCHING PATTERN "*.md" PATTERN "*.json")
install(TARGETS libTintgate
  LIBRARY COMPONENT libtintgate1 NAMELINK_COMPONENT libtintgate-dev)
install(FILES job/AnalysisLibrary.h job/JobRecords.h DESTINATION "${_include}/job"
  COMPONENT libtintgate-dev)
install(FILES "${PROJECT_BINARY_DIR}/see/exitcodes/ExitCodes.h" DESTINATION "${_include}"
  COMPONENT libtintgate-dev)
foreach(_package tintgate libtintgate1 libtintgate-dev)
  install(FILES debian/copyright "${_made}/changelog.gz" DESTINATION "${_doc}/${_package}"
    COMPONENT ${_package})
endforeach()

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME tintgate)
set(CPACK_PACKAGE_VENDOR "Tintgate")
set(CPACK_PACKAGE_CONTACT "Tintgate maintainers <maintainers@tintgate.example>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "") # Each package has one of its own.
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS OWNER_READ OWNER_WRITE OWNER_EXECUTE
  GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
set(CPACK_COMPONENTS_ALL tintgate libtintgate1 libtintgate-dev)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS "${CMAKE_LIBRARY_OUTPUT_DIRECTORY}")

set(CPACK_DEBIAN_TINTGATE_PACKAGE_NAME tintgate)
set(CPACK_DEBIAN_TINTGATE_PACKAGE_SECTION graphics)
# ICU is opened when a text needs it, so the linker does not know of it.
file(STRINGS "${ICU_INCLUDE_DIR}/unicode/uvernum.h" _icu REGEX "^#define U_ICU_VERSION_SHORT ")
string(REGEX MATCH "[0-9]+" _icu "${_icu}")
set(CPACK_DEBIAN_TINTGATE_PACKAGE_DEPENDS "libtintgate1 (>= ${PROJECT_VERSION}), libicu${_icu}")
# So is libpq, by those whose store is on a server.
set(CPACK_DEBIAN_TINTGATE_PACKAGE_RECOMMENDS "libpq5 (>= 14)")
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
set(CPACK_DEBIAN_LIBTINTGATE-DEV_DESCRIPTION "analysis library of Tintgate, for developers
Compares colour data, judges the outcome by a tolerance preset and writes it as
JSON. This package holds the headers.")
include(CPack)
