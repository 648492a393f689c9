# Sets ORV_CHANGE_ID to the revision that is built, and ORV_CHANGE_TIME to its time in seconds since 1970; empty if
# unknown.
set(ORV_CHANGE_ID unknown)
set(ORV_CHANGE_TIME "")
find_package(Git QUIET)
if(GIT_FOUND)
    execute_process(COMMAND ${GIT_EXECUTABLE} describe --always --dirty --abbrev=12
        WORKING_DIRECTORY ${PROJECT_SOURCE_DIR} OUTPUT_VARIABLE describedChange
        OUTPUT_STRIP_TRAILING_WHITESPACE ERROR_QUIET RESULT_VARIABLE describeFailed)
    if(NOT describeFailed)
        set(ORV_CHANGE_ID ${describedChange})
        execute_process(COMMAND ${GIT_EXECUTABLE} log -1 --format=%ct
            WORKING_DIRECTORY ${PROJECT_SOURCE_DIR} OUTPUT_VARIABLE ORV_CHANGE_TIME OUTPUT_STRIP_TRAILING_WHITESPACE)
    endif()
endif()
