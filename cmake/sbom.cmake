# The bill of materials: the libraries that liborv and the tools contain and link with, as SPDX 2.3 in JSON. Versions
# are those of the Debian packages of the headers used by this build, or NOASSERTION. The same revision on the same
# distribution gives the same bytes.
#
# A test compares the list with the dynamic dependencies of the binaries.
set(sbom ${CMAKE_CURRENT_BINARY_DIR}/orv.spdx.json)
set(sbomPackages "")
set(sbomRelations "")

# orv_sbom_package(id name version licence purl): one entry of the list.
function(orv_sbom_package id name version licence purl)
    set(reference "")
    if(purl)
        set(reference ",
      \"externalRefs\": [{\"referenceCategory\": \"PACKAGE-MANAGER\", \"referenceType\": \"purl\",
        \"referenceLocator\": \"${purl}\"}]")
    endif()
    string(APPEND sbomPackages "    {
      \"SPDXID\": \"SPDXRef-${id}\",
      \"name\": \"${name}\",
      \"versionInfo\": \"${version}\",
      \"downloadLocation\": \"NOASSERTION\",
      \"filesAnalyzed\": false,
      \"licenseConcluded\": \"NOASSERTION\",
      \"licenseDeclared\": \"${licence}\",
      \"copyrightText\": \"NOASSERTION\"${reference}
    },
")
    set(sbomPackages "${sbomPackages}" PARENT_SCOPE)
endfunction()

# orv_sbom_relation(from KIND to)
function(orv_sbom_relation from kind to)
    string(APPEND sbomRelations "    {\"spdxElementId\": \"SPDXRef-${from}\", \"relationshipType\": \"${kind}\", \"relatedSpdxElement\": \"SPDXRef-${to}\"},\n")
    set(sbomRelations "${sbomRelations}" PARENT_SCOPE)
endfunction()

# orv_sbom_part(name header licence KIND user...): a third-party library, found by a header, that the users contain
# (CONTAINS) or link with (DYNAMIC_LINK).
function(orv_sbom_part name header licence kind)
    set(version NOASSERTION)
    set(purl "")
    find_program(DPKG_QUERY dpkg-query)
    mark_as_advanced(DPKG_QUERY)
    if(DPKG_QUERY)
        set(owner "")
        foreach(folder IN LISTS CMAKE_CXX_IMPLICIT_INCLUDE_DIRECTORIES)
            if(NOT owner AND EXISTS ${folder}/${header})
                execute_process(COMMAND ${DPKG_QUERY} -S ${folder}/${header} OUTPUT_VARIABLE owner ERROR_QUIET)
                string(REGEX MATCH "^[^:,\n]+" owner "${owner}")
            endif()
        endforeach()
        execute_process(COMMAND ${DPKG_QUERY} -W -f "\${source:Package} \${source:Version}\n" "${owner}"
            OUTPUT_VARIABLE source ERROR_QUIET)
        if(owner AND source MATCHES "^([^ \n]+) ([^\n]+)")
            set(version ${CMAKE_MATCH_2})
            string(REPLACE ":" "%3A" encoded "${version}")
            string(REPLACE "+" "%2B" encoded "${encoded}")
            set(purl "pkg:deb/debian/${CMAKE_MATCH_1}@${encoded}?arch=source")
        endif()
    endif()
    orv_sbom_package(${name} ${name} "${version}" "${licence}" "${purl}")
    foreach(user IN LISTS ARGN)
        orv_sbom_relation(${user} ${kind} ${name})
    endforeach()
    set(sbomPackages "${sbomPackages}" PARENT_SCOPE)
    set(sbomRelations "${sbomRelations}" PARENT_SCOPE)
endfunction()

set(ours liborv)
if(TARGET orv_convert)
    list(APPEND ours orv-convert orv-inspect orv-view)
endif()
foreach(name IN LISTS ours)
    orv_sbom_package(${name} ${name} "${PROJECT_VERSION}+${ORV_CHANGE_ID}" NOASSERTION "")
    orv_sbom_relation(DOCUMENT DESCRIBES ${name})
endforeach()
orv_sbom_part(stb stb/stb_image.h "MIT OR Unlicense" CONTAINS ${ours})
set(GCC "GPL-3.0-or-later WITH GCC-exception-3.1")
orv_sbom_part(libGLESv2 GLES2/gl2.h NOASSERTION DYNAMIC_LINK ${ours})
orv_sbom_part(libEGL EGL/egl.h NOASSERTION DYNAMIC_LINK ${ours})
orv_sbom_part(libstdc++ cstdlib "${GCC}" DYNAMIC_LINK ${ours})
orv_sbom_part(libc features.h "LGPL-2.1-or-later" DYNAMIC_LINK ${ours})
if(TARGET orv_convert)
    orv_sbom_part(CLI11 CLI/CLI.hpp BSD-3-Clause CONTAINS orv-convert orv-inspect orv-view)
    orv_sbom_part(nlohmann-json nlohmann/json.hpp MIT CONTAINS orv-convert orv-inspect)
    orv_sbom_part(libassimp assimp/scene.h BSD-3-Clause DYNAMIC_LINK orv-convert)
    orv_sbom_part(libdraco draco/compression/decode.h Apache-2.0 DYNAMIC_LINK orv-convert)
    orv_sbom_part(libmeshoptimizer meshoptimizer.h MIT DYNAMIC_LINK orv-convert)
    orv_sbom_part(libseccomp seccomp.h LGPL-2.1-only DYNAMIC_LINK orv-convert)
    orv_sbom_part(libwebp webp/decode.h BSD-3-Clause DYNAMIC_LINK orv-convert)
    orv_sbom_part(libz zlib.h Zlib DYNAMIC_LINK orv-convert orv-view)
    orv_sbom_part(libSDL2 SDL2/SDL.h Zlib DYNAMIC_LINK orv-view)
endif()
string(REGEX REPLACE ",\n$" "\n" sbomPackages "${sbomPackages}")
string(REGEX REPLACE ",\n$" "\n" sbomRelations "${sbomRelations}")

# The time of the change, not of the build.
set(sbomTime ${ORV_CHANGE_TIME})
if(sbomTime STREQUAL "")
    set(sbomTime 0)
endif()
set(epochBefore "$ENV{SOURCE_DATE_EPOCH}")
set(ENV{SOURCE_DATE_EPOCH} ${sbomTime})
string(TIMESTAMP sbomCreated "%Y-%m-%dT%H:%M:%SZ" UTC)
set(ENV{SOURCE_DATE_EPOCH} "${epochBefore}")
string(UUID sbomId NAMESPACE 6ba7b811-9dad-11d1-80b4-00c04fd430c8 NAME "${ORV_CHANGE_ID}${sbomPackages}" TYPE SHA1)
file(CONFIGURE OUTPUT ${sbom} @ONLY CONTENT "{
  \"spdxVersion\": \"SPDX-2.3\",
  \"dataLicense\": \"CC0-1.0\",
  \"SPDXID\": \"SPDXRef-DOCUMENT\",
  \"name\": \"orv-@PROJECT_VERSION@\",
  \"documentNamespace\": \"urn:uuid:@sbomId@\",
  \"creationInfo\": {\"created\": \"@sbomCreated@\", \"creators\": [\"Organization: the orv developers\"]},
  \"packages\": [
@sbomPackages@  ],
  \"relationships\": [
@sbomRelations@  ]
}
")
install(FILES ${sbom} DESTINATION share/doc/liborv-dev COMPONENT development)
