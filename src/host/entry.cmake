# belvane_entry: CForms, the class a host creates. It sits above the editors
# it opens.
add_library(belvane_entry STATIC ${CMAKE_CURRENT_LIST_DIR}/cforms.cpp)
target_include_directories(belvane_entry PUBLIC
  $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/src>
  $<INSTALL_INTERFACE:include/belvane/internal>)
target_link_libraries(belvane_entry PUBLIC belvane_host belvane_labour PRIVATE $<BUILD_INTERFACE:belvane_warnings>)
if(TARGET belvane_parts)
  target_link_libraries(belvane_entry PUBLIC belvane_parts)
endif()
set_property(GLOBAL APPEND PROPERTY BELVANE_LAYERS belvane_entry)
install(TARGETS belvane_entry EXPORT BelvaneTargets ARCHIVE DESTINATION lib)
