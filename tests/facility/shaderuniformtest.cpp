#include "orv/shaderuniform.h"

#include "orv/texture2dcache.h"
#include "orv/texturecube.h"

#include "support/gltest.h"
#include "support/logcapture.h"

using namespace orv;
using support::LogCapture;

// Fault caught: an index outside the array writes over other memory.
TEST(ShaderUniform, indexIsCheckedLoudlyOnWritingAndQuietlyOnReading)
{
    const struct
    {
        int size;
        int index;
        bool inside;
    } cases[] = {{1, 0, true}, {1, 1, false}, {1, -1, false}, {3, 2, true}, {3, 3, false}, {3, -1, false}};
    for (const auto& test : cases)
    {
        ShaderUniform<float> uniform(test.size);
        ShaderUniformBase& base = uniform;
        float read = -1.0f;
        {
            LogCapture log;
            EXPECT_EQ(test.inside, base.setValue(2.5f, test.index)) << test.size << " " << test.index;
            EXPECT_EQ(test.inside ? 0 : 1, log.count('E'));
        }
        LogCapture log;
        EXPECT_EQ(test.inside, base.getValue(read, test.index)) << test.size << " " << test.index;
        EXPECT_EQ(test.inside ? 2.5f : -1.0f, read);
        EXPECT_EQ(0, log.count('E'));
    }
}

TEST(ShaderUniform, sizeBelowOneCountsAsOne)
{
    for (const int size : {0, -5})
    {
        LogCapture log;
        ShaderUniform<Vector3f> uniform(size);
        EXPECT_EQ(1, uniform.getSize());
        EXPECT_EQ(Vector3f(), uniform.get());
        EXPECT_EQ(1, log.countMessage("Uniform size must be greater than zero; setting to 1"));
    }
}

// Fault caught: a stamp that stays although a value changed (the change never reaches GL), or that moves without a
// change (every draw compares again).
TEST(ShaderUniform, revisionFollowsTheValues)
{
    ShaderUniform<Vector4f> uniform(2);
    ShaderUniform<Vector4f> other(2);
    EXPECT_NE(uniform.getRevision(), other.getRevision());

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
    const SharedPtr<ShaderUniformBase> foreign = makeShared<ShaderUniform<int>>(2);
    const SharedPtr<ShaderUniformBase> shorter = makeShared<ShaderUniform<float>>(1);
    ShaderUniform<float> sent(2);
    source->setValue(3.0f, 1);
    shorter->setValue(9.0f, 0);

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
        glcalls::startRecording();
        sent.enable(step.source, 5, -1, step.force);
        const std::vector<std::string> expected(step.call ? 1 : 0, step.call ? step.call : "");
        EXPECT_EQ(expected, glcalls::recorded()) << "step " << number;
        EXPECT_EQ(step.assertions, log.countMessage("ORV_ASSERT: other->getSize() >= size"))
            << "step " << number;
        ++number;
    }
}

// Fault caught: more values than the conversion block holds.
TEST_F(ShaderUniformGlTest, booleansGoOutAsInts)
{
    const SharedPtr<ShaderUniformBase> few = makeShared<ShaderUniform<Vector3<bool>>>(1);
    few->setValue(Vector3<bool>(true, false, true), 0);
    const SharedPtr<ShaderUniformBase> bytes = makeShared<ShaderUniform<Vector2<unsigned char>>>(1);
    bytes->setValue(Vector2<unsigned char>(200, 3), 0);
    const SharedPtr<ShaderUniformBase> many = makeShared<ShaderUniform<Vector4<bool>>>(17);
    many->setValue(Vector4<bool>(false, false, false, true), 16);

    glcalls::dropAll();
    glcalls::startRecording();
    ShaderUniform<Vector3<bool>>(1).enable(few, 1, -1, false);
    ShaderUniform<Vector2<unsigned char>>(1).enable(bytes, 2, -1, false);
    ShaderUniform<Vector4<bool>>(17).enable(many, 3, -1, false);
    ASSERT_EQ(3u, glcalls::recorded().size());
    EXPECT_EQ("glUniform3iv(1, 1, {1, 0, 1})", glcalls::recorded()[0]);
    EXPECT_EQ("glUniform2iv(2, 1, {200, 3})", glcalls::recorded()[1]);
    std::string zeros = "{0";
    for (int i = 1; i < 67; ++i)
        zeros += ", 0";
    EXPECT_EQ("glUniform4iv(3, 17, " + zeros + ", 1})", glcalls::recorded()[2]);
    glcalls::dropAll(false);
}

// The first texture of an array goes to every unit of it.
TEST_F(ShaderUniformGlTest, samplerArrayBindsItsFirstTexture)
{
    const SharedPtr<Texture2DCache> cache = makeShared<Texture2DCache>();
    SharedPtr<Texture2D> texture =
        cache->create(1, 1, Texture::Format::RGBA, Texture::Type::UNSIGNED_BYTE, "abcd", nullptr);
    const std::string name = std::to_string(texture->getId());
    SharedPtr<ShaderUniformBase> source = makeShared<ShaderUniform<SharedPtr<Texture2D>>>(2);
    source->setValue(texture, 0);

    glcalls::setDropped(glUniform1iv);
    glcalls::startRecording();
    ShaderUniform<SharedPtr<Texture2D>>(2).enable(source, 4, 3, false);
    glcalls::stopRecording();
    const std::vector<std::string> expected = {
        "glActiveTexture(0x84c3)", "glBindTexture(0x0de1, " + name + ")", "glActiveTexture(0x84c4)",
        "glBindTexture(0x0de1, " + name + ")", "glUniform1iv(4, 2, {3, 4})"};
    std::vector<std::string> calls = glcalls::recorded();
    std::erase_if(calls, [](const std::string& call) { return call.find("glGet") == 0; });
    EXPECT_EQ(expected, calls);

    source.reset();
    texture.reset();
    cache->flush();
}
