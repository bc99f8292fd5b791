# Installs a build into a fresh prefix and uses it as its users would:
#   1. cmake --install BUILD_DIR --prefix WORK_DIR/prefix;
#   2. the installed dexmor converts SAMPLE (the reference for what follows), and
#      its wrapped form is valid against the installed schema (with xmllint);
#   3. a CMake project finds the package with find_package(Dexmor) and links Dexmor::core;
#   4. the same program is compiled with nothing but the flags pkg-config gives;
#   5. the module imports from the installed site-packages directory;
#   6. installed with --prefix ~/.local (HOME pointed at a fresh folder), the module
#      imports from the user site with no path set.
# Each program's document must equal the installed tool's, byte for byte.
#
# Variables: BUILD_DIR, WORK_DIR, SOURCE_DIR, SAMPLE, CXX, GENERATOR, MAKE_PROGRAM,
# VERSION, LIBDIR (relative to the prefix), and optionally PKG_CONFIG, PYTHON with
# PYTHON_DIR, SANITIZER_RUNTIME.
cmake_minimum_required(VERSION 3.25)

# Runs a command; stops the test with its output when it fails.
function(run)
  execute_process(COMMAND ${ARGN} RESULT_VARIABLE status OUTPUT_VARIABLE out ERROR_VARIABLE err)
  if(NOT status EQUAL 0)
    string(REPLACE ";" " " shown "${ARGN}")
    message(FATAL_ERROR "failed (${status}): ${shown}\n${out}\n${err}")
  endif()
  set(run_output "${out}" PARENT_SCOPE)
endfunction()

# Runs a converting program and checks that it writes the reference document.
function(expect_reference what)
  execute_process(COMMAND ${ARGN} RESULT_VARIABLE status OUTPUT_FILE ${WORK_DIR}/${what}.xml ERROR_VARIABLE err)
  if(NOT status EQUAL 0)
    message(FATAL_ERROR "${what} failed (${status}):\n${err}")
  endif()
  execute_process(COMMAND ${CMAKE_COMMAND} -E compare_files ${WORK_DIR}/reference.xml ${WORK_DIR}/${what}.xml
                  RESULT_VARIABLE differs)
  if(differs)
    message(FATAL_ERROR "${what} wrote another document than the installed dexmor (see ${WORK_DIR})")
  endif()
  message(STATUS "${what}: same document as the installed dexmor")
endfunction()

set(prefix ${WORK_DIR}/prefix)
file(REMOVE_RECURSE ${WORK_DIR})
file(MAKE_DIRECTORY ${WORK_DIR})

# 1. Install.
run(${CMAKE_COMMAND} --install ${BUILD_DIR} --prefix ${prefix})
foreach(file include/dexmor/dexmor.hpp include/dexmor/version.hpp include/dexmor/files/ZelMatFile.hpp
             share/man/man1/dexmor.1 share/dexmor/dexmor-assets.rng)
  if(NOT EXISTS ${prefix}/${file})
    message(FATAL_ERROR "not installed: ${file}")
  endif()
endforeach()
# Internal helpers stay private.
foreach(file include/dexmor/platform/FileIo.hpp include/dexmor/platform/HugePages.hpp
             include/dexmor/xml/NumberFormat.hpp include/dexmor/options/RecordEncodings.hpp)
  if(EXISTS ${prefix}/${file})
    message(FATAL_ERROR "a private header was installed: ${file}")
  endif()
endforeach()
# One version everywhere: the CMake package says the project's version too.
file(READ ${prefix}/${LIBDIR}/cmake/Dexmor/DexmorConfigVersion.cmake package_version)
if(NOT package_version MATCHES "set\\(PACKAGE_VERSION \"${VERSION}\"\\)")
  message(FATAL_ERROR "the CMake package does not say version ${VERSION}")
endif()
file(READ ${prefix}/share/man/man1/dexmor.1 manual LIMIT 200)
if(NOT manual MATCHES "Dexmor ${VERSION}")
  message(FATAL_ERROR "the manual page does not name version ${VERSION}")
endif()

# 2. The installed tool gives the reference document.
execute_process(COMMAND ${prefix}/bin/dexmor xml ${SAMPLE} RESULT_VARIABLE status
                OUTPUT_FILE ${WORK_DIR}/reference.xml ERROR_VARIABLE err)
file(READ ${WORK_DIR}/reference.xml head LIMIT 9)
if(NOT status EQUAL 0 OR NOT head STREQUAL "<Assets>\n")
  message(FATAL_ERROR "the installed dexmor did not convert ${SAMPLE} (${status}):\n${err}")
endif()
# Its wrapped form is valid against the installed schema.
find_program(XMLLINT xmllint)
if(XMLLINT)
  run(${prefix}/bin/dexmor xml --wrap -o ${WORK_DIR}/wrapped ${SAMPLE})
  get_filename_component(sample_name ${SAMPLE} NAME)
  run(${XMLLINT} --noout --relaxng ${prefix}/share/dexmor/dexmor-assets.rng ${WORK_DIR}/wrapped/${sample_name}.xml)
endif()

# 3. find_package.
run(${CMAKE_COMMAND} -S ${SOURCE_DIR}/consumer -B ${WORK_DIR}/consumer -G ${GENERATOR}
    -DCMAKE_MAKE_PROGRAM=${MAKE_PROGRAM} -DCMAKE_CXX_COMPILER=${CXX} -DCMAKE_BUILD_TYPE=Debug
    -DCMAKE_PREFIX_PATH=${prefix} -DCMAKE_FIND_USE_PACKAGE_REGISTRY=OFF)
string(FIND "${run_output}" "Dexmor package: ${prefix}/" found)
if(found EQUAL -1)
  message(FATAL_ERROR "find_package(Dexmor) took a package from outside ${prefix}:\n${run_output}")
endif()
run(${CMAKE_COMMAND} --build ${WORK_DIR}/consumer)
expect_reference(find_package-consumer ${WORK_DIR}/consumer/consumer ${SAMPLE})

# 4. pkg-config.
if(PKG_CONFIG)
  set(ENV{PKG_CONFIG_PATH} ${prefix}/${LIBDIR}/pkgconfig)
  run(${PKG_CONFIG} --modversion dexmor)
  string(STRIP "${run_output}" version)
  if(NOT version STREQUAL VERSION)
    message(FATAL_ERROR "pkg-config gives version '${version}', not ${VERSION}")
  endif()
  run(${PKG_CONFIG} --cflags --libs dexmor)
  separate_arguments(flags UNIX_COMMAND "${run_output}")
  run(${CXX} -std=c++20 ${SOURCE_DIR}/consumer/main.cpp ${flags} -o ${WORK_DIR}/pkg-config-consumer)
  expect_reference(pkg-config-consumer ${WORK_DIR}/pkg-config-consumer ${SAMPLE})
else()
  message(STATUS "pkg-config not found: the pkg-config consumer is not built")
endif()

# 5. The module from site-packages, with its stub beside it.
if(PYTHON)
  set(python_env PYTHONDONTWRITEBYTECODE=1)
  if(SANITIZER_RUNTIME)
    # The interpreter is not instrumented: the runtimes must be loaded first.
    list(APPEND python_env LD_PRELOAD=${SANITIZER_RUNTIME} ASAN_OPTIONS=detect_leaks=0)
  endif()
  set(check_module [=[
import os, sys, Dexmor
site = os.path.realpath(sys.argv[1])
assert os.path.dirname(os.path.realpath(Dexmor.__file__)) == site, Dexmor.__file__
assert os.path.isfile(os.path.join(site, "Dexmor.pyi")), "no Dexmor.pyi beside the module"
assert os.path.isfile(os.path.join(site, "Dexmor-stubs", "__init__.pyi")), "no stub package Dexmor-stubs"
sys.stdout.buffer.write(Dexmor.getZelmatXml(sys.argv[2]).encode("utf-8"))
]=])
  if(PYTHON_DIR)
    set(site ${prefix}/${PYTHON_DIR})
  else()
    run(${PYTHON} ${SOURCE_DIR}/../../cmake/python_install_dir.py ${prefix})
    set(site ${run_output})
  endif()
  expect_reference(installed-module ${CMAKE_COMMAND} -E env ${python_env} PYTHONPATH=${site}
                   ${PYTHON} -s -c ${check_module} ${site} ${SAMPLE})

  # 6. Installed into the user base (~/.local), the module imports with no path set.
  if(NOT PYTHON_DIR)
    set(home ${WORK_DIR}/home)
    file(MAKE_DIRECTORY ${home})
    run(${CMAKE_COMMAND} -E env HOME=${home} --unset=PYTHONUSERBASE
        ${CMAKE_COMMAND} --install ${BUILD_DIR} --prefix ${home}/.local --component Python)
    run(${CMAKE_COMMAND} -E env HOME=${home} --unset=PYTHONUSERBASE ${PYTHON} -m site --user-site)
    string(STRIP "${run_output}" user_site)
    if(NOT user_site MATCHES "^${home}/")
      message(FATAL_ERROR "the user site ${user_site} is not under HOME=${home}")
    endif()
    expect_reference(user-site-module ${CMAKE_COMMAND} -E env HOME=${home} --unset=PYTHONUSERBASE
                     --unset=PYTHONPATH --unset=PYTHONNOUSERSITE ${python_env}
                     ${PYTHON} -c ${check_module} ${user_site} ${SAMPLE})
  endif()
endif()
