# Fault caught: a guide whose program is no longer the one that is built, or has outgrown its promise.
# Called with -DSOURCE=this project.
cmake_minimum_required(VERSION 3.22)

file(READ ${SOURCE}/docs/guide.md guide)
file(READ ${SOURCE}/examples/firstframe.cpp program)
string(FIND "${guide}" "```cpp\n${program}```" place)
if(place EQUAL -1)
    message(FATAL_ERROR "docs/guide.md does not hold examples/firstframe.cpp as it is")
endif()
string(REGEX MATCHALL "\n" lines "${program}")
list(LENGTH lines count)
if(NOT count LESS 50)
    message(FATAL_ERROR "examples/firstframe.cpp has ${count} lines; the guide promises fewer than fifty")
endif()
