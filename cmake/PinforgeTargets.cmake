# Helpers that turn a source directory into a library or a test binary.
# Sources are globbed per directory (not recursively) so each subsystem owns its folder.

set(PINFORGE_TEST_ENV
  "PINFORGE_BIN=$<TARGET_FILE:pinforge>"
  "PINFORGE_SOURCE_DIR=${CMAKE_SOURCE_DIR}")

function(pinforge_library name dir)
  file(GLOB sources CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/${dir}/*.cpp)
  # Each host-specific file has a twin for the other system; only this host's twin is built.
  if(WIN32)
    list(FILTER sources EXCLUDE REGEX "-posix\\.cpp$")
  else()
    list(FILTER sources EXCLUDE REGEX "-win32\\.cpp$")
  endif()
  # main.cpp belongs to the executable; the fopen wrapper is linked into it by name
  # (cmake/Windows.cmake).
  list(FILTER sources EXCLUDE REGEX "/src/main\\.cpp$|/fopen-win32\\.cpp$")
  if(sources)
    add_library(${name} STATIC ${sources})
    target_include_directories(${name} PUBLIC ${CMAKE_SOURCE_DIR}/src)
    if(dir MATCHES "^lib/")
      target_include_directories(${name} PRIVATE ${CMAKE_SOURCE_DIR}/lib)
    endif()
    target_link_libraries(${name} PUBLIC ${ARGN})
  else()
    add_library(${name} INTERFACE)
    target_include_directories(${name} INTERFACE ${CMAKE_SOURCE_DIR}/src)
    target_link_libraries(${name} INTERFACE ${ARGN})
  endif()
endfunction()

function(pinforge_test name dir)
  file(GLOB sources CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/${dir}/*.cpp)
  # A host may leave out test files that use what it lacks: those with a line matching
  # PINFORGE_TEST_SKIP_IF (cmake/Windows.cmake says what and why).
  if(PINFORGE_TEST_SKIP_IF)
    foreach(source IN LISTS sources)
      file(STRINGS ${source} uses REGEX "${PINFORGE_TEST_SKIP_IF}")
      if(uses)
        list(REMOVE_ITEM sources ${source})
      endif()
    endforeach()
  endif()
  if(NOT sources)
    return()
  endif()
  add_executable(${name} ${sources})
  target_include_directories(${name} PRIVATE ${CMAKE_SOURCE_DIR}/src ${CMAKE_SOURCE_DIR}/lib
                             ${CMAKE_SOURCE_DIR}/tests)
  target_link_libraries(${name} PRIVATE ${ARGN} GTest::gtest GTest::gtest_main)
  add_dependencies(${name} pinforge)
  add_test(NAME ${name} COMMAND ${name} --gtest_brief=1
           WORKING_DIRECTORY ${CMAKE_BINARY_DIR})
  set_tests_properties(${name} PROPERTIES ENVIRONMENT "${PINFORGE_TEST_ENV}")
endfunction()
