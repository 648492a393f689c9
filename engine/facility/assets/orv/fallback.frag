// The plain default material: fragment stage. Texture times light, plus highlights. The opacity is M_OPACITY times the
// texture's alpha, straight, not premultiplied; the alphas of colours are ignored.

precision mediump float;

#ifdef GL_FRAGMENT_PRECISION_HIGH
varying highp vec2 v_uv;
#else
varying mediump vec2 v_uv;
#endif
varying mediump vec3 v_light;
varying mediump vec3 v_highlights;

uniform sampler2D u_m_diffuseTexture;
uniform float u_m_opacity;

void main()
{
    vec4 base = texture2D(u_m_diffuseTexture, v_uv);
    gl_FragColor = vec4(base.rgb * v_light + v_highlights, base.a * u_m_opacity);
}
