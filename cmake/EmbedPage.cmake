# Writes the files of a folder into OUTPUT as the table web::pageFiles().
#   cmake -DFOLDER=<dir> -DOUTPUT=<file> -P EmbedPage.cmake
set(type_html "text/html; charset=utf-8")
set(type_js "text/javascript; charset=utf-8")
set(type_css "text/css; charset=utf-8")
set(type_svg "image/svg+xml")

file(GLOB names RELATIVE ${FOLDER} ${FOLDER}/*)
list(SORT names)
set(rows "")
foreach(name IN LISTS names)
  get_filename_component(ending ${name} LAST_EXT)
  string(SUBSTRING ${ending} 1 -1 ending)
  if(NOT type_${ending})
    message(FATAL_ERROR "${name}: files of this kind have no type here")
  endif()
  file(SHA256 ${FOLDER}/${name} hash)
  file(READ ${FOLDER}/${name} bytes HEX)
  string(LENGTH "${bytes}" size)
  math(EXPR size "${size} / 2")
  string(REGEX REPLACE "(..)" "'\\\\x\\1'," bytes "${bytes}")
  string(MAKE_C_IDENTIFIER ${name} array)
  string(APPEND arrays "constexpr char ${array}[] = {${bytes}};\n")
  string(APPEND rows "    {\"${name}\", \"${type_${ending}}\", \"${hash}\", {${array}, ${size}}},\n")
endforeach()

file(WRITE ${OUTPUT} "// Written by cmake/EmbedPage.cmake from ${FOLDER}.
#include \"broker/web/Page.h\"

namespace
{
${arrays}
constexpr web::PageFile files[] = {
${rows}};
} // namespace

std::span<const web::PageFile> web::pageFiles()
{
    return files;
}
")
