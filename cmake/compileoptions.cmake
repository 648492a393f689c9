# orv_options: what every target of this project is compiled with.
add_library(orv_options INTERFACE)
target_compile_features(orv_options INTERFACE cxx_std_20)
target_compile_options(orv_options INTERFACE
    -Wall -Wextra -Wpedantic -Wshadow -Wnon-virtual-dtor -Woverloaded-virtual
    -fno-rtti # the library has none, and a class that derives from one of its classes must agree
    "-fmacro-prefix-map=${PROJECT_SOURCE_DIR}/=") # log records name sources relative to the project
if(ORV_WERROR)
    target_compile_options(orv_options INTERFACE -Werror)
endif()
if(ORV_SANITIZE)
    set(sanitizers -fsanitize=address,undefined -fno-sanitize=vptr -fno-sanitize-recover=undefined)
    target_compile_options(orv_options INTERFACE ${sanitizers} -fno-omit-frame-pointer)
    target_link_options(orv_options INTERFACE ${sanitizers})
endif()
if(ORV_BUILD_FUZZ)
    target_compile_options(orv_options INTERFACE -fsanitize=fuzzer-no-link) # libFuzzer follows the branches taken
endif()

# orv_engine_options: the same for the sources of the library itself.
add_library(orv_engine_options INTERFACE)
target_link_libraries(orv_engine_options INTERFACE orv_options)
target_compile_options(orv_engine_options INTERFACE
    -fno-exceptions -fvisibility=hidden -fvisibility-inlines-hidden -fno-semantic-interposition)

# The library is to be small. All configurations but Debug compile it for size, what a frame runs through for speed
# (orv_hot_sources), leave out what nobody calls and, with GCC, optimise it as a whole. The objects hold ordinary code
# as well: the tests link that, in a fraction of the time.
#
# Unwind tables are a sixth of such a library. Without them a debugger needs the debug information, as these builds
# have it, a crash reporter without it sees the innermost function alone, and an exception that a program lets pass
# through the engine ends the program. Builds for looking inside keep them.
if(NOT ORV_SANITIZE AND NOT ORV_BUILD_FUZZ)
    set(ORV_COMPACT $<NOT:$<CONFIG:Debug>>)
else()
    set(ORV_COMPACT 0)
endif()
set(ORV_WHOLE $<AND:${ORV_COMPACT},$<STREQUAL:${CMAKE_CXX_COMPILER_ID},GNU>>) # not of a target: tests ask as well
target_compile_options(orv_engine_options INTERFACE
    $<${ORV_COMPACT}:-Oz> $<${ORV_COMPACT}:-ffunction-sections> $<${ORV_COMPACT}:-fdata-sections>
    $<${ORV_WHOLE}:-flto=auto> $<${ORV_WHOLE}:-ffat-lto-objects>)
if(NOT ORV_UNWIND_TABLES)
    set(noTables $<${ORV_COMPACT}:-fno-asynchronous-unwind-tables> $<${ORV_COMPACT}:-fno-unwind-tables>)
    target_compile_options(orv_engine_options INTERFACE ${noTables})
    target_link_options(orv_engine_options INTERFACE ${noTables}) # where the whole is compiled once more
endif()

# orv_hot_sources(source...): sources of the current room that run for every frame, solid or pixel. What does not in
# them is marked [[gnu::cold]], which is as good as being elsewhere.
# With GCC they are neither padded nor inlined beyond what costs nothing: the library has to stay small.
set(tight -fno-align-functions -fno-align-loops -fno-align-jumps -fno-inline-functions)
list(TRANSFORM tight PREPEND "$<${ORV_WHOLE}:")
list(TRANSFORM tight APPEND ">")
function(orv_hot_sources)
    set_property(SOURCE ${ARGN} APPEND PROPERTY COMPILE_OPTIONS $<${ORV_COMPACT}:-O2> ${tight})
endfunction()

# orv_base_sources(source...): sources of the current room that hold the bases of classes which programs make or derive
# themselves. Their type information is what a program needs that is compiled with it, as most are.
function(orv_base_sources)
    set_property(SOURCE ${ARGN} APPEND PROPERTY COMPILE_OPTIONS -frtti)
endfunction()

# orv_link_options_if_known(target option...): those of the options that the linker takes.
include(CheckLinkerFlag)
function(orv_link_options_if_known target)
    foreach(option IN LISTS ARGN)
        string(MAKE_C_IDENTIFIER "HAVE_${option}" known)
        check_linker_flag(CXX "${option}" ${known})
        if(${known})
            target_link_options(${target} PRIVATE ${option})
        endif()
    endforeach()
endfunction()
