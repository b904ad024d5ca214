# SPDX-License-Identifier: MIT
# Project-wide build helpers.

# Warnings every target of ours compiles with.
function(jexjtag_warnings target)
  target_compile_options(${target} PRIVATE
    $<$<COMPILE_LANGUAGE:CXX>:-Wall -Wextra -Wpedantic -Wshadow -Wnon-virtual-dtor>
    $<$<COMPILE_LANGUAGE:C>:-Wall -Wextra -Wpedantic>)
endfunction()

# jexjtag_add_plugin(<target> COMPANY <company> NAME <P> DESCRIPTOR <P.xml>
#                    SOURCES ... [OUTPUT_ROOT <dir>] [NO_INSTALL])
# Builds a plug-in module P.so and lays it out with its descriptor as
# <root>/<company>/<P>/P.so and P.xml.  The root defaults to the build tree's
# lib/plugins; shipped plug-ins are installed into <libdir>/jexjtag/plugins.
function(jexjtag_add_plugin target)
  cmake_parse_arguments(P "NO_INSTALL" "COMPANY;NAME;DESCRIPTOR;OUTPUT_ROOT" "SOURCES" ${ARGN})
  if(NOT P_OUTPUT_ROOT)
    set(P_OUTPUT_ROOT ${JEXJTAG_OUT_PLUGINS})
  endif()
  set(dir ${P_OUTPUT_ROOT}/${P_COMPANY}/${P_NAME})
  add_library(${target} MODULE ${P_SOURCES})
  set_target_properties(${target} PROPERTIES
    PREFIX "" OUTPUT_NAME ${P_NAME}
    LIBRARY_OUTPUT_DIRECTORY ${dir})
  target_include_directories(${target} PRIVATE ${PROJECT_SOURCE_DIR}/include)
  jexjtag_warnings(${target})
  if(P_DESCRIPTOR)
    add_custom_command(TARGET ${target} POST_BUILD
      COMMAND ${CMAKE_COMMAND} -E copy_if_different ${P_DESCRIPTOR} ${dir}/${P_NAME}.xml)
    if(NOT P_NO_INSTALL)
      install(FILES ${P_DESCRIPTOR} DESTINATION ${JEXJTAG_INSTALL_PLUGINDIR}/${P_COMPANY}/${P_NAME}
              RENAME ${P_NAME}.xml)
    endif()
  endif()
  if(NOT P_NO_INSTALL)
    install(TARGETS ${target} LIBRARY DESTINATION ${JEXJTAG_INSTALL_PLUGINDIR}/${P_COMPANY}/${P_NAME})
  endif()
endfunction()
