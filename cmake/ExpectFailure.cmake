# ctest helper: runs PROGRAM (through EMULATOR, if any) with ARGS and passes only when it exits
# with STATUS and its standard error matches MESSAGE, a regular expression. A program that
# crashes also fails, but with another status, so it does not pass.
#   cmake -DPROGRAM=... -DARGS="a;b" -DSTATUS=1 -DMESSAGE=... [-DEMULATOR=...] -P ExpectFailure.cmake
execute_process(COMMAND ${EMULATOR} ${PROGRAM} ${ARGS}
                RESULT_VARIABLE status OUTPUT_VARIABLE out ERROR_VARIABLE err)
if(NOT status STREQUAL "${STATUS}")
  message(FATAL_ERROR "exit status ${status}, expected ${STATUS}\nstderr:\n${err}\nstdout:\n${out}")
endif()
if(NOT err MATCHES "${MESSAGE}")
  message(FATAL_ERROR "standard error does not match '${MESSAGE}':\n${err}")
endif()
