#pragma once

#include "orv/shaderuniform.h"

#include "support/gltest.h"
#include "support/logcapture.h"

#include <algorithm>

using Calls = std::vector<std::string>;

/// Records GL calls in a scope.
template <class Function>
Calls callsOf(const Function& function)
{
    glcalls::startRecording();
    function();
    glcalls::stopRecording();
    return glcalls::recorded();
}

/// A GL test of caches: fails if names are alive after flushing.
class FacilityTest : public support::GlTest
{
protected:
    void TearDown() override
    {
        flush();
        flush(); // assets used by those of the first round
        EXPECT_EQ("", glcalls::describeLiveNames());
        GlTest::TearDown();
    }

    /// Drops what the test still holds, and flushes its caches.
    virtual void flush() = 0;

    /// Replaces one value of the driver.
    static void replaceInteger(GLenum changed, GLint changedValue)
    {
        glcalls::replace(
            glGetIntegerv, [=](GLenum name, GLint* value)
            { name == changed ? void(*value = changedValue) : glcalls::real(glGetIntegerv)(name, value); });
    }
};

/// A holder with one value.
template <class T>
orv::SharedPtr<orv::ShaderUniformBase> makeValue(const T& value)
{
    auto holder = orv::makeShared<orv::ShaderUniform<T>>(1);
    holder->set(value);
    return holder;
}
