# Build settings shared by every target of the project.

include(ModulePlatform)

# The warnings of our own code; the presets make them errors (CMAKE_COMPILE_WARNING_AS_ERROR).
function(hv_warnings target)
  target_compile_options(${target} PRIVATE -Wall -Wextra -Wshadow -Wno-missing-field-initializers)
endfunction()

if(HV_SANITIZE)
  add_compile_options(-fsanitize=address,undefined -fno-sanitize-recover=all -fno-omit-frame-pointer)
  add_link_options(-fsanitize=address,undefined)
endif()

if(HV_FUZZ)
  add_compile_options(-fsanitize=fuzzer-no-link,address,undefined -fno-sanitize-recover=all
                      -fno-omit-frame-pointer)
  add_link_options(-fsanitize=address,undefined)
endif()

# The host and the module declare their own types for the calls between them, as two separate
# programs would; clang's function-type check would flag every such call. It comes after the
# sanitizer options, which would turn the check back on.
if((HV_SANITIZE OR HV_FUZZ) AND CMAKE_CXX_COMPILER_ID MATCHES "Clang")
  add_compile_options(-fno-sanitize=function)
endif()

if(WIN32)
  add_compile_definitions(UNICODE _UNICODE WIN32_LEAN_AND_MEAN)
  # Windows programs link the runtime statically, so they import only system libraries.
  add_link_options(-static -static-libgcc -static-libstdc++)
endif()

# The resource compiler; the Linux builds use it too, to compile the same .rc that ships.
if(NOT HV_WINDRES)
  if(CMAKE_RC_COMPILER)
    set(HV_WINDRES ${CMAKE_RC_COMPILER})
  else()
    find_program(HV_WINDRES NAMES x86_64-w64-mingw32-windres i686-w64-mingw32-windres windres)
  endif()
endif()
if(NOT HV_WINDRES)
  message(FATAL_ERROR "No resource compiler (windres) found: install binutils-mingw-w64 (tools/setup.sh)")
endif()

# The Python that has Debian's pefile module (another python3 may come first on PATH).
find_program(HV_PYTHON NAMES python3 PATHS /usr/bin NO_DEFAULT_PATH)
if(NOT HV_PYTHON)
  find_program(HV_PYTHON NAMES python3 REQUIRED)
endif()

# Windows programs run under Wine, headless, one prefix per build tree: the i686 build under
# 32-bit Wine (`wine`, a 32-bit process as the host's), the x86-64 build under `wine64`.
if(WIN32)
  set(HV_WINE_PREFIX ${CMAKE_BINARY_DIR}/wine-prefix CACHE PATH "Wine prefix of this tree's programs")
  if(CMAKE_SIZEOF_VOID_P EQUAL 4)
    set(HV_WINE wine)
  else()
    set(HV_WINE wine64)
  endif()
  configure_file(${CMAKE_SOURCE_DIR}/tools/wine-run.in ${CMAKE_BINARY_DIR}/wine-run @ONLY
                 FILE_PERMISSIONS OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE
                                  WORLD_READ WORLD_EXECUTE)
  set(CMAKE_CROSSCOMPILING_EMULATOR ${CMAKE_BINARY_DIR}/wine-run)
endif()

# A release is reproducible: two builds of one commit, in any folders, give the same bytes. Its
# time stamps (the DLL's, the help file's, the archive entries') all come from
# SOURCE_DATE_EPOCH, by default the date of the commit, and no build path reaches an output.
if(HV_RELEASE)
  if(NOT WIN32 OR NOT CMAKE_SIZEOF_VOID_P EQUAL 4 OR NOT HV_BUILD_HOST)
    message(FATAL_ERROR "HV_RELEASE needs the i686 Windows build with the host simulator")
  endif()
  include(SourceDateEpoch)
  add_compile_options(-ffile-prefix-map=${CMAKE_SOURCE_DIR}=. -ffile-prefix-map=${CMAKE_BINARY_DIR}=.)
  # ld stamps a PE file with SOURCE_DATE_EPOCH when it is set, and with the time of day if not.
  set_property(GLOBAL PROPERTY RULE_LAUNCH_LINK
               "${CMAKE_COMMAND} -E env SOURCE_DATE_EPOCH=${HV_SOURCE_DATE_EPOCH}")
endif()
