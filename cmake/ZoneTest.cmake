# zt_add_subsystem(NAME [DEPS targets...])
#   A static library of every .cpp in the calling folder (and its detail/
#   folder), with the project root on the include path; an INTERFACE target
#   while the folder has no sources yet.
function(zt_add_subsystem name)
  cmake_parse_arguments(A "" "" "DEPS" ${ARGN})
  file(GLOB srcs CONFIGURE_DEPENDS ${CMAKE_CURRENT_SOURCE_DIR}/*.cpp
                                   ${CMAKE_CURRENT_SOURCE_DIR}/detail/*.cpp)
  if(srcs)
    add_library(${name} STATIC ${srcs})
    target_include_directories(${name} PUBLIC ${PROJECT_SOURCE_DIR})
    target_link_libraries(${name} PUBLIC ${A_DEPS})
  else()
    add_library(${name} INTERFACE)
    target_include_directories(${name} INTERFACE ${PROJECT_SOURCE_DIR})
    target_link_libraries(${name} INTERFACE ${A_DEPS})
  endif()
endfunction()

# zt_add_test_suite(NAME LIBS libs... [NEEDS CLIPPER|BOOST|GEOS...] [SOURCES files...])
#   One GoogleTest executable; every test in it is registered with CTest.
#   Without SOURCES it takes every *_test.cpp of the calling folder.
#   A suite whose oracle is missing is not built, with a visible message.
function(zt_add_test_suite name)
  cmake_parse_arguments(A "" "" "LIBS;NEEDS;SOURCES" ${ARGN})
  foreach(n ${A_NEEDS})
    if(NOT ZT_HAVE_${n})
      message(WARNING "test suite ${name} SKIPPED: oracle ${n} not installed")
      return()
    endif()
  endforeach()
  if(NOT A_SOURCES)
    file(GLOB A_SOURCES CONFIGURE_DEPENDS ${CMAKE_CURRENT_SOURCE_DIR}/*_test.cpp)
  endif()
  if(NOT A_SOURCES)
    return()
  endif()
  find_package(GTest REQUIRED)
  add_executable(${name} ${A_SOURCES})
  target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR} ${PROJECT_SOURCE_DIR}/tests)
  target_link_libraries(${name} PRIVATE ${A_LIBS} GTest::gtest GTest::gtest_main)
  foreach(n ${A_NEEDS})
    string(TOLOWER ${n} l)
    target_link_libraries(${name} PRIVATE oracle_${l})
  endforeach()
  target_compile_definitions(${name} PRIVATE ZT_TEST_DATA_DIR="${CMAKE_CURRENT_SOURCE_DIR}/data"
                                             ZT_BINARY_DIR="${PROJECT_BINARY_DIR}")
  # Tests may run the built programs as subprocesses: build those first.
  foreach(prog zonetool restzones)
    if(TARGET ${prog})
      add_dependencies(${name} ${prog})
    endif()
  endforeach()
  # Data rows are named tests, listed when the suite is linked: a changed
  # data file relinks the suite, so the list follows the data.
  file(GLOB data LIST_DIRECTORIES false CONFIGURE_DEPENDS ${CMAKE_CURRENT_SOURCE_DIR}/data/*)
  set_property(TARGET ${name} APPEND PROPERTY LINK_DEPENDS ${data})
  include(GoogleTest)
  gtest_discover_tests(${name} DISCOVERY_TIMEOUT 60 PROPERTIES TIMEOUT 600)
endfunction()
