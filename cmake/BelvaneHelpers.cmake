# belvane_layer(<name> SOURCES ... DEPENDS ...)
# One layer: its objects are compiled once (belvane_<name>_objects) and make
# both the static library the build links (belvane_<name>, linking only the
# layers below it) and, for the headless layers, the shared library a host
# links (Belvane::belvane, see BelvanePackage.cmake).
function(belvane_layer name)
  cmake_parse_arguments(L "" "" "SOURCES;DEPENDS;PRIVATE_DEPENDS" ${ARGN})
  add_library(belvane_${name}_objects OBJECT ${L_SOURCES})
  target_include_directories(belvane_${name}_objects PUBLIC ${PROJECT_SOURCE_DIR}/src)
  target_link_libraries(belvane_${name}_objects PUBLIC ${L_DEPENDS}
                        PRIVATE belvane_warnings ${L_PRIVATE_DEPENDS})
  add_library(belvane_${name} STATIC $<TARGET_OBJECTS:belvane_${name}_objects>)
  target_include_directories(belvane_${name} PUBLIC ${PROJECT_SOURCE_DIR}/src)
  target_link_libraries(belvane_${name} PUBLIC ${L_DEPENDS} PRIVATE ${L_PRIVATE_DEPENDS})
  set_property(GLOBAL APPEND PROPERTY BELVANE_LAYERS belvane_${name})
endfunction()

# belvane_test(<name> SOURCES ... DEPENDS ...)
# One GoogleTest executable; each test case becomes a ctest test.
function(belvane_test name)
  cmake_parse_arguments(T "" "" "SOURCES;DEPENDS;PROPERTIES" ${ARGN})
  add_executable(${name} ${T_SOURCES})
  target_link_libraries(${name} PRIVATE ${T_DEPENDS} GTest::gtest GTest::gtest_main GTest::gmock
                        belvane_warnings)
  target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR}/tests)
  include(GoogleTest)
  gtest_discover_tests(${name} DISCOVERY_MODE PRE_TEST PROPERTIES ${T_PROPERTIES})
endfunction()
