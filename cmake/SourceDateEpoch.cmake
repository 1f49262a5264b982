# HV_SOURCE_DATE_EPOCH: the time every time stamp of a release is given, in seconds since 1970
# (UTC). It is $ENV{SOURCE_DATE_EPOCH} when set, else the date of the source tree's commit, else
# 1980-01-01 (the earliest date a zip entry holds) for sources outside git.
if(DEFINED ENV{SOURCE_DATE_EPOCH})
  set(HV_SOURCE_DATE_EPOCH "$ENV{SOURCE_DATE_EPOCH}")
else()
  find_package(Git QUIET)
  if(GIT_FOUND)
    execute_process(COMMAND ${GIT_EXECUTABLE} log -1 --format=%ct
                    WORKING_DIRECTORY ${CMAKE_SOURCE_DIR} OUTPUT_VARIABLE HV_SOURCE_DATE_EPOCH
                    OUTPUT_STRIP_TRAILING_WHITESPACE ERROR_QUIET)
    # A new commit moves HEAD or its branch: configure again to take its date.
    execute_process(COMMAND ${GIT_EXECUTABLE} symbolic-ref -q HEAD
                    WORKING_DIRECTORY ${CMAKE_SOURCE_DIR} OUTPUT_VARIABLE branch
                    OUTPUT_STRIP_TRAILING_WHITESPACE ERROR_QUIET)
    foreach(ref HEAD packed-refs ${branch})
      execute_process(COMMAND ${GIT_EXECUTABLE} rev-parse --path-format=absolute --git-path ${ref}
                      WORKING_DIRECTORY ${CMAKE_SOURCE_DIR} OUTPUT_VARIABLE file
                      OUTPUT_STRIP_TRAILING_WHITESPACE ERROR_QUIET)
      if(file AND EXISTS "${file}")
        set_property(DIRECTORY ${CMAKE_SOURCE_DIR} APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${file})
      endif()
    endforeach()
  endif()
  if(NOT HV_SOURCE_DATE_EPOCH MATCHES "^[0-9]+$")
    message(WARNING "No commit date (not a git checkout?) and no SOURCE_DATE_EPOCH: the release's time stamps say 1980-01-01")
    set(HV_SOURCE_DATE_EPOCH 315532800)
  endif()
endif()
if(NOT HV_SOURCE_DATE_EPOCH MATCHES "^[0-9]+$")
  message(FATAL_ERROR "SOURCE_DATE_EPOCH must be a number of seconds, not '${HV_SOURCE_DATE_EPOCH}'")
endif()
message(STATUS "Release time stamps: SOURCE_DATE_EPOCH ${HV_SOURCE_DATE_EPOCH}")
