precision mediump float;

uniform sampler2D u_m_diffuseTexture;
uniform vec4 u_m_tint;

varying mediump vec2 v_uv;

void main()
{
    gl_FragColor = texture2D(u_m_diffuseTexture, v_uv);
#ifdef TINT
    gl_FragColor *= u_m_tint;
#endif
}
