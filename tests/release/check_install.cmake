# Installs the release tree TREE into DIR and checks that it holds exactly the files of ARCHIVE,
# byte for byte: `cmake --install` and the archive ship the same thing.
#   cmake -DTREE=... -DDIR=... -DARCHIVE=... -P check_install.cmake
file(REMOVE_RECURSE ${DIR})
execute_process(COMMAND ${CMAKE_COMMAND} --install ${TREE} --prefix ${DIR}/installed
                RESULT_VARIABLE status OUTPUT_QUIET)
if(status)
  message(FATAL_ERROR "cmake --install failed: ${status}")
endif()
file(ARCHIVE_EXTRACT INPUT ${ARCHIVE} DESTINATION ${DIR}/archive)
file(GLOB_RECURSE installed RELATIVE ${DIR}/installed ${DIR}/installed/*)
file(GLOB_RECURSE packed RELATIVE ${DIR}/archive ${DIR}/archive/*)
list(SORT installed)
list(SORT packed)
if(NOT installed STREQUAL packed)
  message(FATAL_ERROR "installed: ${installed}\narchive: ${packed}")
endif()
foreach(file IN LISTS packed)
  file(SHA256 ${DIR}/installed/${file} a)
  file(SHA256 ${DIR}/archive/${file} b)
  if(NOT a STREQUAL b)
    message(FATAL_ERROR "${file} differs between the install and the archive")
  endif()
endforeach()
