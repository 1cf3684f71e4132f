# cmake -DOUTPUT=<file.cc> -DASSETS=<file;file...> -P EmbedAssets.cmake
# Writes the files the pages load into a C++ source, so that the program needs no folder of
# its own at run time.
set(entries "")
foreach(asset ${ASSETS})
  get_filename_component(name ${asset} NAME)
  get_filename_component(extension ${asset} LAST_EXT)
  if(extension STREQUAL ".css")
    set(type "text/css; charset=utf-8")
  elseif(extension STREQUAL ".js")
    set(type "text/javascript; charset=utf-8")
  elseif(extension STREQUAL ".html")
    set(type "text/html; charset=utf-8")
  elseif(extension STREQUAL ".svg")
    set(type "image/svg+xml")
  else()
    message(FATAL_ERROR "No content type is known for ${name}")
  endif()
  file(READ ${asset} content)
  string(SHA256 hash "${content}")
  string(SUBSTRING ${hash} 0 16 tag)
  if(content MATCHES "\\)norvo_asset\"")
    message(FATAL_ERROR "${name} holds the raw string delimiter")
  endif()
  string(APPEND entries
    "    {\"${name}\", \"${type}\", \"\\\"${tag}\\\"\", R\"norvo_asset(${content})norvo_asset\"},\n")
endforeach()

file(WRITE ${OUTPUT}.tmp
"// GENERATED CODE from src/ui/web/assets by EmbedAssets.cmake. DO NOT EDIT.
#include \"ui/web/Assets.h\"

namespace ui::web {

namespace {

constexpr Asset kAssets[] = {
${entries}};

}  // namespace

const Asset* findAsset(std::string_view name) {
  for (const Asset& asset : kAssets)
    if (asset.name == name) return &asset;
  return nullptr;
}

}  // namespace ui::web
")
file(COPY_FILE ${OUTPUT}.tmp ${OUTPUT} ONLY_IF_DIFFERENT)
file(REMOVE ${OUTPUT}.tmp)
