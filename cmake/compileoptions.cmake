# orv_options: what every target of this project is compiled with.
add_library(orv_options INTERFACE)
target_compile_features(orv_options INTERFACE cxx_std_20)
target_compile_options(orv_options INTERFACE
    -Wall -Wextra -Wpedantic -Wshadow -Wnon-virtual-dtor -Woverloaded-virtual
    -ffp-contract=off # numbers are rounded as written, on processors that multiply and add in one step as well
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
    -fno-exceptions -fvisibility=hidden -fvisibility-inlines-hidden)
if(NOT EMSCRIPTEN) # where nothing is shared
    target_compile_options(orv_engine_options INTERFACE -fno-semantic-interposition)
endif()
# Debug information, and with it the build ID, does not say where the library was built: see docs/releasing.md.
# The folders of the tools use these as well.
set(ORV_PREFIX_MAPS "-fdebug-prefix-map=${PROJECT_SOURCE_DIR}/=" "-fdebug-prefix-map=${PROJECT_BINARY_DIR}=build")
target_compile_options(orv_engine_options INTERFACE ${ORV_PREFIX_MAPS})
target_link_options(orv_engine_options INTERFACE ${ORV_PREFIX_MAPS})

# All configurations but Debug compile the library for size, save what a frame or a decoder runs through
# (orv_hot_sources), and with GCC optimise it as a whole when they link it (ORV_LTO), which for a static library others
# do. The objects hold ordinary code as well: the tests link that, in a fraction of the time. Unwind tables stay: crash
# reporters need them, and exceptions that a program lets pass through.
set(ORV_OPTIMISED $<NOT:$<OR:$<CONFIG:Debug>,$<BOOL:${ORV_SANITIZE}>,$<BOOL:${ORV_BUILD_FUZZ}>>>)
set(ORV_WHOLE
    $<AND:${ORV_OPTIMISED},$<BOOL:${ORV_LTO}>,$<NOT:$<BOOL:${ORV_STATIC}>>,$<STREQUAL:${CMAKE_CXX_COMPILER_ID},GNU>>)
target_compile_options(orv_engine_options INTERFACE
    $<${ORV_OPTIMISED}:-Os> $<${ORV_WHOLE}:-flto> $<${ORV_WHOLE}:-ffat-lto-objects>
    -ffunction-sections -fdata-sections)
if(NOT EMSCRIPTEN) # whose return addresses are out of a program's reach, and which needs no tables to unwind
    target_compile_options(orv_engine_options INTERFACE -funwind-tables -fstack-protector)
endif()

# orv_hot_sources(source...): sources of the current room that run for every frame, solid or pixel. They are not
# inlined beyond what costs nothing, nor padded.
set(ORV_UNPADDED "")
if(CMAKE_CXX_COMPILER_ID STREQUAL GNU)
    set(ORV_UNPADDED -fno-align-functions -fno-align-loops -fno-align-jumps)
endif()
function(orv_hot_sources)
    set_property(SOURCE ${ARGN} APPEND PROPERTY COMPILE_OPTIONS
        $<${ORV_OPTIMISED}:-O2> -fno-inline-functions ${ORV_UNPADDED})
endfunction()

# orv_base_sources(source...): sources of the current room that hold the bases of classes which programs make or derive
# themselves. Their type information is what a program needs that is compiled with it, as most are.
function(orv_base_sources)
    set_property(SOURCE ${ARGN} APPEND PROPERTY COMPILE_OPTIONS -frtti)
endfunction()

# orv_stb_image_sources(source...): sources of the current folder that stb_image is compiled in. Its JPEG decoder shifts
# by too much where the data end early: zeros, so that nothing comes of it but the message.
function(orv_stb_image_sources)
    if(ORV_SANITIZE)
        set_property(SOURCE ${ARGN} APPEND PROPERTY COMPILE_OPTIONS -fno-sanitize=shift)
    endif()
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
