# Adds each listed folder that exists and holds a CMakeLists.txt.
function(anvil_add_subdirectories)
  foreach(dir ${ARGN})
    if(EXISTS ${CMAKE_CURRENT_SOURCE_DIR}/${dir}/CMakeLists.txt)
      add_subdirectory(${dir})
    endif()
  endforeach()
endfunction()

# anvil_test(NAME SOURCES a.cpp b.cpp LIBS x y): one gtest executable registered with ctest.
function(anvil_test name)
  cmake_parse_arguments(T "" "" "SOURCES;LIBS" ${ARGN})
  add_executable(${name} ${T_SOURCES})
  target_link_libraries(${name} PRIVATE ${T_LIBS} GTest::gtest GTest::gtest_main GTest::gmock)
  target_compile_definitions(${name} PRIVATE
    ANVIL_TEST_DATA="${PROJECT_SOURCE_DIR}/tests/data"
    ANVIL_BIN_DIR="${CMAKE_BINARY_DIR}/bin"
    ANVIL_LIB_DIR="${CMAKE_BINARY_DIR}/lib")
  # Tests never touch the developer's own user setup.
  gtest_discover_tests(${name} DISCOVERY_MODE PRE_TEST WORKING_DIRECTORY ${CMAKE_BINARY_DIR}
    PROPERTIES ENVIRONMENT "XDG_CONFIG_HOME=${CMAKE_BINARY_DIR}/test-config")
endfunction()
