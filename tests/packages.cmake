# Fault caught: a Debian package with missing or wrong files, or without dependencies.
# Called with -DBUILD=build folder -DWORK=scratch folder -DCPACK=cpack.
file(REMOVE_RECURSE ${WORK})
execute_process(COMMAND ${CPACK} --config ${BUILD}/CPackConfig.cmake -B ${WORK} OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)

# check(name dependencies of the package, then what it holds as patterns of paths, at the least and nothing else)
function(check name depends)
    file(GLOB package ${WORK}/${name}_*.deb)
    execute_process(COMMAND dpkg-deb -f ${package} Depends OUTPUT_VARIABLE found COMMAND_ERROR_IS_FATAL ANY)
    if(NOT found MATCHES "${depends}")
        message(SEND_ERROR "${name} depends on: ${found}")
    endif()
    execute_process(COMMAND dpkg-deb -c ${package} OUTPUT_VARIABLE listing COMMAND_ERROR_IS_FATAL ANY)
    string(REGEX MATCHALL "\\./[^\n]*" files "${listing}")
    list(FILTER files EXCLUDE REGEX "/$")
    foreach(wanted IN LISTS ARGN)
        set(left ${files})
        list(FILTER left EXCLUDE REGEX "${wanted}")
        if(left STREQUAL files)
            message(SEND_ERROR "${name} holds no ${wanted}")
        endif()
        set(files ${left})
    endforeach()
    if(files)
        message(SEND_ERROR "${name} holds as well: ${files}")
    endif()
endfunction()

check(liborv1 "libc6.*libegl1.*libgles2.*libstdc" "/liborv\\.so\\.1" "/usr/share/doc/liborv1/copyright")
check(liborv-dev "liborv1 \\(= " "/liborv\\.so -> liborv\\.so\\.1" "/liborvextra\\.a" "/usr/include/orv/orv\\.h" "/usr/include/orv/.*\\.h"
    "/cmake/orv/orvConfig\\.cmake" "/cmake/orv/orv.*\\.cmake" "/pkgconfig/orv\\.pc" "/share/doc/liborv-dev/copyright"
    "/share/doc/liborv-dev/")
if(EXISTS ${CMAKE_CURRENT_LIST_DIR}/../build/web/page) # built by ./run web, and then installed
    set(page "/share/orv/web/")
endif()
check(orv-tools "libassimp.*libsdl2" "/usr/bin/orv-convert" "/usr/bin/orv-inspect" "/usr/bin/orv-view"
    "/man1/orv-(convert|inspect|view)\\.1" "/bash-completion/completions/orv-" "/zsh/vendor-completions/_orv-"
    "/fish/vendor_completions\\.d/orv-.*\\.fish" "/applications/orv-view\\.desktop"
    "/thumbnailers/orv-view\\.thumbnailer" "/mime/packages/orv\\.xml" "/share/doc/orv-tools/copyright" ${page})
