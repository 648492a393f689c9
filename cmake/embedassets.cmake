# Turns files into one C++ source with their bytes, read-only, and a table of them.
#
#   cmake -DFILES=a;b -DNAMESPACE=orv -DOUTPUT=file.cpp [-DSHADOWS=ON] -P embedassets.cmake
#
# FILES      each becomes the asset "NAMESPACE#file name", byte for byte, but for shaders, which keep the comment that
#            opens them and leave other comments, indentation and blanks around operators out; their lines stay
# NAMESPACE  asset namespace; the archive is called NAMESPACE_ARCHIVE, in upper case
# OUTPUT     replaced when the assets have changed
# SHADOWS    keeps the code for shadows: in shaders the text between "#ifdef SHADOW" and "#endif // SHADOW", in program
#            files the uniforms u_s_...; and changes references from "orv" to NAMESPACE. Without it this code is left out.
cmake_minimum_required(VERSION 3.22)

foreach(argument FILES NAMESPACE OUTPUT)
    if(NOT DEFINED ${argument})
        message(FATAL_ERROR "embedassets: -D${argument}=... is missing")
    endif()
endforeach()

list(SORT FILES COMPARE STRING) # byte order

# Removes the code for shadows from a shader, except the text after "#else // SHADOW".
function(leave_shadows_out variable)
    set(text "${${variable}}")
    set(kept "")
    while(TRUE)
        string(FIND "${text}" "#ifdef SHADOW\n" begin)
        if(begin EQUAL -1)
            break()
        endif()
        string(SUBSTRING "${text}" 0 ${begin} before)
        string(SUBSTRING "${text}" ${begin} -1 text)
        string(FIND "${text}" "#endif // SHADOW\n" end)
        string(SUBSTRING "${text}" 0 ${end} block)
        math(EXPR end "${end} + 17")
        string(SUBSTRING "${text}" ${end} -1 text)
        string(FIND "${block}" "#else // SHADOW\n" otherwise)
        if(otherwise EQUAL -1)
            set(block "")
            string(REGEX REPLACE "\n\n$" "\n" before "${before}") # one empty line, not two
        else()
            math(EXPR otherwise "${otherwise} + 16")
            string(SUBSTRING "${block}" ${otherwise} -1 block)
        endif()
        string(APPEND kept "${before}${block}")
    endwhile()
    set(${variable} "${kept}${text}" PARENT_SCOPE)
endfunction()

set(table "")
set(blocks "")
set(count 0)
set(line "................................................") # 24 bytes of two hex digits
foreach(path IN LISTS FILES)
    get_filename_component(name ${path} NAME)
    file(READ ${path} hex HEX)
    if(name MATCHES "\\.sp$")
        file(READ ${path} text)
        if(SHADOWS)
            string(REPLACE "orv#" "${NAMESPACE}#" text "${text}")
        else()
            string(REGEX REPLACE "\n(uniform u_s_[^\n]*\n)+" "" text "${text}")
        endif()
        string(HEX "${text}" hex)
    elseif(name MATCHES "\\.(vert|frag)$")
        file(READ ${path} text)
        if(NOT SHADOWS)
            leave_shadows_out(text)
        endif()
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
#include \"orv/detail/embeddedassets.h\"

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
