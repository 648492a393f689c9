// A surface with rings of waves around its middle: vertex stage.
//
// orv#ripple.sp binds no uniforms: the mesh is drawn in clip space (-1 to 1), seen from its front (+z), as standing
// waves on blue water. Your own program file names these two sources, declares the uniforms below, and is loaded with
// the features that it needs, as in mine.sp$TRANSFORM$ANIMATED:
//   TRANSFORM  u_t_modelViewProjection (T_MODEL_VIEW_PROJECTION): drawn where the scene has it
//   TEXTURE    u_m_diffuseTexture (M_DIFFUSE_TEXTURE) and u_m_uvOffsetScale (M_UV_OFFSET_SCALE: offset u, offset v,
//              scale u, scale v): a picture, bent by the waves, instead of blue
//   ANIMATED   u_time (TIME): the waves run outwards
// The waves are laid out by a_uv0, around its (0.5, 0.5).

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

attribute vec3 a_position;
attribute vec2 a_uv0;

#ifdef TRANSFORM
uniform mat4 u_t_modelViewProjection;
#endif

#ifdef TEXTURE
uniform vec4 u_m_uvOffsetScale;

varying FINE vec2 v_uv;
#endif

varying FINE vec2 v_place; // from the middle of the rings, v upwards

void main()
{
#ifdef TRANSFORM
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);
#else
    // Depth counts away from the eye, z towards it.
    gl_Position = vec4(a_position.xy, a_position.z * -0.5, 1.0);
#endif

#ifdef TEXTURE
    v_uv = a_uv0 * u_m_uvOffsetScale.zw + u_m_uvOffsetScale.xy;
#endif
    v_place = a_uv0 - 0.5;
}
