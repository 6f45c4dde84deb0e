# The umbrella target `belvane` and the installed CMake package, so a host
# project can write find_package(Belvane) and link Belvane::belvane.
include(CMakePackageConfigHelpers)

get_property(_layers GLOBAL PROPERTY BELVANE_LAYERS)
list(REMOVE_ITEM _layers belvane_qt)
# The target is belvane_component (the command-line tool owns the name
# `belvane`); it is exported as Belvane::belvane.
add_library(belvane_component INTERFACE)
set_target_properties(belvane_component PROPERTIES EXPORT_NAME belvane)
target_link_libraries(belvane_component INTERFACE ${_layers})
target_include_directories(belvane_component INTERFACE
  $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>
  $<INSTALL_INTERFACE:include>)
add_library(Belvane::belvane ALIAS belvane_component)

install(TARGETS belvane_component belvane_warnings EXPORT BelvaneTargets)
install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/belvane DESTINATION include)
install(EXPORT BelvaneTargets NAMESPACE Belvane:: DESTINATION lib/cmake/Belvane)
configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/BelvaneConfig.cmake.in
  ${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfig.cmake INSTALL_DESTINATION lib/cmake/Belvane)
write_basic_package_version_file(${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfigVersion.cmake
  VERSION ${PROJECT_VERSION} COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfig.cmake
  ${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfigVersion.cmake DESTINATION lib/cmake/Belvane)
