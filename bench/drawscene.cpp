#include "drawscene.h"

#include "orv/sceneutil.h"

#include <cmath>

using namespace orv;

namespace
{

constexpr float SPACING = 4.0f; // of cubes with edges of 2

} // namespace

const char* const DrawScene::VERTEX_SOURCE = R"(
attribute vec3 a_position;
attribute vec3 a_normal;
attribute vec2 a_uv0;
uniform mat4 u_modelViewProjection;
uniform mat3 u_normal;
uniform vec4 u_lightDirection;
uniform vec4 u_lightColour;
uniform vec4 u_colour;
varying vec4 v_colour;
varying vec2 v_uv;
void main()
{
    float level = 0.3 + 0.7 * max(dot(normalize(u_normal * a_normal), u_lightDirection.xyz), 0.0);
    v_colour = vec4(u_colour.rgb * u_lightColour.rgb * level, 1.0);
    v_uv = a_uv0;
    gl_Position = u_modelViewProjection * vec4(a_position, 1.0);
}
)";

const char* const DrawScene::FRAGMENT_SOURCE = R"(
precision mediump float;
uniform sampler2D u_texture;
varying vec4 v_colour;
varying vec2 v_uv;
void main()
{
    gl_FragColor = v_colour * texture2D(u_texture, v_uv);
}
)";

DrawScene::DrawScene(int count, Motion motionOfScene)
    : motion(motionOfScene)
    , lightDirection(0.36f, 0.48f, 0.8f, 0.0f)
{
    const int edge = int(std::ceil(std::cbrt(float(count))));
    reach = SPACING * float(edge);
    for (int i = 0; i < count; ++i)
    {
        const Vector3f cell(float(i % edge), float(i / edge % edge), float(i / edge / edge));
        places.push_back((cell - Vector3f(1.0f, 1.0f, 1.0f) * (float(edge - 1) / 2.0f)) * SPACING);
    }
    for (int i = 0; i < TURNS; ++i)
        turns[i] =
            quaternionFromAxisAngle(Vector3f(0.6f, 0.8f, 0.0f), Anglef::fromDegrees(float(i) * 360 / TURNS));
    for (int i = 0; i < MATERIALS; ++i)
        colours[i] = Vector4f(float(i) / 9.0f, 1.0f - float(i) / 9.0f, float(i % 3) / 2.0f, 1.0f);
}

void DrawScene::placeCamera(Camera& camera, int frame) const
{
    const float angle = 0.01f * float(frame);
    camera.setFar(reach * 4.0f);
    camera.setPosition(Vector3f(std::sin(angle), 0.4f, std::cos(angle)) * (reach * 1.4f));
    point(camera, Vector3f());
}

size_t DrawScene::getTurningStep() const
{
    switch (motion)
    {
    case Motion::ONE_IN_100: return 100;
    case Motion::ALL: return 1;
    default: return 0;
    }
}

std::vector<uint8_t> DrawScene::makeTexture(int material) const
{
    const uint8_t level = uint8_t(255 - 12 * material);
    return std::vector<uint8_t>(size_t(TEXTURE_SIZE) * TEXTURE_SIZE * 3, level);
}
