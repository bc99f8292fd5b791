# What `cmake --install` puts under the prefix, every destination relative to it
# so that `cmake --install <build> --prefix <dir>` relocates the whole tree:
#   include/dexmor/...                 the public headers (cmake/DexmorPublicHeaders.cmake)
#                                      and the generated version.hpp
#   lib/libdexmor_core.a               the library
#   lib/cmake/Dexmor/                  find_package(Dexmor CONFIG) with the target Dexmor::core
#   lib/pkgconfig/dexmor.pc            for pkg-config
#   bin/dexmor, share/man/man1/dexmor.1
#   share/dexmor/dexmor-assets.rng     the schema of the wrapped asset document
#   the module Dexmor, its type stub Dexmor.pyi and the stub package Dexmor-stubs
#   (found by type checkers): in the user site when the prefix
#   is the user base (~/.local), else in the interpreter's folder under the prefix
#   (cmake/python_install_dir.py), or in DEXMOR_PYTHON_INSTALL_DIR
include(GNUInstallDirs)
include(CMakePackageConfigHelpers)

set(DEXMOR_INSTALL_CMAKEDIR "${CMAKE_INSTALL_LIBDIR}/cmake/Dexmor" CACHE STRING
    "Where the CMake package files go, relative to the prefix")

# A library built with the sanitizers needs their runtimes in every program that
# links it, so a sanitized build hands its link flags on to its consumers.
set(DEXMOR_CONSUMER_LINK_OPTIONS "")
if(DEXMOR_SANITIZE OR DEXMOR_BUILD_FUZZ)
  set(DEXMOR_CONSUMER_LINK_OPTIONS -fsanitize=address,undefined)
endif()

# ---- the library and its headers ---------------------------------------------
set_target_properties(dexmor_core PROPERTIES EXPORT_NAME core)
# Consumers get <prefix>/include and write #include <dexmor/...>.
target_include_directories(dexmor_core INTERFACE $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
target_link_options(dexmor_core INTERFACE $<INSTALL_INTERFACE:${DEXMOR_CONSUMER_LINK_OPTIONS}>)
install(TARGETS dexmor_core EXPORT DexmorTargets
        ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT Development)
foreach(header IN LISTS DEXMOR_PUBLIC_HEADERS)
  get_filename_component(folder "${header}" DIRECTORY)
  install(FILES ${PROJECT_SOURCE_DIR}/include/dexmor/${header}
          DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/dexmor/${folder} COMPONENT Development)
endforeach()
install(FILES ${PROJECT_BINARY_DIR}/include/dexmor/version.hpp
        DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/dexmor COMPONENT Development)

# ---- CMake package -------------------------------------------------------------
install(EXPORT DexmorTargets NAMESPACE Dexmor:: DESTINATION ${DEXMOR_INSTALL_CMAKEDIR}
        COMPONENT Development)
configure_package_config_file(${CMAKE_CURRENT_LIST_DIR}/DexmorConfig.cmake.in
                              ${PROJECT_BINARY_DIR}/package/DexmorConfig.cmake
                              INSTALL_DESTINATION ${DEXMOR_INSTALL_CMAKEDIR})
# Before 1.0 a new minor version may change the interface.
write_basic_package_version_file(${PROJECT_BINARY_DIR}/package/DexmorConfigVersion.cmake
                                 COMPATIBILITY SameMinorVersion)
install(FILES ${PROJECT_BINARY_DIR}/package/DexmorConfig.cmake
              ${PROJECT_BINARY_DIR}/package/DexmorConfigVersion.cmake
        DESTINATION ${DEXMOR_INSTALL_CMAKEDIR} COMPONENT Development)

# ---- pkg-config ----------------------------------------------------------------
# The prefix is found from the file's own place, so the tree can be moved.
file(RELATIVE_PATH DEXMOR_PC_TO_PREFIX "/prefix/${CMAKE_INSTALL_LIBDIR}/pkgconfig" "/prefix")
string(REGEX REPLACE "/$" "" DEXMOR_PC_TO_PREFIX "${DEXMOR_PC_TO_PREFIX}")
list(JOIN DEXMOR_CONSUMER_LINK_OPTIONS " " DEXMOR_PC_LINK_OPTIONS)
configure_file(${CMAKE_CURRENT_LIST_DIR}/dexmor.pc.in ${PROJECT_BINARY_DIR}/package/dexmor.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/package/dexmor.pc
        DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT Development)

# ---- the tool and its manual page --------------------------------------------------
install(TARGETS dexmor RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT Runtime)
install(FILES ${PROJECT_BINARY_DIR}/docs/dexmor.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT Runtime)
install(FILES ${PROJECT_SOURCE_DIR}/schema/dexmor-assets.rng DESTINATION ${CMAKE_INSTALL_DATADIR}/dexmor
        COMPONENT Runtime)
install(FILES ${PROJECT_SOURCE_DIR}/LICENSE ${PROJECT_SOURCE_DIR}/CHANGELOG.md ${PROJECT_SOURCE_DIR}/README.md
        DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT Runtime)

# ---- the Python module --------------------------------------------------------------
if(TARGET Dexmor)
  # Where the module goes depends on the prefix given at install time (see
  # python_install_dir.py: the user site for the user base, else the
  # interpreter's directory under the prefix), so it is found then, unless
  # DEXMOR_PYTHON_INSTALL_DIR names a folder.
  get_directory_property(python DIRECTORY ${PROJECT_SOURCE_DIR}/module DEFINITION Python3_EXECUTABLE)
  set(DEXMOR_PYTHON_INSTALL_DIR "" CACHE STRING
      "Where the Python module goes: relative to the install prefix, or absolute; empty: chosen for the prefix at install time")
  if(DEXMOR_PYTHON_INSTALL_DIR)
    install(TARGETS Dexmor LIBRARY DESTINATION ${DEXMOR_PYTHON_INSTALL_DIR} COMPONENT Python)
    install(FILES ${PROJECT_SOURCE_DIR}/module/Dexmor.pyi DESTINATION ${DEXMOR_PYTHON_INSTALL_DIR} COMPONENT Python)
    install(FILES ${PROJECT_SOURCE_DIR}/module/Dexmor.pyi DESTINATION ${DEXMOR_PYTHON_INSTALL_DIR}/Dexmor-stubs
            RENAME __init__.pyi COMPONENT Python)
  else()
    install(CODE "
      execute_process(COMMAND \"${python}\" \"${CMAKE_CURRENT_LIST_DIR}/python_install_dir.py\" \"\${CMAKE_INSTALL_PREFIX}\"
                      OUTPUT_VARIABLE dexmor_python_dir RESULT_VARIABLE failed)
      if(failed OR NOT dexmor_python_dir)
        message(FATAL_ERROR \"cannot tell where ${python} looks for modules under \${CMAKE_INSTALL_PREFIX}\")
      endif()
      file(INSTALL DESTINATION \"\${dexmor_python_dir}\" TYPE MODULE FILES \"$<TARGET_FILE:Dexmor>\")
      file(INSTALL DESTINATION \"\${dexmor_python_dir}\" TYPE FILE FILES \"${PROJECT_SOURCE_DIR}/module/Dexmor.pyi\")
      file(INSTALL DESTINATION \"\${dexmor_python_dir}/Dexmor-stubs\" TYPE FILE
           FILES \"${PROJECT_BINARY_DIR}/python/Dexmor-stubs/__init__.pyi\")
    " COMPONENT Python)
  endif()
  # Beside the built module too, for editors pointed at <build>/python, and as the
  # stub package that type checkers look for (a stub beside an extension they skip).
  configure_file(${PROJECT_SOURCE_DIR}/module/Dexmor.pyi ${PROJECT_BINARY_DIR}/python/Dexmor.pyi COPYONLY)
  configure_file(${PROJECT_SOURCE_DIR}/module/Dexmor.pyi ${PROJECT_BINARY_DIR}/python/Dexmor-stubs/__init__.pyi COPYONLY)
endif()
