# Rules of `cmake --install`, for programs that find the library with CMake or pkg-config, and of cpack's packages.
# Components: runtime (the shared library, not in a static build), development, and tools if they are built.
include(CMakePackageConfigHelpers)
set(CMAKE_SKIP_INSTALL_ALL_DEPENDENCY ON) # the library is enough

install(TARGETS orv orv_extra EXPORT orvTargets
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT runtime NAMELINK_COMPONENT development
    ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT development)

# The interface, and the inner headers that it includes; a test of the installed tree checks this list.
foreach(room common maths pss facility render extra)
    install(DIRECTORY engine/${room}/api/orv DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT development
        FILES_MATCHING PATTERN "*.h"
        PATTERN "detail/boundsrevision.h" EXCLUDE
        PATTERN "detail/digestmaker.h" EXCLUDE
        PATTERN "detail/embeddedassets.h" EXCLUDE
        PATTERN "detail/eyes.h" EXCLUDE
        PATTERN "detail/fonttables.h" EXCLUDE
        PATTERN "detail/formattedtext.h" EXCLUDE
        PATTERN "detail/lanes.h" EXCLUDE
        PATTERN "detail/littleendian.h" EXCLUDE
        PATTERN "detail/loadscope.h" EXCLUDE
        PATTERN "detail/logbudget.h" EXCLUDE
        PATTERN "detail/modelprojection.h" EXCLUDE
        PATTERN "detail/textstatement.h" EXCLUDE
        PATTERN "detail/utf8.h" EXCLUDE)
endforeach()

set(package ${CMAKE_INSTALL_LIBDIR}/cmake/orv)
install(EXPORT orvTargets NAMESPACE orv:: DESTINATION ${package} COMPONENT development)
file(RELATIVE_PATH toolsFolder /${package} /${CMAKE_INSTALL_BINDIR})
file(CONFIGURE OUTPUT orvConfig.cmake @ONLY CONTENT
"# find_package(orv) gives the target orv::orv, which brings GLESv2 along, and orv_add_scenes for models (see
# orvScenes.cmake). Nothing has to be found along with it: programs that call EGL themselves link that themselves. A
# source that derives from a class of the library is compiled with -fno-rtti, as the library is.
include(\"\${CMAKE_CURRENT_LIST_DIR}/orvTargets.cmake\")
include(\"\${CMAKE_CURRENT_LIST_DIR}/orvScenes.cmake\")
set(ORV_TOOLS_FOLDER \"\${CMAKE_CURRENT_LIST_DIR}/@toolsFolder@\")
")
write_basic_package_version_file(${CMAKE_CURRENT_BINARY_DIR}/orvConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/orvConfig.cmake ${CMAKE_CURRENT_BINARY_DIR}/orvConfigVersion.cmake
    cmake/orvScenes.cmake DESTINATION ${package} COMPONENT development)

# For a static library its dependencies are listed, with --static or without. The prefix is relative to the file, so
# that the tree may be moved.
file(RELATIVE_PATH prefixFromPc /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
file(CONFIGURE OUTPUT orv.pc @ONLY CONTENT
"prefix=\${pcfiledir}/@prefixFromPc@
libdir=\${prefix}/@CMAKE_INSTALL_LIBDIR@
includedir=\${prefix}/@CMAKE_INSTALL_INCLUDEDIR@

Name: orv
Description: Compact real-time 3D engine for OpenGL ES 2.0; its headers need C++20
Version: @PROJECT_VERSION@
Cflags: -I\${includedir}
Libs: -L\${libdir} -lorvextra -lorv -lGLESv2 @ORV_STATIC_LIBS@
")
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/orv.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)

# The pages are installed with the tree's folders, so that their links work.
set(pages share/doc/liborv-dev)
install(FILES README.md CHANGELOG.md CONTRIBUTING.md SECURITY.md cmake/copyright DESTINATION ${pages}
    COMPONENT development)
install(DIRECTORY docs/ DESTINATION ${pages}/docs COMPONENT development PATTERN Doxyfile.in EXCLUDE)
install(DIRECTORY examples/ DESTINATION ${pages}/examples COMPONENT development PATTERN CMakeLists.txt EXCLUDE)
if(NOT ORV_STATIC)
    install(FILES cmake/copyright DESTINATION share/doc/liborv${PROJECT_VERSION_MAJOR} COMPONENT runtime)
endif()

if(TARGET orv_convert)
    include(installtools)
endif()
include(sbom)

# Packages, made by cpack in the build folder and divided like Debian's own libraries.
set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_VENDOR orv)
set(CPACK_PACKAGE_CONTACT "the orv developers <orv@localhost>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "compact real-time 3D engine for OpenGL ES 2.0")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_COMPONENTS_ALL development)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS libgles-dev) # needed by orvextra
if(NOT ORV_STATIC)
    list(APPEND CPACK_COMPONENTS_ALL runtime)
    string(PREPEND CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS "liborv${PROJECT_VERSION_MAJOR} (= ${PROJECT_VERSION}), ")
endif()
if(TARGET orv_convert)
    list(APPEND CPACK_COMPONENTS_ALL tools)
endif()
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
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION "Headers, documentation and what CMake and pkg-config need.")
set(CPACK_DEBIAN_TOOLS_PACKAGE_NAME orv-tools)
set(CPACK_DEBIAN_TOOLS_PACKAGE_SECTION graphics)
set(CPACK_DEBIAN_TOOLS_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_TOOLS_PACKAGE_RECOMMENDS fonts-dejavu-core)
set(CPACK_COMPONENT_TOOLS_DESCRIPTION "Programs that convert models to scenes, look at them and look into them.")

# Files in packages have the time of the revision, so that packing it again gives the same bytes.
file(CONFIGURE OUTPUT packagetime.cmake @ONLY CONTENT
"if(NOT DEFINED ENV{SOURCE_DATE_EPOCH} AND NOT \"@ORV_CHANGE_TIME@\" STREQUAL \"\")
    set(ENV{SOURCE_DATE_EPOCH} @ORV_CHANGE_TIME@)
endif()
")
set(CPACK_PROJECT_CONFIG_FILE ${CMAKE_CURRENT_BINARY_DIR}/packagetime.cmake)
include(CPack)
