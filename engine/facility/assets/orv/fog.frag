// A surface that fades into fog: fragment stage. The vertex stage documents the features.
//
// At a distance d, exp(-(density * d)^2) of the colour is the surface's, the rest is fog.

#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;
#define FINE highp
#else
precision mediump float;
#define FINE mediump
#endif

varying FINE float v_distance;

#ifdef TEXTURE
varying FINE vec2 v_uv;

uniform sampler2D u_m_diffuseTexture;
#endif

#ifdef FOG
uniform float u_fogDensity;
uniform vec4 u_fogColour;
#else
const float u_fogDensity = 1.2;
const vec4 u_fogColour = vec4(0.62, 0.68, 0.74, 1.0);
#endif

void main()
{
#ifdef TEXTURE
    vec4 colour = texture2D(u_m_diffuseTexture, v_uv);
#else
    vec4 colour = vec4(1.0);
#endif
    float thickness = u_fogDensity * v_distance;
    gl_FragColor = vec4(mix(u_fogColour.rgb, colour.rgb, exp(-thickness * thickness)), colour.a);
}
