# Turns a folder of files into one C++ source: their bytes, read-only, and the table of them all.
#
#   cmake -DFOLDER=dir -DNAMESPACE=orv -DOUTPUT=file.cpp -P embedassets.cmake
#
# FOLDER     read flat; every file in it becomes the asset "NAMESPACE#file name", byte for byte, but for shaders, which
#            keep the comment that opens them and leave other comments, indentation and blanks around operators
#            out; their lines stay
# NAMESPACE  asset namespace; the archive is called NAMESPACE_ARCHIVE, in upper case
# OUTPUT     replaced when the assets have changed
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
set(blocks "")
set(count 0)
set(line "................................................") # 24 bytes of two hex digits
foreach(name IN LISTS names)
    file(READ ${FOLDER}/${name} hex HEX)
    if(name MATCHES "\\.(vert|frag)$")
        file(READ ${FOLDER}/${name} text)
        string(FIND "${text}" "\n\n" end) # of the comment
        string(SUBSTRING "${text}" 0 ${end} comment)
        string(SUBSTRING "${text}" ${end} -1 text)
        string(REGEX REPLACE " *//[^\n]*" "" text "${text}")
        string(REGEX REPLACE "\n +" "\n" text "${text}")
        string(REGEX REPLACE " ([-+*/]?=|\\+) " "\\1" text "${text}")
        string(REGEX REPLACE "([a-z0-9)]) \\* " "\\1*" text "${text}") # no macro that begins with it
        string(REPLACE ", " "," text "${text}")
        string(HEX "${comment}${text}" hex)
    endif()
    string(REGEX REPLACE "(${line})" "\\1\n" hex "${hex}")
    string(REGEX REPLACE "([0-9a-f][0-9a-f])" "0x\\1," bytes "${hex}")
    string(APPEND blocks "const unsigned char BYTES_${count}[] = { // ${name}\n${bytes}\n};\n\n")
    string(APPEND table "    {\"${NAMESPACE}#${name}\", BYTES_${count}, sizeof(BYTES_${count})},\n")
    math(EXPR count "${count} + 1")
endforeach()

string(TOUPPER "${NAMESPACE}_ARCHIVE" archive)
file(CONFIGURE OUTPUT ${OUTPUT} @ONLY CONTENT "// Made by cmake/embedassets.cmake.
#include \"assets/embeddedassets.h\"

namespace orv::detail
{

namespace
{

@blocks@const EmbeddedAsset ASSETS[] = {
@table@};

} // namespace

const EmbeddedArchive @archive@ = {ASSETS, @count@};

} // namespace orv::detail
")
