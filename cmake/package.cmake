# `cpack -G DEB` (run from the build folder) packs what `cmake --install` installs, under /usr:
# the tool, the library, the headers, the data files and the manual page. Nothing here runs
# during the build.
set(CPACK_PACKAGE_NAME lun)
set(CPACK_PACKAGE_VENDOR "The lun developers")
set(CPACK_PACKAGE_CONTACT "The lun developers")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY
  "Constraint annotation library for FPGA netlists, with its command-line host quillmap")
set(CPACK_PACKAGE_DESCRIPTION
  "lun reads UCF and NCF constraint files, finds the design objects each statement names and \
attaches the constraints as typed properties; quillmap annotates Yosys JSON netlists with it.")
set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION devel)
# The runtime libraries the package needs (simdjson, SQLite, the C++ runtime) are worked out
# by dpkg-shlibdeps from the binaries; without it they are listed by hand.
find_program(LUN_DPKG_SHLIBDEPS dpkg-shlibdeps)
if(LUN_DPKG_SHLIBDEPS)
  set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
else()
  set(CPACK_DEBIAN_PACKAGE_DEPENDS "libc6, libstdc++6, libgcc-s1, libsimdjson14, libsqlite3-0")
endif()
include(CPack)
