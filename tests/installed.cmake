# Faults caught: an installed header that includes one which was left behind, an inner header that no other needs.
# Called with -DBUILD=build folder -DPREFIX=where to; installs there afresh.
cmake_minimum_required(VERSION 3.22)

file(REMOVE_RECURSE ${PREFIX})
execute_process(COMMAND ${CMAKE_COMMAND} --install ${BUILD} --prefix ${PREFIX} OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)

file(GLOB_RECURSE headers RELATIVE ${PREFIX}/include ${PREFIX}/include/*.h)
set(included "")
foreach(header IN LISTS headers)
    file(STRINGS ${PREFIX}/include/${header} lines REGEX "^#include \"")
    foreach(line IN LISTS lines)
        string(REGEX REPLACE "^#include \"(.*)\".*" "\\1" name "${line}")
        list(APPEND included ${name})
        if(NOT EXISTS ${PREFIX}/include/${name})
            message(SEND_ERROR "${header} includes ${name}, which is not installed")
        endif()
    endforeach()
endforeach()
foreach(header IN LISTS headers)
    if(header MATCHES "/detail/" AND NOT header IN_LIST included)
        message(SEND_ERROR "${header} is installed, but no public header includes it")
    endif()
endforeach()
