# SPDX-License-Identifier: Apache-2.0
# Installs a whole suite in one folder: `cmake --install BUILD --component companions --prefix ROOT`
# creates a system root, to be named by TINTGATE_ROOT.
#
#   ROOT/Applications/Nerova/NerovaMeasure.app/Contents/MacOS/NerovaMeasure
#   ROOT/Applications/Nerova/Nerova Verify.app/...          the viewer, by its own list
#   ROOT/usr/libexec/Plistbuddy                             the reader of property lists
#   ROOT/lib/ComGUI.Bundle                                  the comm plug-in
#   ROOT/Library/Preferences/...                            the lists that lead to all of these
set(_contents lib/ComGUI.Bundle/Contents)
install(TARGETS NerovaMeasure COMPONENT companions EXCLUDE_FROM_ALL
  RUNTIME DESTINATION Applications/Nerova/NerovaMeasure.app/Contents/MacOS)
install(PROGRAMS "$<TARGET_FILE:plist-reader>" COMPONENT companions EXCLUDE_FROM_ALL
  DESTINATION usr/libexec RENAME Plistbuddy)
install(TARGETS ComGUI COMPONENT companions EXCLUDE_FROM_ALL
  LIBRARY DESTINATION "${_contents}/MacOS")
install(FILES "${TINTGATE_COMGUI_BUNDLE}/Contents/Info.plist" COMPONENT companions
  EXCLUDE_FROM_ALL DESTINATION "${_contents}")
install(FILES NerovaMeasure.conf.example COMPONENT companions EXCLUDE_FROM_ALL
  DESTINATION Library/Preferences)
install(SCRIPT "${CMAKE_CURRENT_SOURCE_DIR}/PropertyLists.cmake" COMPONENT companions
  EXCLUDE_FROM_ALL)
