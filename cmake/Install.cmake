# What `cmake --install` puts under the prefix: the driver library and the
# platform library it needs (both with a SONAME), the public headers, the two
# programs, the documentation, a pkg-config file and a CMake package.
# Documentation goes to share/doc/quorlen731xx, as a Debian package names it.
if(NOT DEFINED CMAKE_INSTALL_DOCDIR)
  set(CMAKE_INSTALL_DOCDIR share/doc/quorlen731xx CACHE PATH "documentation (DATAROOTDIR/doc/quorlen731xx)")
endif()
include(GNUInstallDirs)
include(CMakePackageConfigHelpers)

set(QN_PACKAGE_NAME quorlen731xx)
set(QN_INCLUDE_SUBDIR ${CMAKE_INSTALL_INCLUDEDIR}/${QN_PACKAGE_NAME})
set(QN_CMAKE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/Quorlen731XX)

# libquorlen731xx.so.1 -> libquorlen731xx.so.1.3.20: the major version is the ABI.
foreach(lib quorlen731xx_shared qnplatform)
  set_target_properties(${lib} PROPERTIES VERSION ${PROJECT_VERSION}
    SOVERSION ${PROJECT_VERSION_MAJOR})
endforeach()
set_target_properties(quorlen731xx_shared PROPERTIES EXPORT_NAME quorlen731xx)
foreach(lib quorlen731xx_shared qnplatform)
  target_include_directories(${lib} INTERFACE $<INSTALL_INTERFACE:${QN_INCLUDE_SUBDIR}>)
endforeach()

# Installed programs and libraries find the project's libraries beside them
# wherever the tree is moved; the build tree keeps its own absolute paths.
file(RELATIVE_PATH qn_bin_to_lib /${CMAKE_INSTALL_BINDIR} /${CMAKE_INSTALL_LIBDIR})
set_target_properties(quorlen731xx_shared qnplatform PROPERTIES INSTALL_RPATH "$ORIGIN")
set_target_properties(qn731xx qn731xx-emulator PROPERTIES
  INSTALL_RPATH "$ORIGIN/${qn_bin_to_lib}")

install(TARGETS quorlen731xx_shared qnplatform EXPORT Quorlen731XXTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(TARGETS qn731xx qn731xx-emulator RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})

# Public headers keep their relative layout under include/quorlen731xx, so the
# interface headers find "platform/com/com.h" as they do in the source tree.
install(DIRECTORY include/ DESTINATION ${QN_INCLUDE_SUBDIR})
install(FILES
  platform/com/activation.h platform/com/bstr.h platform/com/com.h platform/com/errorinfo.h
  platform/com/lock.h platform/com/safearray.h platform/com/types.h platform/com/unknown.h
  platform/com/variant.h
  DESTINATION ${QN_INCLUDE_SUBDIR}/platform/com)
install(FILES platform/visa/visa.h DESTINATION ${QN_INCLUDE_SUBDIR}/platform/visa)

install(FILES README.md DESTINATION ${CMAKE_INSTALL_DOCDIR})
install(DIRECTORY docs/ DESTINATION ${CMAKE_INSTALL_DOCDIR} FILES_MATCHING PATTERN "*.md")

# The pkg-config file locates the prefix from its own directory, so an
# install with `--prefix` elsewhere than the configured one still works.
file(RELATIVE_PATH QN_PC_TO_PREFIX /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
string(REGEX REPLACE "/$" "" QN_PC_TO_PREFIX "${QN_PC_TO_PREFIX}")
configure_file(cmake/quorlen731xx.pc.in ${PROJECT_BINARY_DIR}/quorlen731xx.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/quorlen731xx.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)

install(EXPORT Quorlen731XXTargets NAMESPACE Quorlen731XX:: DESTINATION ${QN_CMAKE_DIR})
configure_package_config_file(cmake/Quorlen731XXConfig.cmake.in
  ${PROJECT_BINARY_DIR}/Quorlen731XXConfig.cmake INSTALL_DESTINATION ${QN_CMAKE_DIR})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/Quorlen731XXConfigVersion.cmake
  COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/Quorlen731XXConfig.cmake
  ${PROJECT_BINARY_DIR}/Quorlen731XXConfigVersion.cmake DESTINATION ${QN_CMAKE_DIR})
