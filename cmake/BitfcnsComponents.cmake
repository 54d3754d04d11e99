# Parts of libbitfcns.so: each folder of the library (frame/, engine/, one
# per family of functions) is an object library made by this helper, which
# also holds the library's own code to conversion warnings: every narrowing
# and every change of sign is written out.
#
# bitfcns_add_component(NAME <name> SOURCES <src>... [PER_FIRST_CLASS <src>]
#                       [LINKS <target>...])
#
# Makes the object library bitfcns_<name> from SOURCES, linked to LINKS
# (default: bitfcns_frame and bitfcns_engine, what a function folder uses).
# A function whose typed instances are many names the source that
# instantiates them as PER_FIRST_CLASS: it is compiled once for each integer
# class of the first operand, with BITFCNS_FIRST_CLASS set to that class id
# (8 to 15), so that each class makes a translation unit of its own and the
# 2-core build compiles them side by side in bounded memory. Those objects
# come along with bitfcns_<name> wherever it is linked.
set(BITFCNS_LIBRARY_WARNINGS -Wconversion -Wsign-conversion)

function(bitfcns_add_component)
  cmake_parse_arguments(arg "" "NAME;PER_FIRST_CLASS" "SOURCES;LINKS" ${ARGN})
  if(NOT arg_LINKS)
    set(arg_LINKS bitfcns_frame bitfcns_engine)
  endif()
  set(target bitfcns_${arg_NAME})
  add_library(${target} OBJECT ${arg_SOURCES})
  target_link_libraries(${target} PUBLIC ${arg_LINKS})
  target_compile_options(${target} PRIVATE ${BITFCNS_LIBRARY_WARNINGS})
  if(arg_PER_FIRST_CLASS)
    foreach(class_id RANGE 8 15)
      set(part ${target}_class${class_id})
      add_library(${part} OBJECT ${arg_PER_FIRST_CLASS})
      target_compile_definitions(${part} PRIVATE BITFCNS_FIRST_CLASS=${class_id})
      target_link_libraries(${part} PUBLIC ${arg_LINKS})
      target_compile_options(${part} PRIVATE ${BITFCNS_LIBRARY_WARNINGS})
      target_sources(${target} INTERFACE $<TARGET_OBJECTS:${part}>)
    endforeach()
  endif()
endfunction()
