# What a module library needs from the platform it is built for, so that the module's own
# CMakeLists and sources never ask which one that is.
#
# hv_module_platform(<target> DEF <file.def> RES <file.res>)
#   Windows: the .def names the exports (stdcall names without their decoration) and the
#   compiled resources are linked as the DLL's resource section.
#   Linux: the module is linked over the portable Win32 layer (hvwin32_module, which carries the
#   layer's own link needs); an ELF version script made from the .def at build time exports the
#   same names, `Name=Internal` lines become aliases, and the compiled resources are embedded
#   where the layer's LoadLibraryW finds them.
function(hv_module_platform target)
  cmake_parse_arguments(PARSE_ARGV 1 arg "" "DEF;RES" "")
  get_filename_component(def ${arg_DEF} ABSOLUTE)
  set(dir ${CMAKE_CURRENT_BINARY_DIR}/${target}_platform)
  if(WIN32)
    add_custom_command(OUTPUT ${dir}/resources.o
      COMMAND ${HV_WINDRES} -i ${arg_RES} -o ${dir}/resources.o
      DEPENDS ${arg_RES})
    target_sources(${target} PRIVATE ${def} ${dir}/resources.o)
    target_link_options(${target} PRIVATE -Wl,--enable-stdcall-fixup)
    return()
  endif()

  add_custom_command(OUTPUT ${dir}/resource_section.cpp
    COMMAND ${CMAKE_COMMAND} -DINPUT=${arg_RES} -DOUTPUT=${dir}/resource_section.cpp
            -P ${CMAKE_SOURCE_DIR}/cmake/EmbedResources.cmake
    DEPENDS ${arg_RES} ${CMAKE_SOURCE_DIR}/cmake/EmbedResources.cmake)
  get_target_property(layerExports hvwin32_module W32_MODULE_EXPORTS)
  string(REPLACE ";" "," layerExports "${layerExports}")
  set(versionScript ${dir}/exports.map)
  set(aliases ${dir}/aliases.ld)
  add_custom_command(OUTPUT ${versionScript} ${aliases}
    COMMAND ${CMAKE_COMMAND} -DDEF=${def} -DEXTRA=${layerExports}
            -DVERSION_SCRIPT=${versionScript} -DALIASES=${aliases}
            -P ${CMAKE_SOURCE_DIR}/cmake/DefToElf.cmake
    DEPENDS ${def} ${CMAKE_SOURCE_DIR}/cmake/DefToElf.cmake
    COMMENT "Exports of ${target} from ${arg_DEF}")
  target_sources(${target} PRIVATE ${dir}/resource_section.cpp ${versionScript} ${aliases})
  target_link_libraries(${target} PRIVATE hvwin32_module)
  # The aliases script is an input of the link, read as part of the linker's default script.
  target_link_options(${target} PRIVATE -Wl,--version-script=${versionScript} ${aliases})
  set_property(TARGET ${target} APPEND PROPERTY LINK_DEPENDS ${versionScript} ${aliases})
endfunction()
