# Installation to any prefix (cmake --install BUILD --prefix DIR): the two
# shared libraries with their SONAMEs, the headers a caller needs, bitcalc
# and its man page, the Python package, the CMake package that gives
# bitfcns::bitfcns and bitfcns::host, and bitfcns.pc. cpack -G DEB packs the
# same files into a Debian package.
include(GNUInstallDirs)
include(CMakePackageConfigHelpers)

set(BITFCNS_INSTALL_CMAKEDIR ${CMAKE_INSTALL_LIBDIR}/cmake/bitfcns
    CACHE STRING "Where the CMake package files go, relative to the prefix")
# The headers keep the tree's own include paths ("bitfcns/...", "host/...")
# under one folder of their own, so that no folder named host lands in the
# system's include directory.
set(bitfcns_include_root ${CMAKE_INSTALL_INCLUDEDIR}/bitfcns)

# Usage requirements of the installed targets: the include folder, Boost's
# headers (already a public dependency of the host), C++20 for the headers.
set_target_properties(zqhost PROPERTIES EXPORT_NAME host)
target_include_directories(zqhost INTERFACE $<INSTALL_INTERFACE:${bitfcns_include_root}>)
target_compile_features(zqhost INTERFACE cxx_std_20)

# Installed files find each other wherever the prefix is.
set_target_properties(bitfcns zqhost PROPERTIES INSTALL_RPATH "$ORIGIN")
set_target_properties(bitcalc PROPERTIES INSTALL_RPATH "$ORIGIN/../${CMAKE_INSTALL_LIBDIR}")

install(TARGETS bitfcns zqhost EXPORT bitfcnsTargets
        LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(TARGETS bitcalc RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})

install(FILES ${PROJECT_SOURCE_DIR}/include/bitfcns/entry_points.hpp
              ${PROJECT_BINARY_DIR}/include/bitfcns/version.hpp
        DESTINATION ${bitfcns_include_root}/bitfcns)
# What a caller of the entry points uses of the host: the array record, making
# and reading arrays, the exceptions it catches, the class tags, the message
# sentences. The host's internals and the routines only a library calls stay
# out.
install(FILES ${PROJECT_SOURCE_DIR}/host/zq_array.hpp
              ${PROJECT_SOURCE_DIR}/host/array_factory.hpp
              ${PROJECT_SOURCE_DIR}/host/exceptions.hpp
              ${PROJECT_SOURCE_DIR}/host/element_types.hpp
              ${PROJECT_SOURCE_DIR}/host/message_catalogue.hpp
        DESTINATION ${bitfcns_include_root}/host)

install(FILES ${PROJECT_SOURCE_DIR}/docs/bitcalc.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1)
install(FILES ${PROJECT_SOURCE_DIR}/docs/guide.md ${PROJECT_SOURCE_DIR}/README.md
        DESTINATION ${CMAKE_INSTALL_DOCDIR})

# The Python package (python/bitfcns with the extension bitfcns._core), where
# the prefix's interpreter looks: Debian's own folder under /usr, the local
# one under /usr/local, and site-packages under any other prefix, as for
# `pip install --prefix`. The folder is chosen when installing, since
# cmake --install --prefix and cpack choose the prefix only then.
if(TARGET bitfcns_python)
  execute_process(COMMAND ${Python_EXECUTABLE} -c
                          "import sys; print('%d.%d;%d.%d' % (*sys.version_info[:2], \
                                                              sys.version_info[0], \
                                                              sys.version_info[1] + 1))"
                  OUTPUT_VARIABLE bitfcns_python_versions OUTPUT_STRIP_TRAILING_WHITESPACE
                  COMMAND_ERROR_IS_FATAL ANY)
  list(GET bitfcns_python_versions 0 bitfcns_python_version)
  list(GET bitfcns_python_versions 1 bitfcns_python_next_version)
  install(CODE "
    if(CMAKE_INSTALL_PREFIX STREQUAL \"/usr\")
      set(BITFCNS_PYTHON_INSTALL_DIR lib/python3/dist-packages)
    elseif(CMAKE_INSTALL_PREFIX STREQUAL \"/usr/local\")
      set(BITFCNS_PYTHON_INSTALL_DIR lib/python${bitfcns_python_version}/dist-packages)
    else()
      set(BITFCNS_PYTHON_INSTALL_DIR lib/python${bitfcns_python_version}/site-packages)
    endif()")
  # Four folders below the prefix, wherever the package lands.
  set_target_properties(bitfcns_python PROPERTIES
                        INSTALL_RPATH "$ORIGIN/../../../../${CMAKE_INSTALL_LIBDIR}")
  install(TARGETS bitfcns_python LIBRARY DESTINATION "\${BITFCNS_PYTHON_INSTALL_DIR}/bitfcns")
  install(DIRECTORY ${PROJECT_SOURCE_DIR}/python/bitfcns/
          DESTINATION "\${BITFCNS_PYTHON_INSTALL_DIR}/bitfcns" PATTERN __pycache__ EXCLUDE)
  set(CPACK_DEBIAN_PACKAGE_DEPENDS
      "python3 (>= ${bitfcns_python_version}~), python3 (<< ${bitfcns_python_next_version}), python3-numpy")
  set(CPACK_DEBIAN_PACKAGE_SUGGESTS "python3-dask, python3-distributed")
endif()

# The CMake package.
install(EXPORT bitfcnsTargets NAMESPACE bitfcns:: DESTINATION ${BITFCNS_INSTALL_CMAKEDIR})
configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/bitfcnsConfig.cmake.in
                              ${PROJECT_BINARY_DIR}/bitfcnsConfig.cmake
                              INSTALL_DESTINATION ${BITFCNS_INSTALL_CMAKEDIR})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/bitfcnsConfigVersion.cmake
                                 COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/bitfcnsConfig.cmake
              ${PROJECT_BINARY_DIR}/bitfcnsConfigVersion.cmake
        DESTINATION ${BITFCNS_INSTALL_CMAKEDIR})

# bitfcns.pc finds the prefix from its own place, so that it holds whatever
# prefix the tree is installed to.
file(RELATIVE_PATH bitfcns_pc_to_prefix /prefix/${CMAKE_INSTALL_LIBDIR}/pkgconfig /prefix)
string(REGEX REPLACE "/$" "" bitfcns_pc_to_prefix "${bitfcns_pc_to_prefix}")
configure_file(${PROJECT_SOURCE_DIR}/cmake/bitfcns.pc.in ${PROJECT_BINARY_DIR}/bitfcns.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/bitfcns.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)

# The Debian package. dpkg-shlibdeps declares what the binaries link
# (libtbb12, libedit2, the C++ runtime); what a caller builds with is
# recommended.
set(CPACK_PACKAGE_NAME bitfcns)
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "${PROJECT_DESCRIPTION}")
set(CPACK_PACKAGE_DESCRIPTION
    "A shared library of seven element-wise bit functions (bitand, bitor, bitxor, bitcmp, \
bitget, bitset, bitshift) for a numeric array host, with the stand-in host libzqhost, the \
evaluator bitcalc, headers, CMake and pkg-config files.")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_MAINTAINER "bitfcns developers <bitfcns@localhost>")
set(CPACK_DEBIAN_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_RECOMMENDS "libboost-dev (>= 1.74), libtbb-dev, pkg-config")
include(CPack)
