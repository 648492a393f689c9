// A flat textured shape that fades into the scene's fog: vertex stage.
//
// M_UV_OFFSET_SCALE (offset u, offset v, scale u, scale v) moves and scales the texture; v counts upwards in meshes and
// downwards in pictures, so it is turned. For what was rendered into a target take 0 1 1 -1.

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

attribute vec3 a_position;
attribute vec2 a_uv0;

uniform mat4 u_t_modelViewProjection;
uniform mat4 u_t_modelView;
uniform vec4 u_m_uvOffsetScale;

varying FINE vec2 v_uv;
varying FINE float v_distance; // in front of the camera

void main()
{
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);

    vec2 uv = a_uv0 * u_m_uvOffsetScale.zw + u_m_uvOffsetScale.xy;
    v_uv = vec2(uv.x, 1.0 - uv.y);

    v_distance = -(u_t_modelView * vec4(a_position, 1.0)).z;
}
