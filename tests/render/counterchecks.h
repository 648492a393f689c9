#pragma once

#include "glcalls/glcalls.h"

#include "orv/framecounters.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

/// The number of calls of these functions since the beginning of the scope.
inline uint64_t count(const std::vector<const char*>& names)
{
    uint64_t sum = 0;
    for (const char* name : names)
        sum += glcalls::count(name);
    return sum;
}

inline uint64_t countUniforms()
{
    return count({"glUniform1fv", "glUniform2fv", "glUniform3fv", "glUniform4fv", "glUniform1iv",
                  "glUniform2iv", "glUniform3iv", "glUniform4iv", "glUniformMatrix2fv", "glUniformMatrix3fv",
                  "glUniformMatrix4fv"});
}

/// All but what a program does itself, to have a context and to read its picture.
inline void expectSame(const orv::FrameCounters& counters, const char* what)
{
    EXPECT_EQ(count({"glDrawElements", "glDrawArrays"}), counters.draws) << what;
    EXPECT_EQ(countUniforms(), counters.uniforms) << what;
    EXPECT_EQ(count({"glUseProgram"}), counters.programs) << what;
    EXPECT_EQ(count({"glBindBuffer"}), counters.buffers) << what;
    EXPECT_EQ(count({"glVertexAttribPointer", "glVertexAttrib4fv", "glEnableVertexAttribArray",
                     "glDisableVertexAttribArray"}),
              counters.attributes)
        << what;
    EXPECT_EQ(count({"glBufferData", "glTexImage2D", "glCompressedTexImage2D"}), counters.uploads) << what;
}
