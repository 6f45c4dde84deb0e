# The installed package: find_package(Belvane) gives Belvane::belvane, one
# shared library holding the headless component (the editors, CForms, the
# headless runtime, the record sets, the catalogue service and the cipher).
# It links SQLite and libpq itself, so a headless host needs neither their
# development packages nor Qt. find_package(Belvane COMPONENTS Qt) adds
# Belvane::belvane_qt, the Qt desktop runtime, which needs Qt 6.
# Headers install under <prefix>/include/belvane/ and are included as
# <belvane/...>. The command-line tool and the demo host install to bin/.
include(CMakePackageConfigHelpers)

get_property(_layers GLOBAL PROPERTY BELVANE_LAYERS)
list(REMOVE_ITEM _layers belvane_qt)
set(_objects "")
foreach(layer IN LISTS _layers)
  list(APPEND _objects $<TARGET_OBJECTS:${layer}_objects>)
endforeach()

# The target is belvane_component (the command-line tool owns the name
# `belvane`); it is exported as Belvane::belvane.
add_library(belvane_component SHARED ${_objects})
set_target_properties(belvane_component PROPERTIES EXPORT_NAME belvane OUTPUT_NAME belvane
                      VERSION ${PROJECT_VERSION} SOVERSION ${PROJECT_VERSION_MAJOR})
foreach(layer IN LISTS _layers)
  # What the layers link from outside the project (SQLite, libpq), privately.
  get_target_property(_links ${layer} INTERFACE_LINK_LIBRARIES)
  foreach(link IN LISTS _links)
    if(link MATCHES "::")
      target_link_libraries(belvane_component PRIVATE ${link})
    endif()
  endforeach()
endforeach()
target_compile_features(belvane_component INTERFACE cxx_std_20)
target_include_directories(belvane_component INTERFACE
  $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/src> $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>
  $<INSTALL_INTERFACE:include>)
add_library(Belvane::belvane ALIAS belvane_component)
install(TARGETS belvane_component EXPORT BelvaneTargets LIBRARY DESTINATION lib)
install(EXPORT BelvaneTargets NAMESPACE Belvane:: DESTINATION lib/cmake/Belvane)

set(_with_qt OFF)
if(TARGET belvane_qt)
  set(_with_qt ON)
  find_package(Qt6 REQUIRED COMPONENTS Widgets WebEngineWidgets WebChannel)
  add_library(belvane_qt_component SHARED $<TARGET_OBJECTS:belvane_qt_objects>)
  set_target_properties(belvane_qt_component PROPERTIES EXPORT_NAME belvane_qt
                        OUTPUT_NAME belvane_qt VERSION ${PROJECT_VERSION}
                        SOVERSION ${PROJECT_VERSION_MAJOR})
  target_link_libraries(belvane_qt_component PUBLIC belvane_component Qt6::Widgets
                        Qt6::WebEngineWidgets)
  get_target_property(_qt_links belvane_qt INTERFACE_LINK_LIBRARIES)
  foreach(link IN LISTS _qt_links)
    if(link MATCHES "^Qt6::")
      target_link_libraries(belvane_qt_component PUBLIC ${link})
    endif()
  endforeach()
  install(TARGETS belvane_qt_component EXPORT BelvaneQtTargets LIBRARY DESTINATION lib)
  install(EXPORT BelvaneQtTargets NAMESPACE Belvane:: DESTINATION lib/cmake/Belvane)
endif()

install(CODE "execute_process(COMMAND \"${CMAKE_COMMAND}\"
  -DSOURCE_DIR=${PROJECT_SOURCE_DIR}/src
  -DPUBLIC_HEADER=${PROJECT_SOURCE_DIR}/include/belvane/belvane.hpp
  -DDESTINATION=\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/include/belvane
  -DWITH_QT=${_with_qt}
  -P ${PROJECT_SOURCE_DIR}/cmake/InstallHeaders.cmake COMMAND_ERROR_IS_FATAL ANY)")

set(BELVANE_WITH_QT ${_with_qt})
configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/BelvaneConfig.cmake.in
  ${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfig.cmake INSTALL_DESTINATION lib/cmake/Belvane)
write_basic_package_version_file(${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfigVersion.cmake
  VERSION ${PROJECT_VERSION} COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfig.cmake
  ${CMAKE_CURRENT_BINARY_DIR}/BelvaneConfigVersion.cmake DESTINATION lib/cmake/Belvane)
