#include "orv/shaderuniform.h"

#include "facilitytest.h"

using namespace orv;
using support::LogCapture;

// Fault caught: an index outside the array writes over other memory.
TEST(ShaderUniform, indexIsCheckedLoudlyOnWritingAndQuietlyOnReading)
{
    LogCapture log;
    const struct
    {
        int size; ///< below 1 counts as 1
        int index;
        bool inside;
    } cases[] = {{-5, 0, true}, {1, 1, false}, {3, 2, true}, {3, 3, false}, {3, -1, false}};
    for (const auto& test : cases)
    {
        ShaderUniform<float> uniform(test.size);
        ShaderUniformBase& base = uniform;
        float read = -1.0f;
        log.clear();
        EXPECT_EQ(test.inside, base.setValue(2.5f, test.index)) << test.size << " " << test.index;
        EXPECT_EQ(test.inside, base.getValue(read, test.index)) << test.size << " " << test.index;
        EXPECT_EQ(test.inside ? 2.5f : -1.0f, read);
        EXPECT_EQ(test.inside ? 0 : 1, log.count('E'));
    }
}

// Fault caught: a revision that stays although a value changed, or that changes without need.
TEST(ShaderUniform, revisionFollowsTheValues)
{
    ShaderUniform<Vector4f> uniform(2);
    uint64_t before = uniform.getRevision();
    uniform.setValue(Vector4f(1, 2, 3, 4), 1);
    EXPECT_NE(before, uniform.getRevision());
    before = uniform.getRevision();
    uniform.setValue(Vector4f(1, 2, 3, 4), 1);
    uniform.set(Vector4f(), 0);
    EXPECT_EQ(before, uniform.getRevision());
}

using ShaderUniformGlTest = support::GlTest;

// The plain form, as documented.
TEST_F(ShaderUniformGlTest, enableSendsWhatChanged)
{
    SharedPtr<ShaderUniformBase> source = makeShared<ShaderUniform<float>>(2);
    source->setValue(3.0f, 1);
    const SharedPtr<ShaderUniformBase> foreign = makeShared<ShaderUniform<int>>(2);
    const auto shorter = makeValue(9.0f);
    ShaderUniform<float> sent(2);
    const struct
    {
        SharedPtr<ShaderUniformBase> source;
        bool force;
        const char* call; ///< null for none
        int assertions;
    } steps[] = {
        {nullptr, false, nullptr, 0},
        {nullptr, true, "glUniform1fv(5, 2, {0, 0})", 0},
        {source, false, "glUniform1fv(5, 2, {0, 3})", 0},
        {source, false, nullptr, 0},
        {source, true, "glUniform1fv(5, 2, {0, 3})", 0},
        {foreign, false, nullptr, 0},
        {shorter, false, "glUniform1fv(5, 2, {9, 3})", 1},
    };
    glcalls::setDropped(glUniform1fv); // no program is there to take it
    int number = 0;
    for (const auto& step : steps)
    {
        LogCapture log;
        EXPECT_EQ(step.call ? Calls{step.call} : Calls{},
                  callsOf([&] { sent.enable(step.source, 5, -1, step.force); }))
            << "step " << number;
        EXPECT_EQ(step.assertions, log.countMessage("ORV_ASSERT: other->getSize() >= size"))
            << "step " << number;
        ++number;
    }
}

// Fault caught: more values than the conversion block holds.
TEST_F(ShaderUniformGlTest, booleansGoOutAsInts)
{
    SharedPtr<ShaderUniformBase> many = makeShared<ShaderUniform<Vector4<bool>>>(17);
    many->setValue(Vector4<bool>(false, false, false, true), 16);
    const auto bytes = makeValue(Vector2<unsigned char>(200, 3));
    std::string zeros = "{0";
    for (int i = 1; i < 67; ++i)
        zeros += ", 0";
    glcalls::setDropped(glUniform2iv);
    glcalls::setDropped(glUniform4iv);
    EXPECT_EQ((Calls{"glUniform2iv(2, 1, {200, 3})", "glUniform4iv(3, 17, " + zeros + ", 1})"}),
              callsOf(
                  [&]
                  {
                      ShaderUniform<Vector2<unsigned char>>(1).enable(bytes, 2, -1, false);
                      ShaderUniform<Vector4<bool>>(17).enable(many, 3, -1, false);
                  }));
}
