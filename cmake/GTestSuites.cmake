# ctest include file: registers one test per GoogleTest suite of a test program, for the Windows
# builds, where every test process starts a Wine process (one to three seconds under 32-bit
# Wine) and one test per process would take most of an hour. Expects HV_PROGRAM (the test
# program), HV_EMULATOR (the Wine runner), HV_NAME (the tests' name prefix), HV_DIR (their
# working folder) and HV_LIST (the generated list, rebuilt when the program is newer).
if(NOT EXISTS "${HV_LIST}" OR "${HV_PROGRAM}" IS_NEWER_THAN "${HV_LIST}")
  execute_process(COMMAND "${HV_EMULATOR}" "${HV_PROGRAM}" --gtest_list_tests
                  WORKING_DIRECTORY "${HV_DIR}" TIMEOUT 300
                  OUTPUT_VARIABLE listing RESULT_VARIABLE result)
  if(NOT result EQUAL 0)
    message(FATAL_ERROR "${HV_PROGRAM} --gtest_list_tests failed (${result}):\n${listing}")
  endif()
  string(REPLACE "\r" "" listing "${listing}")
  string(REPLACE "\n" ";" lines "${listing}")
  set(script "")
  foreach(line IN LISTS lines)
    # A suite line starts in the first column: "Suite." or "Prefix/Suite.  # TypeParam = ..."
    if(line MATCHES "^([A-Za-z0-9_/]+)\\.( |$)")
      set(suite "${CMAKE_MATCH_1}")
      string(APPEND script
        "add_test([==[${HV_NAME}.${suite}]==] \"${HV_EMULATOR}\" \"${HV_PROGRAM}\" "
        "[==[--gtest_filter=${suite}.*]==])\n"
        "set_tests_properties([==[${HV_NAME}.${suite}]==] PROPERTIES "
        "WORKING_DIRECTORY \"${HV_DIR}\" TIMEOUT 600)\n")
    endif()
  endforeach()
  if(script STREQUAL "")
    message(FATAL_ERROR "${HV_PROGRAM} lists no test suite:\n${listing}")
  endif()
  file(WRITE "${HV_LIST}" "${script}")
endif()
include("${HV_LIST}")
