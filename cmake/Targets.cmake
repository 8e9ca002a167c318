# One static library per folder, from all its sources and those of its ROOMS. LINKS are the folders and libraries it
# may use: only their headers and symbols reach it, so a dependency that is not declared does not build.
#   tvr_library(<name> [ROOMS folder...] [LINKS target...])
function(tvr_library name)
  cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "ROOMS;LINKS")
  set(patterns ${CMAKE_CURRENT_SOURCE_DIR}/*.cpp)
  foreach(room IN LISTS arg_ROOMS)
    list(APPEND patterns ${CMAKE_CURRENT_SOURCE_DIR}/${room}/*.cpp)
  endforeach()
  file(GLOB sources CONFIGURE_DEPENDS ${patterns})
  add_library(${name} STATIC ${sources})
  target_include_directories(${name} PUBLIC ${PROJECT_SOURCE_DIR})
  target_link_libraries(${name} PUBLIC ${arg_LINKS})
endfunction()

# A GoogleTest program of all sources below a folder, registered with ctest case by case.
#   tvr_test(<name> FOLDER <dir> [LINKS target...] [LABELS label...] [ENVIRONMENT var=value...] [PROPERTIES ...])
function(tvr_test name)
  cmake_parse_arguments(PARSE_ARGV 1 arg "" "FOLDER" "LINKS;LABELS;ENVIRONMENT;DEPENDS;PROPERTIES")
  file(GLOB sources CONFIGURE_DEPENDS ${CMAKE_CURRENT_SOURCE_DIR}/${arg_FOLDER}/*.cpp)
  add_executable(${name} ${sources})
  target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR})
  target_link_libraries(${name} PRIVATE ${arg_LINKS} GTest::gmock_main)
  # Compiling the test libraries' templates takes far longer than running what comes of them.
  target_compile_options(${name} PRIVATE -O0 -g1)
  if(arg_DEPENDS)
    add_dependencies(${name} ${arg_DEPENDS})
  endif()
  gtest_discover_tests(${name} TEST_PREFIX "${name}." DISCOVERY_TIMEOUT 60
    PROPERTIES LABELS "${arg_LABELS}" ENVIRONMENT "${arg_ENVIRONMENT}" TIMEOUT 300 ${arg_PROPERTIES})
endfunction()
