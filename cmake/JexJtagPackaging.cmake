# SPDX-License-Identifier: MIT
# Debian packages with CPack: cmake --build <build> --target package.
#
#   libjexjtag1      libJexJtag.so.1, the cable plug-ins (<libdir>/jexjtag/plugins),
#                    share/jexjtag (device list, udev rules): every install rule
#                    without a COMPONENT ("runtime")
#   libjexjtag-dev   headers, the .so link, the CMake package, jexjtag.pc, and
#                    every component whose name says dev or sdk (the cable SDK)
#   jexjtag          the program, its man page and bash completion ("cli")
#   python3-jexjtag  the Python package ("python")
#
# Configure with -DCMAKE_INSTALL_PREFIX=/usr so the library lands in Debian's
# multiarch folder (/usr/lib/<triplet>); scripts/test-packages.sh does.
set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME jexjtag)
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_PACKAGE_VENDOR "libJexJtag")
set(CPACK_PACKAGE_CONTACT "libJexJtag maintainers <jexjtag-maintainers@localhost>")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_GROUPING ONE_PER_GROUP)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_RELEASE 1)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
# The program's libJexJtag.so.1 is this build's, not an installed package's.
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${JEXJTAG_OUT_LIB})
set(_exact "(= ${PROJECT_VERSION}-1)")

# Each *_DESCRIPTION: the summary line, then the long text.
set(CPACK_DEBIAN_RUNTIME_PACKAGE_NAME libjexjtag${PROJECT_VERSION_MAJOR})
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_RUNTIME_DESCRIPTION "JTAG boundary-scan library with its cable plug-ins
libJexJtag reaches IEEE 1149.1 boundary-scan chains through cable plug-ins
loaded at run time; this package holds the library, the shipped cable
plug-ins and share/jexjtag (the device list, udev rules).")

set(CPACK_DEBIAN_DEV_PACKAGE_NAME libjexjtag-dev)
set(CPACK_DEBIAN_DEV_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEV_PACKAGE_DEPENDS "libjexjtag${PROJECT_VERSION_MAJOR} ${_exact}")
set(CPACK_DEBIAN_DEV_DESCRIPTION "JTAG boundary-scan library - development files
Headers of the C API, the C++ class interface and the plug-in ABI, the
CMake package (find_package(JexJtag)), the pkg-config file and the cable SDK.")

set(CPACK_DEBIAN_CLI_PACKAGE_NAME jexjtag)
set(CPACK_DEBIAN_CLI_PACKAGE_SECTION electronics)
set(CPACK_DEBIAN_CLI_PACKAGE_DEPENDS "libjexjtag${PROJECT_VERSION_MAJOR} ${_exact}")
set(CPACK_DEBIAN_CLI_DESCRIPTION "JTAG boundary-scan chains from the shell
The jexjtag program lists cables, scans chains, shifts registers and reads
BSDL files through libJexJtag.")

set(CPACK_DEBIAN_PYTHON_PACKAGE_NAME python3-jexjtag)
set(CPACK_DEBIAN_PYTHON_PACKAGE_SECTION python)
set(CPACK_DEBIAN_PYTHON_PACKAGE_ARCHITECTURE all)
set(CPACK_DEBIAN_PYTHON_PACKAGE_SHLIBDEPS OFF)
set(CPACK_DEBIAN_PYTHON_PACKAGE_DEPENDS "python3, libjexjtag${PROJECT_VERSION_MAJOR} (>= ${PROJECT_VERSION})")
set(CPACK_DEBIAN_PYTHON_DESCRIPTION "JTAG boundary-scan chains from Python
The jexjtag package: standard-library ctypes over the C API of libJexJtag.")

include(CPack)

# Every component, also those added later, goes into one of the four packages.
get_cmake_property(_components COMPONENTS)
foreach(group runtime dev cli python)
  cpack_add_component_group(${group})
endforeach()
foreach(component ${_components})
  string(TOLOWER "${component}" _name)
  string(REPLACE "-" "_" _words "_${_name}_")
  if(_name MATCHES "^(cli|python)$")
    set(_group ${_name})
  elseif(_words MATCHES "_dev(el)?_|sdk")  # not "udev": udev rules are runtime
    set(_group dev)
  else()
    set(_group runtime)
  endif()
  cpack_add_component(${component} GROUP ${_group})
endforeach()
