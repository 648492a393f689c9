// Falling snow or rain over a flat shape: vertex stage.
//
// M_UV_OFFSET_SCALE (offset u, offset v, scale u, scale v) moves and scales the pattern of flakes; v counts upwards.

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

attribute vec3 a_position;
attribute vec2 a_uv0;

uniform mat4 u_t_modelViewProjection;
uniform vec4 u_m_uvOffsetScale;

varying FINE vec2 v_uv;

void main()
{
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);

    v_uv = a_uv0 * u_m_uvOffsetScale.zw + u_m_uvOffsetScale.xy;
}
