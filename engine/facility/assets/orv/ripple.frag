// A surface with rings of waves around its middle: fragment stage. The vertex stage documents the features.

#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;
#define FINE highp
#else
precision mediump float;
#define FINE mediump
#endif

varying FINE vec2 v_place;

#ifdef TEXTURE
varying FINE vec2 v_uv; // v upwards

uniform sampler2D u_m_diffuseTexture;
#endif

#ifdef ANIMATED
uniform float u_time;
#else
const float u_time = 0.0;
#endif

const float TURN = 6.2831853;
const float RINGS = 10.0;    // along a unit of texture coordinates
const float HEIGHT = 0.006;  // how far a wave bends the picture
const float FREQUENCY = 1.5; // waves a second: a whole number in the 60 seconds after which time starts again

void main()
{
    float range = length(v_place);
    vec2 outwards = v_place / max(range, 0.001);
    float slope = cos(TURN * (range * RINGS - fract(u_time * FREQUENCY))) * exp(-2.0 * range);

    // A slope that leans to the upper left, where the light is, is bright.
    float light = 1.0 + 0.35 * slope * dot(outwards, vec2(0.6, -0.8));
#ifdef TEXTURE
    vec2 uv = v_uv + outwards * slope * HEIGHT;
    vec4 colour = texture2D(u_m_diffuseTexture, vec2(uv.x, 1.0 - uv.y));
#else
    vec4 colour = vec4(0.24, 0.48, 0.66, 1.0);
#endif
    gl_FragColor = vec4(colour.rgb * light, colour.a);
}
