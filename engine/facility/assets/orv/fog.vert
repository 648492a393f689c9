// A surface that fades into fog: vertex stage.
//
// orv#fog.sp binds no uniforms: the mesh is drawn in clip space (-1 to 1), seen from its front (+z), white with pale
// fog. Your own program file names these two sources, declares the uniforms below, and is loaded with the features that
// it needs, as in mine.sp$TRANSFORM$FOG:
//   TRANSFORM  u_t_modelViewProjection (T_MODEL_VIEW_PROJECTION) and u_t_modelView (T_MODEL_VIEW): drawn where the
//              scene has it, and fogged by the distance in front of the camera. A program file without u_t_modelView
//              gets that distance with perspective cameras alone
//   TEXTURE    u_m_diffuseTexture (M_DIFFUSE_TEXTURE) and u_m_uvOffsetScale (M_UV_OFFSET_SCALE: offset u, offset v,
//              scale u, scale v) instead of white
//   FOG        u_fogDensity (FOG_DENSITY) and u_fogColour (FOG_COLOUR) instead of constants
// v is flipped, since it points up in meshes and down in pictures.

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

attribute vec3 a_position;

#ifdef TRANSFORM
uniform mat4 u_t_modelViewProjection;
uniform mat4 u_t_modelView;
#endif

#ifdef TEXTURE
attribute vec2 a_uv0;

uniform vec4 u_m_uvOffsetScale;

varying FINE vec2 v_uv;
#endif

varying FINE float v_distance;

void main()
{
#ifdef TRANSFORM
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);
    bool isPlaced = u_t_modelView[3].w == 1.0; // zeros if it is not bound
    v_distance = isPlaced ? -(u_t_modelView * vec4(a_position, 1.0)).z : gl_Position.w;
#else
    // Depth counts away from the eye, z towards it.
    gl_Position = vec4(a_position.xy, a_position.z * -0.5, 1.0);
    v_distance = 1.0 - a_position.z;
#endif

#ifdef TEXTURE
    vec2 uv = a_uv0 * u_m_uvOffsetScale.zw + u_m_uvOffsetScale.xy;
    v_uv = vec2(uv.x, 1.0 - uv.y);
#endif
}
