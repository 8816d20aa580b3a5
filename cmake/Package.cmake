# `cpack -G DEB` in the build directory packs what `cmake --install` installs
# into one Debian package under /usr, with its Depends computed from the
# libraries the installed programs and libraries link.
set(CPACK_PACKAGE_NAME quorlen731xx)
set(CPACK_PACKAGE_VENDOR "Quorlen731XX project")
set(CPACK_PACKAGE_CONTACT "Quorlen731XX maintainers <maintainers@quorlen731xx.invalid>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY
  "Instrument driver for the Quorlen731XX oscilloscopes, with its tools and headers")
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_GENERATOR DEB)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
# The package's own libraries satisfy the programs' links to them; only the
# system libraries become dependencies.
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS
  ${CMAKE_BINARY_DIR})
# Debug information stays in the build tree: the package carries stripped
# binaries (about a fifth of the size), packed quickly.
set(CPACK_STRIP_FILES ON)
set(CPACK_DEBIAN_COMPRESSION_TYPE gzip)
include(CPack)
