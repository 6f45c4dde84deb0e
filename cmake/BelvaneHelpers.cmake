# belvane_layer(<name> SOURCES ... DEPENDS ...)
# One static library per layer. A layer links only the layers it may use, so
# an include of a higher layer fails to build: the dependency rule is enforced
# by the build rather than by review.
function(belvane_layer name)
  cmake_parse_arguments(L "" "" "SOURCES;DEPENDS;PRIVATE_DEPENDS" ${ARGN})
  add_library(belvane_${name} STATIC ${L_SOURCES})
  target_include_directories(belvane_${name} PUBLIC
    $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/src>
    $<INSTALL_INTERFACE:include/belvane/internal>)
  target_link_libraries(belvane_${name} PUBLIC ${L_DEPENDS}
                        PRIVATE $<BUILD_INTERFACE:belvane_warnings> ${L_PRIVATE_DEPENDS})
  set_property(GLOBAL APPEND PROPERTY BELVANE_LAYERS belvane_${name})
  install(TARGETS belvane_${name} EXPORT BelvaneTargets ARCHIVE DESTINATION lib)
  install(DIRECTORY ${CMAKE_CURRENT_SOURCE_DIR}/ DESTINATION include/belvane/internal/${name}
          FILES_MATCHING PATTERN "*.hpp" PATTERN "tools" EXCLUDE)
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
