# Turns a folder of files into one C++ source: a byte array for each file and the table of them all.
#
#   cmake -DFOLDER=dir -DNAMESPACE=orv -DOUTPUT=file.cpp -P embedassets.cmake
#
# FOLDER     read flat; every file in it becomes the asset "NAMESPACE#file name"
# NAMESPACE  asset namespace; the table is called NAMESPACE_ARCHIVE, in upper case
# OUTPUT     replaced when the assets have changed
#
# Shader sources (.vert, .frag) go in without what only their authors read: comments after the opening
# line and blanks that separate nothing. Lines stay where they are, so that a driver's message names the line of the file.
# Everything else goes in byte for byte.
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

# Sets ${result} to the bytes of a file as pairs of hex digits.
function(read_asset path result)
    if(NOT path MATCHES "\\.(vert|frag)$")
        file(READ ${path} hex HEX)
        set(${result} "${hex}" PARENT_SCOPE)
        return()
    endif()
    file(READ ${path} text)
    if(text MATCHES "/\\*|\\\\\n")
        message(FATAL_ERROR "embedassets: ${path}: only comments that begin with // are understood, on lines of their own")
    endif()
    string(REGEX MATCH "^[^\n]*\n" opening "${text}")
    string(LENGTH "${opening}" length)
    string(SUBSTRING "${text}" ${length} -1 text)
    string(REGEX REPLACE "[ \t]*//[^\n]*" "" text "${text}")
    string(REGEX REPLACE "[ \t]+\n" "\n" text "${text}")
    string(REGEX REPLACE "\n[ \t]+" "\n" text "\n${text}")
    # Not around signs and parentheses: a - -b, #define X (y).
    string(REGEX REPLACE "[ \t]*([*/=<>,;{}])[ \t]*" "\\1" text "${text}")
    string(SUBSTRING "${text}" 1 -1 text)
    string(HEX "${opening}${text}" hex)
    set(${result} "${hex}" PARENT_SCOPE)
endfunction()

set(line "................................................") # 24 bytes of two hex digits
set(arrays "")
set(table "")
set(index 0)
foreach(name IN LISTS names)
    read_asset(${FOLDER}/${name} hex)
    string(LENGTH "${hex}" size)
    math(EXPR size "${size} / 2")
    if(size EQUAL 0)
        message(FATAL_ERROR "embedassets: ${FOLDER}/${name} is empty")
    endif()
    string(MD5 digest "${hex}")
    if(NOT DEFINED array_${digest}) # assets of the same bytes share an array
        set(array_${digest} ASSET_${index})
        string(REGEX REPLACE "(${line})" "\\1\n" hex "${hex}")
        string(REGEX REPLACE "([0-9a-f][0-9a-f])" "0x\\1," bytes "${hex}")
        string(APPEND arrays "// ${name}\nconst unsigned char ASSET_${index}[${size}] = {\n${bytes}\n};\n\n")
    endif()
    string(APPEND table "    {\"${NAMESPACE}#${name}\", ${array_${digest}}, ${size}},\n")
    math(EXPR index "${index} + 1")
endforeach()

string(TOUPPER "${NAMESPACE}_ARCHIVE" archive)
file(CONFIGURE OUTPUT ${OUTPUT} @ONLY CONTENT "// Made by cmake/embedassets.cmake.
#include \"embeddedassets.h\"

namespace orv::detail
{

namespace
{

@arrays@const EmbeddedAsset ASSETS[] = {
@table@};

} // namespace

const EmbeddedArchive @archive@ = {ASSETS, @index@};

} // namespace orv::detail
")
