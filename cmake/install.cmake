# What `cmake --install` puts under the prefix: the tool, the library, the headers a host
# compiles against, the data files, the CMake package (lun::lun), lun.pc and the manual page.
include(CMakePackageConfigHelpers)

# The headers of the classes a host drives (the annotators, the extractor, the board check,
# the repository bridge) and of the platform interfaces their declarations use. The readers'
# internals (and every header that includes simdjson or SQLite) stay inside the library.
set(LUN_PUBLIC_HEADERS
  bridge/luncshelper.h
  check/ck_board_check.h
  check/ck_finding.h
  check/ck_html.h
  check/ck_text.h
  extract/cst_extractor.h
  frame/lunbase.h
  lookup/lookup_report.h
  manager/lunmgr.h
  part/lunpart.h
  host/design/design_io.h
  host/design/dump.h
  host/design/name_pool.h
  host/design/ndm_constraint_blocks.h
  host/design/native_format.h
  host/design/ndm.h
  host/design/ndm_lookup.h
  host/design/ndm_property.h
  host/design/yosys_reader.h
  host/filter/prop_filter.h
  host/parser/pr_logical.h
  host/port/atomic_file.h
  host/port/msgman.h
  host/port/stream.h
  host/port/string_base.h
  host/repository/cs_constraint.h
  host/repository/cs_mgr.h
  host/repository/cs_region.h
  host/repository/cs_status.h
  host/util/fname_group.h)
set(LUN_INCLUDE_DIR ${CMAKE_INSTALL_INCLUDEDIR}/lun)
foreach(header ${LUN_PUBLIC_HEADERS})
  get_filename_component(dir ${header} DIRECTORY)
  install(FILES ${header} DESTINATION ${LUN_INCLUDE_DIR}/${dir})
endforeach()
install(FILES ${LUN_GENERATED_DIR}/host/port/version.h DESTINATION ${LUN_INCLUDE_DIR}/host/port)

install(TARGETS lun EXPORT lunTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}
  INCLUDES DESTINATION ${LUN_INCLUDE_DIR})
install(TARGETS quillmap RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})
install(FILES data/ucf.pfd data/ucf.prp DESTINATION ${CMAKE_INSTALL_DATADIR}/lun)

# find_package(lun): the imported target lun::lun and its version. The library's own
# dependencies are private to it, so the package needs none.
set(LUN_CMAKE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/lun)
install(EXPORT lunTargets NAMESPACE lun:: DESTINATION ${LUN_CMAKE_DIR})
configure_package_config_file(cmake/lunConfig.cmake.in ${CMAKE_BINARY_DIR}/lunConfig.cmake
  INSTALL_DESTINATION ${LUN_CMAKE_DIR} PATH_VARS CMAKE_INSTALL_DATADIR)
write_basic_package_version_file(${CMAKE_BINARY_DIR}/lunConfigVersion.cmake
  COMPATIBILITY SameMinorVersion)
install(FILES ${CMAKE_BINARY_DIR}/lunConfig.cmake ${CMAKE_BINARY_DIR}/lunConfigVersion.cmake
  DESTINATION ${LUN_CMAKE_DIR})

# pkg-config: the prefix is found from where lun.pc lies, so a moved prefix still works.
file(RELATIVE_PATH LUN_PREFIX_FROM_PC ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
configure_file(cmake/lun.pc.in ${CMAKE_BINARY_DIR}/lun.pc @ONLY)
install(FILES ${CMAKE_BINARY_DIR}/lun.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)

# quillmap(1) from the help texts, when help2man is there.
find_program(HELP2MAN help2man)
if(HELP2MAN)
  set(page ${CMAKE_BINARY_DIR}/man/quillmap.1)
  add_custom_command(OUTPUT ${page}
    COMMAND ${CMAKE_COMMAND} -DQUILLMAP=$<TARGET_FILE:quillmap> -DHELP2MAN=${HELP2MAN} -DOUTPUT=${page}
            -P ${PROJECT_SOURCE_DIR}/cmake/quillmap_man.cmake
    DEPENDS quillmap ${PROJECT_SOURCE_DIR}/cmake/quillmap_man.cmake
    COMMENT "Making the quillmap(1) manual page")
  add_custom_target(quillmap_man ALL DEPENDS ${page})
  install(FILES ${page} DESTINATION ${CMAKE_INSTALL_MANDIR}/man1)
else()
  message(STATUS "help2man not found: the quillmap(1) manual page is not made")
endif()
