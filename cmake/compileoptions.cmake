# orv_options: the options of every target of this project.
add_library(orv_options INTERFACE)
target_compile_features(orv_options INTERFACE cxx_std_20)
target_compile_options(orv_options INTERFACE
    -Wall -Wextra -Wpedantic -Wshadow -Wnon-virtual-dtor -Woverloaded-virtual
    -ffp-contract=off # no fused multiply-add: the same rounding on all processors
    -fno-rtti # classes derived from the library's must agree with it
    "-fmacro-prefix-map=${PROJECT_SOURCE_DIR}/=") # log records name sources relative to the project
if(ORV_WERROR)
    target_compile_options(orv_options INTERFACE -Werror)
endif()
if(ORV_SANITIZE)
    set(sanitizers -fsanitize=address,undefined -fno-sanitize=vptr -fno-sanitize-recover=undefined)
    target_compile_options(orv_options INTERFACE ${sanitizers} -fno-omit-frame-pointer)
    target_link_options(orv_options INTERFACE ${sanitizers})
endif()
if(ORV_BUILD_FUZZ AND ORV_SANITIZE)
    target_compile_options(orv_options INTERFACE -fsanitize=fuzzer-no-link) # libFuzzer follows the branches taken
endif()

# orv_engine_options: the same for the sources of the library itself.
add_library(orv_engine_options INTERFACE)
target_link_libraries(orv_engine_options INTERFACE orv_options)
target_compile_options(orv_engine_options INTERFACE
    -fno-exceptions -fvisibility=hidden -fvisibility-inlines-hidden)
if(NOT EMSCRIPTEN) # which has no shared libraries
    target_compile_options(orv_engine_options INTERFACE -fno-semantic-interposition)
endif()
# Keeps the build folder out of debug information, and so out of the build ID: see docs/releasing.md.
# The folders of the tools use these as well.
set(ORV_PREFIX_MAPS "-fdebug-prefix-map=${PROJECT_SOURCE_DIR}/=" "-fdebug-prefix-map=${PROJECT_BINARY_DIR}=build")
if(CMAKE_CXX_COMPILER_ID STREQUAL GNU) # its assembler names the folder itself, and build IDs depend on that
    list(APPEND ORV_PREFIX_MAPS "-Wa,--debug-prefix-map=${PROJECT_BINARY_DIR}=build")
endif()
target_compile_options(orv_engine_options INTERFACE ${ORV_PREFIX_MAPS})
target_link_options(orv_engine_options INTERFACE ${ORV_PREFIX_MAPS})

# All configurations but Debug compile the library for size, except code of frames and decoders (orv_hot_sources), and
# with GCC use link-time optimisation (ORV_LTO); for a static library the program's link does it. The objects hold
# ordinary code as well, which the tests link much faster. Unwind tables are kept for crash reporters, and for
# exceptions that pass through.
set(ORV_OPTIMISED $<NOT:$<OR:$<CONFIG:Debug>,$<BOOL:${ORV_SANITIZE}>>>)
set(ORV_WHOLE
    $<AND:${ORV_OPTIMISED},$<BOOL:${ORV_LTO}>,$<NOT:$<BOOL:${ORV_STATIC}>>,$<STREQUAL:${CMAKE_CXX_COMPILER_ID},GNU>>)
target_compile_options(orv_engine_options INTERFACE
    $<${ORV_OPTIMISED}:-Os> $<${ORV_WHOLE}:-flto> $<${ORV_WHOLE}:-ffat-lto-objects>
    -ffunction-sections -fdata-sections)
if(NOT EMSCRIPTEN) # WebAssembly programs cannot reach return addresses, and need no unwind tables
    target_compile_options(orv_engine_options INTERFACE -funwind-tables -fstack-protector)
endif()

# orv_hot_sources(source...): sources of the current room that run for every frame, solid, pixel or field of a file.
# They get no inlining that increases size, and no padding.
set(ORV_UNPADDED "")
if(CMAKE_CXX_COMPILER_ID STREQUAL GNU)
    set(ORV_UNPADDED -fno-align-functions -fno-align-loops -fno-align-jumps)
endif()
function(orv_hot_sources)
    set_property(SOURCE ${ARGN} APPEND PROPERTY COMPILE_OPTIONS
        $<${ORV_OPTIMISED}:-O2> -fno-inline-functions ${ORV_UNPADDED})
endfunction()

# orv_base_sources(source...): sources of the current room with base classes that programs derive from. They are
# compiled with type information, which programs compiled with it need.
function(orv_base_sources)
    set_property(SOURCE ${ARGN} APPEND PROPERTY COMPILE_OPTIONS -frtti)
endfunction()

# orv_stb_image_sources(source...): sources of the current folder that stb_image is compiled in. Its JPEG decoder shifts
# zeros by too much if the data end early, which is harmless but reported.
function(orv_stb_image_sources)
    if(ORV_SANITIZE)
        set_property(SOURCE ${ARGN} APPEND PROPERTY COMPILE_OPTIONS -fno-sanitize=shift)
    endif()
endfunction()

# orv_link_options_if_known(target option...): adds the options that the linker supports.
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
