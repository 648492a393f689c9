// A picture under running waves: fragment stage. The rings spread from the middle of the mesh's texture coordinates and
// bend M_DIFFUSE_TEXTURE. They run with TIME, which starts again every 60 seconds without a jump.

#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;
#define FINE highp
#else
precision mediump float;
#define FINE mediump
#endif

varying FINE vec2 v_uv;
varying FINE vec2 v_place;

uniform sampler2D u_m_diffuseTexture;
uniform float u_m_opacity;
uniform float u_time;

const float TURN = 6.2831853;
const float RINGS = 10.0;    // along a unit of texture coordinates
const float HEIGHT = 0.008;  // how far a wave bends the picture
const float FREQUENCY = 1.5; // waves a second, a whole number of them in 60 seconds

void main()
{
    float range = length(v_place);
    vec2 outwards = v_place / max(range, 0.001);
    float slope = cos(TURN * (range * RINGS - fract(u_time * FREQUENCY))) * exp(-2.0 * range);

    // The picture's v counts downwards. A slope that leans to the upper left, where the light is, is bright.
    vec4 colour = texture2D(u_m_diffuseTexture, v_uv + vec2(outwards.x, -outwards.y) * slope * HEIGHT);
    float light = 1.0 + 0.2 * slope * dot(outwards, vec2(0.6, -0.8));
    gl_FragColor = vec4(colour.rgb * light, colour.a * u_m_opacity);
}
