# What `cmake --install` puts where, for programs that find the library by CMake or pkg-config; and the packages
# that cpack makes of it. Two components: runtime (the library) and development (everything else).
include(CMakePackageConfigHelpers)
set(CMAKE_SKIP_INSTALL_ALL_DEPENDENCY ON) # the library is enough

install(TARGETS orv orv_extra EXPORT orvTargets
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT runtime NAMELINK_COMPONENT development
    ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT development)

# The interface, with those of its inner headers that it includes itself; an installed-tree test holds the two
# against each other.
foreach(room common maths pss facility render extra)
    install(DIRECTORY engine/${room}/api/orv DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT development
        FILES_MATCHING PATTERN "*.h"
        PATTERN "detail/boundsrevision.h" EXCLUDE
        PATTERN "detail/digestmaker.h" EXCLUDE
        PATTERN "detail/eyes.h" EXCLUDE
        PATTERN "detail/formattedtext.h" EXCLUDE
        PATTERN "detail/littleendian.h" EXCLUDE
        PATTERN "detail/loadscope.h" EXCLUDE
        PATTERN "detail/logbudget.h" EXCLUDE
        PATTERN "detail/textstatement.h" EXCLUDE)
endforeach()

set(package ${CMAKE_INSTALL_LIBDIR}/cmake/orv)
install(EXPORT orvTargets NAMESPACE orv:: DESTINATION ${package} COMPONENT development)
file(CONFIGURE OUTPUT orvConfig.cmake @ONLY CONTENT
"# find_package(orv) gives the target orv::orv. Nothing has to be found along with it: programs that call OpenGL ES
# or EGL themselves link those themselves. A source that derives from a class of the library is compiled with
# -fno-rtti, as the library is.
include(\"\${CMAKE_CURRENT_LIST_DIR}/orvTargets.cmake\")
")
write_basic_package_version_file(${CMAKE_CURRENT_BINARY_DIR}/orvConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/orvConfig.cmake ${CMAKE_CURRENT_BINARY_DIR}/orvConfigVersion.cmake
    DESTINATION ${package} COMPONENT development)

# The prefix is found from where the file lies, so that the tree may be moved.
file(RELATIVE_PATH prefixFromPc /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
file(CONFIGURE OUTPUT orv.pc @ONLY CONTENT
"prefix=\${pcfiledir}/@prefixFromPc@
libdir=\${prefix}/@CMAKE_INSTALL_LIBDIR@
includedir=\${prefix}/@CMAKE_INSTALL_INCLUDEDIR@

Name: orv
Description: Compact real-time 3D engine for OpenGL ES 2.0; its headers need C++20
Version: @PROJECT_VERSION@
Cflags: -I\${includedir}
Libs: -L\${libdir} -lorvextra -lorv
")
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/orv.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)

file(GLOB pages docs/*.md)
install(FILES README.md CHANGELOG.md SECURITY.md ${pages} DESTINATION share/doc/liborv-dev COMPONENT development)
install(FILES examples/firstframe.cpp DESTINATION share/doc/liborv-dev/examples COMPONENT development)
install(FILES cmake/copyright DESTINATION share/doc/liborv${PROJECT_VERSION_MAJOR} COMPONENT runtime)
install(FILES cmake/copyright DESTINATION share/doc/liborv-dev COMPONENT development)

# Packages: cpack in the build folder. Two for Debian, as its own libraries have them.
set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_VENDOR orv)
set(CPACK_PACKAGE_CONTACT "the orv developers <orv@localhost>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "compact real-time 3D engine for OpenGL ES 2.0")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_COMPONENTS_ALL runtime development)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_NAME liborv${PROJECT_VERSION_MAJOR})
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_CONTROL_EXTRA ${CMAKE_CURRENT_BINARY_DIR}/triggers)
file(WRITE ${CMAKE_CURRENT_BINARY_DIR}/triggers "activate-noawait ldconfig\n")
set(CPACK_COMPONENT_RUNTIME_DESCRIPTION "The shared library, for the programs that need it.")
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME liborv-dev)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS "liborv${PROJECT_VERSION_MAJOR} (= ${PROJECT_VERSION})")
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION "Headers, documentation and what CMake and pkg-config need.")

# Packing the same change gives the same bytes: files in a package are as old as the change.
file(CONFIGURE OUTPUT packagetime.cmake @ONLY CONTENT
"if(NOT DEFINED ENV{SOURCE_DATE_EPOCH} AND NOT \"@ORV_CHANGE_TIME@\" STREQUAL \"\")
    set(ENV{SOURCE_DATE_EPOCH} @ORV_CHANGE_TIME@)
endif()
")
set(CPACK_PROJECT_CONFIG_FILE ${CMAKE_CURRENT_BINARY_DIR}/packagetime.cmake)
include(CPack)
