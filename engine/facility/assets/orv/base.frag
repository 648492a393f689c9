// An unlit base for your own shader programs: fragment stage. The vertex stage documents the features.

#if !defined(TEXTURE) && !defined(COLOUR) && !defined(VERTEX_COLOUR)
#define CLAY
#endif

precision mediump float;

#ifdef TEXTURE
#ifdef GL_FRAGMENT_PRECISION_HIGH
varying highp vec2 v_uv;
#else
varying mediump vec2 v_uv;
#endif

uniform sampler2D u_m_diffuseTexture;
#endif

#ifdef COLOUR
uniform vec4 u_m_diffuseColour;
uniform float u_m_opacity;
#endif

#ifdef VERTEX_COLOUR
varying mediump vec4 v_colour;
#endif

#ifdef CLAY
varying mediump vec3 v_normal;
#endif

void main()
{
    vec4 colour = vec4(1.0);
#ifdef TEXTURE
    colour *= texture2D(u_m_diffuseTexture, v_uv);
#endif
#ifdef COLOUR
    colour *= vec4(u_m_diffuseColour.rgb, u_m_opacity);
#endif
#ifdef VERTEX_COLOUR
    colour *= v_colour;
#endif
#ifdef CLAY
    // Light from over the viewer's left shoulder, and some from everywhere.
    vec3 normal = v_normal * inversesqrt(max(dot(v_normal, v_normal), 0.0001));
    float light = 0.35 + 0.65 * max(dot(normal, vec3(-0.36, 0.48, 0.8)), 0.0);
    colour.rgb = vec3(0.82, 0.78, 0.72) * light;
#endif
    gl_FragColor = colour;
}
