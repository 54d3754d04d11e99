# Parts of libbitfcns.so: each folder of the library is an object library.
#
# bitfcns_add_component(NAME <name> SOURCES <src>... [PER_FIRST_CLASS <src>])
#
# Makes the object library bitfcns_<name> from SOURCES. A function whose
# typed instances are many names the source that instantiates them as
# PER_FIRST_CLASS: it is compiled once for each integer class of the first
# operand, with BITFCNS_FIRST_CLASS set to that class id (8 to 15), so that
# each class makes a translation unit of its own and the 2-core build
# compiles them side by side in bounded memory. Those objects come along
# with bitfcns_<name> wherever it is linked.
function(bitfcns_add_component)
  cmake_parse_arguments(arg "" "NAME;PER_FIRST_CLASS" "SOURCES" ${ARGN})
  set(target bitfcns_${arg_NAME})
  add_library(${target} OBJECT ${arg_SOURCES})
  target_link_libraries(${target} PUBLIC bitfcns_frame bitfcns_engine)
  if(arg_PER_FIRST_CLASS)
    foreach(class_id RANGE 8 15)
      set(part ${target}_class${class_id})
      add_library(${part} OBJECT ${arg_PER_FIRST_CLASS})
      target_compile_definitions(${part} PRIVATE BITFCNS_FIRST_CLASS=${class_id})
      target_link_libraries(${part} PUBLIC bitfcns_frame bitfcns_engine)
      target_sources(${target} INTERFACE $<TARGET_OBJECTS:${part}>)
    endforeach()
  endif()
endfunction()
