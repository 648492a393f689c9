# Models as part of a build.
#
#   orv_add_scenes(TARGET model... [OUT folder] [OPTIONS option...])
#
# Converts each model with orv-convert, whenever the model or a file that it uses has changed, or the folder of a file
# that it lacked, or of one whose name make cannot hold (a;b.png); parallel builds convert several models at a time.
#
# TARGET   an existing target, such as the program that shows the scenes, which are made before it; otherwise the name
#          of a new target that is part of ALL. Its property ORV_SCENES lists the scene files.
#          Another call with the same target adds to them, with options of its own.
# model    a file, from the current source folder; "duck.dae" becomes "duck.glo". Two of one name are refused.
# OUT      the folder for scenes and textures; by default the current build folder.
# OPTIONS  for orv-convert, such as --fps 60.
#
# The converter is that of this build, or the one installed beside the library, or one on the PATH; the variable
# ORV_CONVERT overrides it.
function(orv_add_scenes target)
    cmake_policy(PUSH)
    cmake_policy(VERSION 3.22)
    cmake_parse_arguments(PARSE_ARGV 1 SCENES "" "OUT" "OPTIONS")
    if(NOT SCENES_UNPARSED_ARGUMENTS)
        message(FATAL_ERROR "orv_add_scenes(${target}): no models are named")
    endif()
    set(converter orv_convert)
    if(NOT TARGET orv_convert)
        find_program(ORV_CONVERT orv-convert HINTS ${ORV_TOOLS_FOLDER} DOC "Makes scene files of models")
        if(NOT ORV_CONVERT)
            message(FATAL_ERROR "orv_add_scenes(${target}): there is no orv-convert; install orv's tools or set ORV_CONVERT")
        endif()
        set(converter ${ORV_CONVERT})
    endif()

    set(folder ${CMAKE_CURRENT_BINARY_DIR})
    if(SCENES_OUT)
        get_filename_component(folder ${SCENES_OUT} ABSOLUTE BASE_DIR ${CMAKE_CURRENT_BINARY_DIR})
    endif()
    file(MAKE_DIRECTORY ${folder})
    set(scenes "")
    set(others "") # of calls before
    if(TARGET ${target})
        get_property(others TARGET ${target} PROPERTY ORV_SCENES)
    endif()
    foreach(model IN LISTS SCENES_UNPARSED_ARGUMENTS)
        get_filename_component(model ${model} ABSOLUTE)
        get_filename_component(name ${model} NAME_WLE)
        set(scene ${folder}/${name}.glo)
        if(scene IN_LIST scenes OR scene IN_LIST others)
            message(FATAL_ERROR "orv_add_scenes(${target}): two models would become ${scene}")
        endif()
        add_custom_command(OUTPUT ${scene}
            COMMAND ${converter} ${model} ${scene} --depfile ${scene}.d ${SCENES_OPTIONS}
            DEPENDS ${model} ${converter} DEPFILE ${scene}.d VERBATIM COMMENT "Converting ${model}")
        list(APPEND scenes ${scene})
    endforeach()

    if(TARGET ${target})
        list(LENGTH others number)
        set(name ${target}_scenes)
        if(TARGET ${name})
            string(APPEND name ${number})
        endif()
        add_custom_target(${name} DEPENDS ${scenes})
        add_dependencies(${target} ${name})
    else()
        add_custom_target(${target} ALL DEPENDS ${scenes})
    endif()
    set_property(TARGET ${target} APPEND PROPERTY ORV_SCENES ${scenes})
    cmake_policy(POP)
endfunction()
