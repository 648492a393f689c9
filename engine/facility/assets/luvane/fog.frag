// A flat textured shape that fades into the scene's fog: fragment stage. As luvane#quad.sp, and of its colour
// exp(-(FOG_DENSITY * distance)^2) comes through a fog of FOG_COLOUR.

#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;
#define FINE highp
#else
precision mediump float;
#define FINE mediump
#endif

varying FINE vec2 v_uv;
varying FINE float v_distance;

uniform sampler2D u_m_diffuseTexture;
uniform vec4 u_m_diffuseColour;
uniform float u_m_opacity;
uniform float u_fogDensity;
uniform vec4 u_fogColour;

void main()
{
    vec4 colour = texture2D(u_m_diffuseTexture, v_uv) * vec4(u_m_diffuseColour.rgb, u_m_opacity);
    float thickness = u_fogDensity * v_distance;
    gl_FragColor = vec4(mix(u_fogColour.rgb, colour.rgb, exp(-thickness * thickness)), colour.a);
}
