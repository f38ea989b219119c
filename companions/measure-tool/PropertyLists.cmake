# SPDX-License-Identifier: Apache-2.0
# Runs at installation: writes the property lists with absolute paths that contain the root.
get_filename_component(_root "${CMAKE_INSTALL_PREFIX}" ABSOLUTE)
if(_root MATCHES "[\"'$`\\\\]")
  message(FATAL_ERROR "${_root} can't be a system root: it has a quote, $, ` or backslash in it")
endif()
string(LENGTH "${_root}/Applications/Nerova" _length)
if(_length GREATER 255)
  message(FATAL_ERROR "${_root} can't be a system root: a property list's path has 255 bytes at most")
endif()

function(write_list name entries)
  file(WRITE "$ENV{DESTDIR}${_root}/Library/Preferences/${name}"
    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n<dict>\n${entries}"
    "</dict>\n</plist>\n")
endfunction()

string(REPLACE "&" "&amp;" _path "${_root}")
string(REPLACE "<" "&lt;" _path "${_path}")
write_list(ApplicationsUsingNerovaMeasure_x64.plist
  "\t<key>installed_path</key>\n\t<string>${_path}/Applications/Nerova</string>\n")
write_list(Qen/com.qen.packageversion.plist
  "\t<key>Nerova Hue Workbench</key>\n\t<dict>\n\t\t<key>library_path</key>\n\t\t<string>${_path}</string>\n\t</dict>\n")
