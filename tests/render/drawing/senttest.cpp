#include "scenetest.h"

#include "orv/meshutil.h"
#include "orv/motionblurrenderer.h"

#include <random>

using namespace orv;

/// Random frames compared with the simplest method: every uniform looked up by name for every draw. Each draw reads the
/// uniforms of its program from GL.
class SentTest : public SceneTest
{
protected:
    static constexpr int MATERIALS = 5;
    static constexpr int SOLIDS = 12;

    struct NamedUniform
    {
        const char* name;
        GLenum type;
        GLint location;
        int index; ///< in the program
    };

    struct Program
    {
        SharedPtr<ShaderProgram> program;
        std::vector<NamedUniform> uniforms;
        std::vector<SharedPtr<ShaderUniformBase>> values; ///< set from outside, by index
    };

    void SetUp() override
    {
        SceneTest::SetUp();
        blur = makeShared<MotionBlurRenderer>(renderContext, pool);
        renderContext->addProperty(renderContext->getProperty("T_MODEL"), "MODEL_BY_ANOTHER_NAME");
        for (int i = 0; i < 2; ++i)
            programs.push_back(addProgram());
        for (int i = 0; i < MATERIALS; ++i)
        {
            materials.push_back(makeShared<Appearance>());
            materials.back()->setShaderProgram(programs[size_t(i) % 2].program);
            materials.back()->setCullingMode(CullingMode::CULL_NONE);
        }
        const Mesh::Ptr mesh = createSquareMesh(*pool->getMeshCache(), Vector2f(1, 1));
        for (int i = 0; i < SOLIDS; ++i)
        {
            solids.push_back(makeShared<Solid>(mesh, materials[size_t(i) % MATERIALS]));
            solids.back()->setParent(scene);
        }
        glcalls::replace(glDrawElements, [this](GLenum, GLsizei, GLenum, const void*) { checkDraw(); });
    }

    void TearDown() override
    {
        glcalls::restore(glDrawElements);
        programs.clear();
        materials.clear();
        solids.clear();
        blur = nullptr;
        SceneTest::TearDown();
    }

    Program addProgram()
    {
        static const char* const VERTEX =
            "attribute vec3 a_position; uniform mat4 u_a, u_b, u_c, u_pair[2]; uniform mat3 u_n, u_m;"
            "varying vec3 v; void main() { v = u_n * u_m * a_position;"
            "gl_Position = u_a * u_b * u_c * u_pair[0] * u_pair[1] * vec4(a_position, 1.0); }";
        static const char* const FRAGMENT =
            "precision mediump float; uniform vec4 u_v, u_w; uniform float u_f; uniform sampler2D u_t; "
            "varying vec3 v;"
            "void main() { gl_FragColor = u_v + u_w + texture2D(u_t, v.xy) * (u_f + v.z); }";
        Program made = {pool->getShaderProgramCache()->create(VERTEX, FRAGMENT, nullptr), {}, {}};
        for (int i = 0; i < made.program->getUniformCount(); ++i)
        {
            const char* const name = made.program->getUniformInstanceName(i);
            const GLenum type = name[2] == 'n' || name[2] == 'm'   ? GL_FLOAT_MAT3
                                : name[2] == 'v' || name[2] == 'w' ? GL_FLOAT_VEC4
                                : name[2] == 'f'                   ? GL_FLOAT
                                : name[2] == 't'                   ? GL_SAMPLER_2D
                                                                   : GL_FLOAT_MAT4;
            made.uniforms.push_back({name, type, glGetUniformLocation(made.program->getId(), name), i});
            made.values.emplace_back();
            made.program->setUniformPropertyName(i, pickName(type));
        }
        return made;
    }

    int pick(int count) { return int(random() % unsigned(count)); }
    float number() { return float(pick(7)) - 3.0f; } // few, so that equal ones meet
    Vector3f vector() { return Vector3f(number(), number(), number()); }
    Vector4f vector4() { return Vector4f(vector(), number()); }
    Matrix3f matrix3() { return Matrix3f(vector(), vector(), vector()); }
    Matrix4f matrix4() { return Matrix4f(vector4(), vector4(), vector4(), vector4()); }

    const char* pickName(GLenum type)
    {
        static const char* const MATRICES[] = {"T_MODEL",
                                               "T_MODEL_VIEW",
                                               "T_MODEL_VIEW_PROJECTION",
                                               "T_VIEW",
                                               "MODEL_BY_ANOTHER_NAME",
                                               "M_MATRIX",
                                               "T_OLD_MODEL_VIEW_PROJECTION",
                                               "T_MODEL"};
        static const char* const VECTORS[] = {"M_COLOUR", "M_DIFFUSE_COLOUR", "FOG_COLOUR",
                                              "T_CAMERA_POSITION", "T_MODEL"};
        static const char* const FLOATS[] = {"TIME", "M_OPACITY", "FOG_DENSITY", "M_NOTHING"};
        switch (type)
        {
        case GL_FLOAT_MAT4: return MATRICES[pick(int(std::size(MATRICES)))];
        case GL_FLOAT_MAT3: return pick(3) ? "T_NORMAL_MODEL" : "M_MATRIX_3";
        case GL_FLOAT_VEC4: return VECTORS[pick(int(std::size(VECTORS)))];
        case GL_FLOAT: return FLOATS[pick(int(std::size(FLOATS)))];
        default: return pick(2) ? "M_DIFFUSE_TEXTURE" : "M_BLACK_TEXTURE";
        }
    }

    /// Of a type that suits the uniform, mostly.
    SharedPtr<ShaderUniformBase> pickHolder(GLenum type)
    {
        if (pick(3) == 0)
            return renderContext->getProperty(pickName(type)); // one holder that is read by two names
        if (type == GL_FLOAT_VEC4)
        {
            const auto holder = makeShared<ShaderUniform<Vector4f>>(1);
            holder->set(vector4());
            return holder;
        }
        const auto holder = makeShared<ShaderUniform<Matrix4f>>(2);
        holder->set(matrix4());
        return holder;
    }

    void changeMaterial(Appearance& material)
    {
        switch (pick(9))
        {
        case 0: material.setProperty("M_COLOUR", vector4()); break;
        case 1: material.setProperty("M_DIFFUSE_COLOUR", vector4()); break;
        case 2: material.setProperty("M_MATRIX", matrix4()); break;
        case 3: material.setProperty("M_MATRIX_3", matrix3()); break;
        case 4: material.setProperty("M_OPACITY", number()); break;
        case 5: material.addProperty<float>("M_OPACITY", 1); break;
        case 6: material.setProperty("T_MODEL", matrix4()); break; // wins over the renderer's
        case 7: material.addProperty<Vector4f>("M_COLOUR", 1); break;
        default: material.setShaderProgram(programs[size_t(pick(2))].program); break;
        }
    }

    void changeProgram(Program& program)
    {
        const NamedUniform& uniform = program.uniforms[size_t(pick(int(program.uniforms.size())))];
        if (pick(2))
        {
            program.program->setUniformPropertyName(uniform.index, pickName(uniform.type));
            for (const auto& material : materials)
                material->addProperty<int>("M_NEW", 1); // which has names looked up again
            return;
        }
        SharedPtr<ShaderUniformBase>& value = program.values[size_t(uniform.index)];
        value = pick(2) && uniform.type != GL_SAMPLER_2D ? pickHolder(uniform.type) : nullptr;
        program.program->setUniformPropertyValue(uniform.index, value);
    }

    template <class T>
    void setProperty(const char* name, const T& value)
    {
        ASSERT_TRUE(renderContext->getProperty(name)->setValue(value, 0)) << name;
    }

    void changeAnything()
    {
        Solid& solid = *solids[size_t(pick(SOLIDS))];
        Program& program = programs[size_t(pick(2))];
        switch (pick(14))
        {
        case 0: solid.setPosition(vector()); break;
        case 1: solid.setScale(vector()); break;
        case 2: solid.setRotation(quaternionFromAxisAngle(vector(), Anglef::fromRadians(number()))); break;
        case 3: camera->setPosition(vector()); break;
        case 4: solid.setAppearance(materials[size_t(pick(MATERIALS))]); break;
        case 5: setProperty("FOG_COLOUR", vector4()); break;
        case 6: setProperty("FOG_DENSITY", number()); break;
        case 7: setProperty("T_MODEL", matrix4()); break;
        case 8: renderer->update(number()); break;
        case 9: changeProgram(program); break;
        case 10: // by hand, in between
            program.program->enable(*renderContext);
            glUseProgram(program.program->getId());
            program.program->enableUniforms();
            break;
        case 11: blur->render(nullptr, *scene, FlagMask(), FlagMask()); break;
        case 12:
            renderContext->getProperty("T_MODEL")->enable(pickHolder(GL_FLOAT_MAT4), -1, -1, false);
            break;
        default: changeMaterial(*materials[size_t(pick(MATERIALS))]); break;
        }
    }

    /// The value that the renderer has to compute for the solid, if the holder is one of its transforms.
    bool findTransform(const ShaderUniformBase* holder, const Solid& solid, Matrix4f& transform) const
    {
        Matrix4f projection;
        camera->getProjection(&projection, 1.0f);
        const Matrix4f modelView = inverse(camera->getWorldTransform()) * solid.getWorldTransform();
        const std::pair<const char*, Matrix4f> known[] = {
            {"T_MODEL", solid.getWorldTransform()},
            {"T_MODEL_VIEW", modelView},
            {"T_MODEL_VIEW_PROJECTION", projection * modelView}};
        for (const auto& [name, value] : known)
        {
            if (renderContext->getProperty(name).get() == holder)
            {
                transform = value;
                return true;
            }
        }
        return false;
    }

    /// @return the count of floats that the uniform has to have; 0 for one that keeps what it has.
    int findExpected(const Program& program, const NamedUniform& uniform, const Solid& solid,
                     Appearance& material, float (&expected)[16]) const
    {
        const char* const name = program.program->getUniformPropertyName(uniform.index);
        SharedPtr<ShaderUniformBase> holder = material.getPropertyUniform(name);
        if (!holder)
            holder = program.values[size_t(uniform.index)];
        if (!holder)
            holder = renderContext->getProperty(name);
        if (!holder)
            return 0;
        Matrix4f m4;
        Matrix3f m3;
        Vector4f v4;
        float single = 0.0f;
        const auto take = [&expected](const float* values, int count)
        {
            std::copy_n(values, count, expected);
            return count;
        };
        if (uniform.type == GL_FLOAT_MAT4 && holder->getValue(m4, 0))
        {
            if (isRendering)
                findTransform(holder.get(), solid, m4);
            return take(m4.data(), 16);
        }
        if (uniform.type == GL_FLOAT_MAT3 && holder->getValue(m3, 0))
        {
            if (isRendering && holder == renderContext->getProperty("T_NORMAL_MODEL"))
                m3 = solid.getNormalTransform();
            return take(m3.data(), 9);
        }
        if (uniform.type == GL_FLOAT_VEC4 && holder->getValue(v4, 0))
            return take(v4.data(), 4);
        return uniform.type == GL_FLOAT && holder->getValue(single, 0) ? take(&single, 1) : 0;
    }

    void checkDraw()
    {
        if (nextDraw >= drawn.size())
            return; // not ours
        const Solid& solid = *drawn[nextDraw++];
        Appearance& material = *solid.getAppearance();
        const size_t which = material.getShaderProgram() == programs[0].program ? 0 : 1;
        const Program& program = programs[which];
        for (const NamedUniform& uniform : program.uniforms)
        {
            float expected[16] = {};
            float actual[16] = {};
            const int count = findExpected(program, uniform, solid, material, expected);
            if (count > 0)
                glGetUniformfv(program.program->getId(), uniform.location, actual);
            for (int i = 0; i < count; ++i)
                ASSERT_NEAR(expected[i], actual[i], 1e-4f + 1e-4f * std::abs(expected[i]))
                    << "frame " << frame << ", draw " << nextDraw << ", program " << which << ", "
                    << uniform.name << "[" << i << "] from "
                    << program.program->getUniformPropertyName(uniform.index);
        }
        checks += program.uniforms.size();
    }

    std::mt19937 random{17};
    SharedPtr<MotionBlurRenderer> blur;
    std::vector<Program> programs;
    std::vector<SharedPtr<Appearance>> materials;
    std::vector<SharedPtr<Solid>> solids;
    std::vector<const Solid*> drawn; ///< to be drawn, in order
    size_t nextDraw = 0;
    size_t checks = 0;
    int frame = 0;
    bool isRendering = false;
};

// Fault caught: a stale uniform taken as up to date: fed from elsewhere, set twice, read by two names, or set by
// another material, a direct draw or the application.
TEST_F(SentTest, uniformsAreWhatTheirNamesSay)
{
    support::LogCapture log; // arrays of two that take one matrix are asserted
    for (frame = 0; frame < 3000 && !HasFatalFailure(); ++frame)
    {
        for (int changes = pick(4); changes > 0; --changes)
            changeAnything();
        drawn.clear();
        for (const auto& solid : solids)
            drawn.push_back(solid.get());
        nextDraw = 0;
        isRendering = true;
        if (pick(3) == 0)
            drawn.clear(); // nobody looks
        renderFrame();
        EXPECT_EQ(drawn.size(), nextDraw);

        // Alone: with what the properties hold.
        isRendering = false;
        nextDraw = 0;
        drawn.assign(1, solids[size_t(pick(SOLIDS))].get());
        if (pick(4) == 0)
            const_cast<Solid*>(drawn[0])->draw(*renderContext);
        drawn.clear();
        nextDraw = 0;
    }
    EXPECT_LT(100000u, checks);
}
