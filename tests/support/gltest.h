#pragma once

#include "glcalls/glcalls.h"
#include "headless/headless.h"

#include <gtest/gtest.h>

#include <memory>

namespace support
{

/// Fixture with a fresh, current GL context without a window: 64 x 64 pixels, depth 24, stencil 8.
///
/// Every test has a context of its own, since the engine trusts a new one to be in GL's initial state.
/// glcalls is reset before each test, and a test that leaves a GL error behind fails.
class GlTest : public testing::Test
{
protected:
    GlTest() = default;
    explicit GlTest(const headless::Options& options) : m_options(options) {}

    void SetUp() override;
    void TearDown() override;

    headless::Context& context() { return *m_context; }

    /// One more context, made current; go back with context().makeCurrent().
    std::unique_ptr<headless::Context> makeContext(int width = 64, int height = 64);

    /// The context is lost with all its objects and a new one is current.
    void replaceContext();

private:
    headless::Options m_options;
    std::unique_ptr<headless::Context> m_context;
};

} // namespace support
