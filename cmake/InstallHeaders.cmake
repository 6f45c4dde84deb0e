# cmake -DSOURCE_DIR=<src> -DPUBLIC_HEADER=<include/belvane/belvane.hpp>
#       -DDESTINATION=<prefix/include/belvane> -DWITH_QT=ON|OFF -P InstallHeaders.cmake
# Installs the component's headers under <prefix>/include/belvane/<layer>/,
# each including the others as <belvane/<layer>/...>, so a host's include
# path holds only <prefix>/include and no folder of a generic name. The
# backends' own headers (which need SQLite's and libpq's) and the catalogue
# maintainer's tools stay inside the library.
set(layers text data grid forms cipher host editor diagram labour parts entry)
if(WITH_QT)
  list(APPEND layers qt)
endif()
list(JOIN layers "|" alternatives)

function(install_header from to)
  file(READ "${from}" content)
  string(REGEX REPLACE "#include \"((${alternatives})/[^\"]*)\"" "#include <belvane/\\1>"
         content "${content}")
  file(WRITE "${to}" "${content}")
  message(STATUS "Installing: ${to}")
endfunction()

file(GLOB_RECURSE headers RELATIVE ${SOURCE_DIR} ${SOURCE_DIR}/*.hpp)
foreach(header IN LISTS headers)
  string(REGEX MATCH "^[a-z_]+" layer "${header}")
  list(FIND layers ${layer} known)
  if(known EQUAL -1 OR header MATCHES "^data/(sqlite|postgres|tools)/")
    continue()
  endif()
  get_filename_component(folder "${DESTINATION}/${header}" DIRECTORY)
  file(MAKE_DIRECTORY "${folder}")
  install_header("${SOURCE_DIR}/${header}" "${DESTINATION}/${header}")
endforeach()
install_header("${PUBLIC_HEADER}" "${DESTINATION}/belvane.hpp")
