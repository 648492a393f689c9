# Turns a folder of files into one C++ source: their bytes, packed together, and the table of them all.
#
#   cmake -DFOLDER=dir -DNAMESPACE=orv -DOUTPUT=file.cpp -P embedassets.cmake
#
# FOLDER     read flat; every file in it becomes the asset "NAMESPACE#file name"
# NAMESPACE  asset namespace; the archive is called NAMESPACE_ARCHIVE, in upper case
# OUTPUT     replaced when the assets have changed
#
# The files go in byte for byte, one after the other, as one stream of the deflate format (RFC 1951). Most are shaders,
# which have much in common: packed together they take a fifth of their size.
cmake_minimum_required(VERSION 3.22)

foreach(argument FOLDER NAMESPACE OUTPUT)
    if(NOT DEFINED ${argument})
        message(FATAL_ERROR "embedassets: -D${argument}=... is missing")
    endif()
endforeach()

file(GLOB names RELATIVE ${FOLDER} ${FOLDER}/*)
list(SORT names COMPARE STRING) # byte order
if(NOT names)
    message(FATAL_ERROR "embedassets: nothing in ${FOLDER}")
endif()

set(table "")
set(paths "")
set(count 0)
set(total 0)
foreach(name IN LISTS names)
    list(APPEND paths ${FOLDER}/${name})
    file(SIZE ${FOLDER}/${name} size)
    string(APPEND table "    {\"${NAMESPACE}#${name}\", ${size}},\n")
    math(EXPR count "${count} + 1")
    math(EXPR total "${total} + ${size}")
endforeach()

execute_process(COMMAND ${CMAKE_COMMAND} -E cat ${paths} OUTPUT_FILE ${OUTPUT}.all COMMAND_ERROR_IS_FATAL ANY)
file(ARCHIVE_CREATE OUTPUT ${OUTPUT}.gz PATHS ${OUTPUT}.all FORMAT raw COMPRESSION GZip COMPRESSION_LEVEL 9)
file(READ ${OUTPUT}.gz hex HEX)
file(REMOVE ${OUTPUT}.all ${OUTPUT}.gz)

# The deflate stream stands between a header of ten bytes, followed by nothing if the fourth is zero, and eight bytes
# of check sum and size (RFC 1952). The latter stay: decoders read ahead.
if(NOT hex MATCHES "^1f8b0800............(.*)$")
    message(FATAL_ERROR "embedassets: ${FOLDER} was packed in a way that is not understood")
endif()
set(hex ${CMAKE_MATCH_1})
string(LENGTH "${hex}" packed)
math(EXPR packed "${packed} / 2")
set(line "................................................") # 24 bytes of two hex digits
string(REGEX REPLACE "(${line})" "\\1\n" hex "${hex}")
string(REGEX REPLACE "([0-9a-f][0-9a-f])" "0x\\1," bytes "${hex}")

string(TOUPPER "${NAMESPACE}_ARCHIVE" archive)
file(CONFIGURE OUTPUT ${OUTPUT} @ONLY CONTENT "// Made by cmake/embedassets.cmake.
#include \"embeddedassets.h\"

namespace orv::detail
{

namespace
{

const EmbeddedAsset ASSETS[] = {
@table@};

const unsigned char PACKED[] = {
@bytes@
};

} // namespace

const EmbeddedArchive @archive@ = {ASSETS, @count@, PACKED, @packed@, @total@};

} // namespace orv::detail
")
