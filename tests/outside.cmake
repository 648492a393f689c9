# Fault caught: a library that can only be used in this tree. Copies examples/firstframe.cpp out of the tree, builds it
# like a user, runs it and checks the middle of its picture. Called with -DWAY=find_package, pkg-config,
# add_subdirectory or static, and
#   -DSOURCE=this project -DPREFIX=where it was installed -DWORK=scratch folder -DCOMPILER=c++ -DGENERATOR=cmake's
cmake_minimum_required(VERSION 3.22)

set(folder ${WORK}/${WAY})
file(MAKE_DIRECTORY ${folder})
file(COPY_FILE ${SOURCE}/examples/firstframe.cpp ${folder}/firstframe.cpp ONLY_IF_DIFFERENT)
file(COPY_FILE ${SOURCE}/tests/outside/derived.cpp ${folder}/derived.cpp ONLY_IF_DIFFERENT)

if(WAY STREQUAL "pkg-config")
    file(GLOB_RECURSE pc ${PREFIX}/*/orv.pc)
    get_filename_component(pcFolder ${pc} DIRECTORY)
    set(ENV{PKG_CONFIG_PATH} ${pcFolder})
    execute_process(COMMAND ${PKG_CONFIG} ${STATIC} --cflags --libs orv OUTPUT_VARIABLE flags OUTPUT_STRIP_TRAILING_WHITESPACE
        COMMAND_ERROR_IS_FATAL ANY)
    separate_arguments(flags UNIX_COMMAND "${flags}")
    execute_process(COMMAND ${COMPILER} -std=c++20 -o firstframe firstframe.cpp derived.cpp ${flags} -lEGL -Wl,-rpath,${pcFolder}/..
        WORKING_DIRECTORY ${folder} COMMAND_ERROR_IS_FATAL ANY)
else()
    if(WAY STREQUAL "find_package")
        set(get "find_package(orv 1.0 REQUIRED)")
    elseif(WAY STREQUAL "static") # and installed from there, for the two other ways
        set(get "set(ORV_STATIC ON)\nset(ORV_INSTALL ON)\nadd_subdirectory(${SOURCE} orv)")
    else()
        set(get "add_subdirectory(${SOURCE} orv)")
    endif()
    file(CONFIGURE OUTPUT ${folder}/CMakeLists.txt @ONLY CONTENT
"cmake_minimum_required(VERSION 3.22)
project(outside LANGUAGES CXX)
@get@
add_executable(firstframe firstframe.cpp derived.cpp)
target_link_libraries(firstframe PRIVATE orv::orv EGL)
")
    execute_process(COMMAND ${CMAKE_COMMAND} -G ${GENERATOR} -S . -B build -DCMAKE_BUILD_TYPE=Debug
        -DCMAKE_CXX_COMPILER=${COMPILER} -DCMAKE_PREFIX_PATH=${PREFIX} -DCMAKE_RUNTIME_OUTPUT_DIRECTORY=${folder}
        WORKING_DIRECTORY ${folder} COMMAND_ERROR_IS_FATAL ANY)
    execute_process(COMMAND ${CMAKE_COMMAND} --build build --parallel 2 --target firstframe
        WORKING_DIRECTORY ${folder} COMMAND_ERROR_IS_FATAL ANY)
endif()

execute_process(COMMAND ${folder}/firstframe OUTPUT_FILE ${folder}/firstframe.ppm WORKING_DIRECTORY ${folder}
    COMMAND_ERROR_IS_FATAL ANY)
file(READ ${folder}/firstframe.ppm header LIMIT 2)
math(EXPR middle "15 + (150 * 400 + 200) * 3")
file(READ ${folder}/firstframe.ppm pixel OFFSET ${middle} LIMIT 3 HEX)
if(NOT header MATCHES "^P6" OR pixel STREQUAL "" OR pixel STREQUAL "000000")
    message(FATAL_ERROR "${folder}/firstframe.ppm shows no cube in its middle: ${header} ${pixel}")
endif()

if(WAY STREQUAL "static")
    file(REMOVE_RECURSE ${folder}/installed)
    execute_process(COMMAND ${CMAKE_COMMAND} --install ${folder}/build --prefix ${folder}/installed
        OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)
    file(GLOB_RECURSE shared ${folder}/build/*liborv.so* ${folder}/installed/*liborv.so*)
    if(shared)
        message(FATAL_ERROR "a static build made ${shared}")
    endif()
    foreach(way find_package pkg-config)
        execute_process(COMMAND ${CMAKE_COMMAND} -DWAY=${way} -DSTATIC=--static -DSOURCE=${SOURCE}
            -DPREFIX=${folder}/installed -DWORK=${folder} -DCOMPILER=${COMPILER} -DGENERATOR=${GENERATOR}
            -DPKG_CONFIG=${PKG_CONFIG} -P ${CMAKE_CURRENT_LIST_FILE} COMMAND_ERROR_IS_FATAL ANY)
    endforeach()
endif()
