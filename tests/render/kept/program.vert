attribute vec3 a_position;
attribute vec2 a_uv0;

uniform mat4 u_t_modelViewProjection;
uniform vec4 u_m_uvOffsetScale;

varying mediump vec2 v_uv;

void main()
{
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);
    vec2 uv = a_uv0 * u_m_uvOffsetScale.zw + u_m_uvOffsetScale.xy;
    v_uv = vec2(uv.x, 1.0 - uv.y);
}
