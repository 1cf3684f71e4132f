# Precompiled headers: the standard library and Boost.Asio's core, which nearly every translation
# unit includes, parsed once per build instead of once per unit. The libraries share one, and the
# tests one with GoogleTest added (they build at -O0, which a precompiled header must match).
set(NORVO_COMMON_HEADERS
    <algorithm> <array> <atomic> <charconv> <chrono> <cmath> <condition_variable> <cstdint>
    <cstring> <filesystem> <fstream> <functional> <iostream> <limits> <map> <memory> <mutex>
    <optional> <set> <span> <sstream> <string> <string_view> <thread> <unordered_map> <utility>
    <variant> <vector>
    <boost/asio/io_context.hpp> <boost/asio/post.hpp> <boost/asio/steady_timer.hpp>)

# Gives every static library of the tree below `directory` the libraries' precompiled header.
function(norvo_share_library_pch directory)
  get_target_property(pch_options norvo_library_pch COMPILE_OPTIONS)
  get_property(targets DIRECTORY ${directory} PROPERTY BUILDSYSTEM_TARGETS)
  foreach(target ${targets})
    get_target_property(type ${target} TYPE)
    get_target_property(options ${target} COMPILE_OPTIONS)
    # A target built with options of its own (the oracle's plain build) cannot use it.
    if(type STREQUAL "STATIC_LIBRARY" AND options STREQUAL pch_options)
      target_precompile_headers(${target} REUSE_FROM norvo_library_pch)
    endif()
  endforeach()
  get_property(subdirectories DIRECTORY ${directory} PROPERTY SUBDIRECTORIES)
  foreach(subdirectory ${subdirectories})
    norvo_share_library_pch(${subdirectory})
  endforeach()
endfunction()

function(norvo_add_library_pch)
  file(CONFIGURE OUTPUT ${CMAKE_BINARY_DIR}/norvo_library_pch.cc CONTENT "")
  add_library(norvo_library_pch OBJECT ${CMAKE_BINARY_DIR}/norvo_library_pch.cc)
  target_precompile_headers(norvo_library_pch PRIVATE ${NORVO_COMMON_HEADERS})
  norvo_share_library_pch(${CMAKE_SOURCE_DIR})
endfunction()
