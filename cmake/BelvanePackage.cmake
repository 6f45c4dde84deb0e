# The umbrella target `belvane` and the installed CMake package, so a host
# project can write find_package(Belvane) and link Belvane::belvane.
#
# The umbrella holds the component's layers only; the maintainer's tools
# (belvane_catalogue_tools, the command-line tool) are not installed. The
# package config finds what the exported layers link: the list is taken from
# the layers themselves, so a layer that links a new package cannot be
# installed without the config finding it too.
include(CMakePackageConfigHelpers)

get_property(_layers GLOBAL PROPERTY BELVANE_LAYERS)
list(REMOVE_ITEM _layers belvane_qt)
# The target is belvane_component (the command-line tool owns the name
# `belvane`); it is exported as Belvane::belvane.
add_library(belvane_component INTERFACE)
set_target_properties(belvane_component PROPERTIES EXPORT_NAME belvane)
target_link_libraries(belvane_component INTERFACE ${_layers})
target_compile_features(belvane_component INTERFACE cxx_std_20)
target_include_directories(belvane_component INTERFACE
  $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>
  $<INSTALL_INTERFACE:include>)
add_library(Belvane::belvane ALIAS belvane_component)

# The packages behind the imported targets that the exported layers link
# (PUBLIC, or PRIVATE of a static library, which a host links too).
set(_exported ${_layers})
if(TARGET belvane_qt)
  list(APPEND _exported belvane_qt)
endif()
set(_imported "")
foreach(target IN LISTS _exported)
  get_target_property(_links ${target} INTERFACE_LINK_LIBRARIES)
  if(_links)
    string(REGEX MATCHALL "[A-Za-z0-9_]+::[A-Za-z0-9_]+" _found "${_links}")
    list(APPEND _imported ${_found})
  endif()
endforeach()
list(REMOVE_DUPLICATES _imported)
set(BELVANE_FIND_DEPENDENCIES "")
set(_qt_components "")
foreach(imported IN LISTS _imported)
  if(imported STREQUAL "SQLite::SQLite3")
    string(APPEND BELVANE_FIND_DEPENDENCIES "find_dependency(SQLite3)\n")
  elseif(imported STREQUAL "PostgreSQL::PostgreSQL")
    string(APPEND BELVANE_FIND_DEPENDENCIES "find_dependency(PostgreSQL)\n")
  elseif(imported MATCHES "^Qt6::(.+)$")
    list(APPEND _qt_components ${CMAKE_MATCH_1})
  elseif(imported MATCHES "^(fmt|CLI11|nlohmann_json)::")
    string(APPEND BELVANE_FIND_DEPENDENCIES "find_dependency(${CMAKE_MATCH_1} CONFIG)\n")
  elseif(NOT imported MATCHES "^Belvane::")
    message(FATAL_ERROR "An installed layer links ${imported}: BelvanePackage.cmake needs to "
                        "know the package that gives it.")
  endif()
endforeach()
if(_qt_components)
  list(JOIN _qt_components " " _qt_components)
  string(APPEND BELVANE_FIND_DEPENDENCIES "find_dependency(Qt6 COMPONENTS ${_qt_components})\n")
endif()

install(TARGETS belvane_component EXPORT BelvaneTargets)
install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/belvane DESTINATION include)
install(EXPORT BelvaneTargets NAMESPACE Belvane:: DESTINATION lib/cmake/Belvane)
configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/BelvaneConfig.cmake.in
  ${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfig.cmake INSTALL_DESTINATION lib/cmake/Belvane)
write_basic_package_version_file(${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfigVersion.cmake
  VERSION ${PROJECT_VERSION} COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfig.cmake
  ${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfigVersion.cmake DESTINATION lib/cmake/Belvane)
