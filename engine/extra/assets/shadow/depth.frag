// Distances from a light, for shadow maps: fragment stage. Red, green and blue hold a distance from 0 to 1; each
// channel holds the remainder of the one before, times 255.
//
// This needs highp. Without it u_s_split is unused, which the application can detect.

#ifdef GL_FRAGMENT_PRECISION_HIGH
precision highp float;

uniform vec3 u_s_split; // 1, 255 and 255 * 255

varying highp float v_depth;

#ifdef CUTOFF
uniform float u_m_opacity;
uniform float u_m_cutoff;
#ifdef DIFF
uniform sampler2D u_m_diffuseTexture;

varying highp vec2 v_uv;
#endif
#ifdef VCOL
varying mediump float v_opacity;
#endif
#endif

void main()
{
#ifdef CUTOFF
    float opacity = u_m_opacity;
#ifdef DIFF
    opacity *= texture2D(u_m_diffuseTexture, v_uv).a;
#endif
#ifdef VCOL
    opacity *= v_opacity;
#endif
    if (opacity < u_m_cutoff)
        discard;
#endif
    vec3 parts = fract(clamp(v_depth, 0.0, 0.9999) * u_s_split);
    gl_FragColor = vec4(parts - vec3(parts.yz, 0.0) / 255.0, 1.0);
}
#else
void main()
{
    gl_FragColor = vec4(1.0);
}
#endif
