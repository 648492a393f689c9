# Turns a folder of files into one C++ source: a byte array for each file and the table of them all.
#
#   cmake -DFOLDER=dir -DNAMESPACE=orv -DOUTPUT=file.cpp -P embedassets.cmake
#
# FOLDER     read flat; every file in it becomes the asset "NAMESPACE#file name"
# NAMESPACE  asset namespace; the table is called NAMESPACE_ARCHIVE, in upper case
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

set(line "................................................") # 24 bytes of two hex digits
set(arrays "")
set(table "")
set(index 0)
foreach(name IN LISTS names)
    file(READ ${FOLDER}/${name} hex HEX)
    file(SIZE ${FOLDER}/${name} size)
    if(size EQUAL 0)
        message(FATAL_ERROR "embedassets: ${FOLDER}/${name} is empty")
    endif()
    string(REGEX REPLACE "(${line})" "\\1\n" hex "${hex}")
    string(REGEX REPLACE "([0-9a-f][0-9a-f])" "0x\\1," bytes "${hex}")
    string(APPEND arrays "// ${name}\nconst unsigned char ASSET_${index}[${size}] = {\n${bytes}\n};\n\n")
    string(APPEND table "    {\"${NAMESPACE}#${name}\", ASSET_${index}, ${size}},\n")
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
