# norvo_add_record_library(<target> PROTOS <schema files...>)
# Runs recordgen over the schemas at build time and compiles the records it
# writes into the build tree. Editing a schema or the generator rebuilds
# exactly what depends on it.
function(norvo_add_record_library target)
  cmake_parse_arguments(ARG "" "" "PROTOS;SOURCES;LIBS" ${ARGN})
  set(out ${CMAKE_BINARY_DIR}/generated/messages)
  set(outputs ${out}/Records.h ${out}/Records.cc ${out}/RecordFields.cc ${out}/Metrics.h)
  set(sources ${out}/Records.cc ${out}/RecordFields.cc)
  foreach(proto ${ARG_PROTOS})
    get_filename_component(stem ${proto} NAME_WE)
    list(APPEND outputs ${out}/${stem}.records.h ${out}/${stem}.records.cc)
    list(APPEND sources ${out}/${stem}.records.cc)
  endforeach()
  file(GLOB generator_sources ${CMAKE_SOURCE_DIR}/tools/recordgen/*)
  add_custom_command(
    OUTPUT ${outputs}
    COMMAND ${CMAKE_COMMAND} -E make_directory ${out}
    COMMAND protobuf::protoc --plugin=protoc-gen-records=$<TARGET_FILE:recordgen>
            -I${CMAKE_SOURCE_DIR}/proto -I${Protobuf_INCLUDE_DIRS} --records_out=${out} ${ARG_PROTOS}
    DEPENDS ${ARG_PROTOS} ${CMAKE_SOURCE_DIR}/proto/options.proto recordgen ${generator_sources}
    COMMENT "Generating records from ${ARG_PROTOS}"
    VERBATIM)
  add_library(${target} STATIC ${sources} ${ARG_SOURCES})
  target_include_directories(${target} PUBLIC ${CMAKE_BINARY_DIR}/generated)
  target_link_libraries(${target} PUBLIC ${ARG_LIBS})
endfunction()
