# Sets ORV_CHANGE_ID to the source-control change that is being built.
set(ORV_CHANGE_ID unknown)
find_package(Git QUIET)
if(GIT_FOUND)
    execute_process(COMMAND ${GIT_EXECUTABLE} describe --always --dirty --abbrev=12
        WORKING_DIRECTORY ${PROJECT_SOURCE_DIR} OUTPUT_VARIABLE describedChange
        OUTPUT_STRIP_TRAILING_WHITESPACE ERROR_QUIET RESULT_VARIABLE describeFailed)
    if(NOT describeFailed)
        set(ORV_CHANGE_ID ${describedChange})
    endif()
endif()
