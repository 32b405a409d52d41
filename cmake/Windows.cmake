# The Windows build (cross-compiled with MinGW-w64, see cmake/mingw-w64.cmake): a pinforge.exe
# that needs no MinGW DLLs, its script shell runscr.cmd beside it, GoogleTest built from source
# with the same compiler, and the test binaries that can run on Windows.

enable_language(RC)
add_compile_definitions(WIN32_LEAN_AND_MEAN NOMINMAX _WIN32_WINNT=0x0601)
# libgcc, libstdc++ and winpthread go into each executable; only system DLLs remain.
add_link_options(-static)
target_link_options(pinforge PRIVATE -static)

# The manifest makes the narrow names of the C library and the system UTF-8 as well, where
# Windows supports it (version 1903 on).
set_property(TARGET pinforge PROPERTY SOURCES
  ${CMAKE_SOURCE_DIR}/src/main.cpp ${CMAKE_SOURCE_DIR}/lib/hostkit/fopen-win32.cpp
  ${CMAKE_SOURCE_DIR}/tools/windows/pinforge.rc)
# The start-up code reads the UTF-16 command line (CommandLineToArgvW).
target_link_libraries(pinforge_hostkit PUBLIC shell32)
# Every fopen of the program takes UTF-8 names (lib/hostkit/fopen-win32.cpp).
target_link_options(pinforge PRIVATE -Wl,--wrap=fopen)
set_source_files_properties(${CMAKE_SOURCE_DIR}/lib/hostkit/fopen-win32.cpp PROPERTIES
                            INCLUDE_DIRECTORIES ${CMAKE_SOURCE_DIR}/lib)
# A release executable carries no symbols: a third of the size.
target_link_options(pinforge PRIVATE $<$<CONFIG:Release>:-s>)
add_custom_command(TARGET pinforge POST_BUILD
  COMMAND ${CMAKE_COMMAND} -E copy ${CMAKE_SOURCE_DIR}/tools/runscr.cmd
          $<TARGET_FILE_DIR:pinforge>/runscr.cmd)
install(PROGRAMS tools/runscr.cmd DESTINATION bin)

# GoogleTest from Debian's source package (googletest), built by this compiler: the packaged
# libraries are for the build machine.
set(PINFORGE_GTEST_SOURCE /usr/src/googletest/googletest CACHE PATH "GoogleTest source folder")
foreach(part gtest gtest_main)
  if(part STREQUAL gtest)
    add_library(${part} STATIC ${PINFORGE_GTEST_SOURCE}/src/gtest-all.cc)
  else()
    add_library(${part} STATIC ${PINFORGE_GTEST_SOURCE}/src/gtest_main.cc)
    target_link_libraries(${part} PUBLIC gtest)
  endif()
  target_include_directories(${part} SYSTEM PUBLIC ${PINFORGE_GTEST_SOURCE}/include
                             PRIVATE ${PINFORGE_GTEST_SOURCE})
  # Third-party code: its warnings are not ours to fix.
  target_compile_options(${part} PRIVATE -w)
  add_library(GTest::${part} ALIAS ${part})
endforeach()
# find_package(GTest) then finds these targets instead of the build machine's libraries.
file(WRITE ${CMAKE_BINARY_DIR}/gtest-config/GTestConfig.cmake
     "# GTest::gtest and GTest::gtest_main are built by cmake/Windows.cmake.\n")
set(GTest_DIR ${CMAKE_BINARY_DIR}/gtest-config CACHE PATH "" FORCE)

# The test binaries below this point get the few POSIX calls the platform-neutral tests make.
add_compile_options(-include ${CMAKE_SOURCE_DIR}/tests/windows/posix_shim.h)
# Test files that start programs, shell scripts, FIFOs or symlinks the POSIX way are left out; the
# tests that run the program are run on the build machine against pinforge.exe under Wine
# instead (tools/test-windows.sh), and tests/windows covers the Windows twins.
set(PINFORGE_TEST_SKIP_IF "support/(process|diff_tools)\\.h|::mkfifo|::symlink|/bin/sh")

# The stand-in script shell for the Tcl path under Wine: it checks and keeps the driver script.
add_executable(runscr_standin ${CMAKE_SOURCE_DIR}/tests/windows/standin/runscr_standin.cpp)
set_target_properties(runscr_standin PROPERTIES OUTPUT_NAME runscr
                      RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/standin)

# Tests of the Windows twins themselves.
pinforge_test(test_windows tests/windows pinforge_hostkit pinforge_scan_common)
