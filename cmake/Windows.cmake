# The Windows build (cross-compiled with MinGW-w64, see cmake/mingw-w64.cmake): a pinforge.exe
# that needs no MinGW DLLs, its script shell runscr.cmd beside it, GoogleTest built from source
# with the same compiler, and the test binaries that can run on Windows.

enable_language(RC)
add_compile_definitions(WIN32_LEAN_AND_MEAN NOMINMAX _WIN32_WINNT=0x0601)
# libgcc, libstdc++ and winpthread go into each executable; only system DLLs remain.
add_link_options(-static)
target_link_options(pinforge PRIVATE -static)

# The Windows entry point hands the UTF-16 command line on as UTF-8 and makes output binary;
# the manifest makes the C library's narrow file names UTF-8 as well.
set_property(TARGET pinforge PROPERTY SOURCES
  ${CMAKE_SOURCE_DIR}/src/main-win32.cpp ${CMAKE_SOURCE_DIR}/tools/windows/pinforge.rc)
target_link_libraries(pinforge PRIVATE shell32)
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
# Tests that start programs the POSIX way run on the build machine instead, against
# pinforge.exe under Wine (tools/test-windows.sh); tests/windows covers the Windows twins.
set(PINFORGE_TEST_EXCLUDE
  "/tests/(cli|flow_run|flow_tcl|golden)_test\\.cpp$"
  "/hostkit/(file|process)_test\\.cpp$"
  "/(yosys|ghdl)_differential_test\\.cpp$")

# The Verilog reader builds the extractor's ports; the Linux tests happen to pull the extractor
# in through other test files, the Windows set of tests does not.
target_link_libraries(pinforge_scan_verilog PUBLIC pinforge_scan)

# The stand-in script shell for the Tcl path under Wine: it checks and keeps the driver script.
add_executable(runscr_standin ${CMAKE_SOURCE_DIR}/tests/windows/standin/runscr_standin.cpp)
set_target_properties(runscr_standin PROPERTIES OUTPUT_NAME runscr
                      RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/standin)

# Tests of the Windows twins themselves.
pinforge_test(test_windows tests/windows pinforge_hostkit pinforge_scan_common)
target_link_libraries(test_windows PRIVATE shell32)
