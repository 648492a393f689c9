// An unlit base for your own shader programs: vertex stage.
//
// orv#base.sp binds no uniforms: the mesh is drawn in clip space (-1 to 1) as a clay model, seen from its front (+z).
// Your own program file names these two sources, declares the uniforms below, and is loaded with the features that it
// needs, as in mine.sp$TRANSFORM$TEXTURE:
//   TRANSFORM      u_t_modelViewProjection (T_MODEL_VIEW_PROJECTION): drawn where the scene has it
//   TEXTURE        u_m_diffuseTexture (M_DIFFUSE_TEXTURE) and u_m_uvOffsetScale (M_UV_OFFSET_SCALE: offset u, offset v,
//                  scale u, scale v)
//   COLOUR         u_m_diffuseColour (M_DIFFUSE_COLOUR) and u_m_opacity (M_OPACITY)
//   VERTEX_COLOUR  the mesh's a_colour
// With TEXTURE, COLOUR or VERTEX_COLOUR the surface is their product, flat; without all three it is clay.
// v is flipped, since it points up in meshes and down in pictures.

#if !defined(TEXTURE) && !defined(COLOUR) && !defined(VERTEX_COLOUR)
#define CLAY
#endif

#ifdef GL_FRAGMENT_PRECISION_HIGH
#define FINE highp
#else
#define FINE mediump
#endif

attribute vec3 a_position;

#ifdef TRANSFORM
uniform mat4 u_t_modelViewProjection;
#endif

#ifdef TEXTURE
attribute vec2 a_uv0;

uniform vec4 u_m_uvOffsetScale;

varying FINE vec2 v_uv;
#endif

#ifdef VERTEX_COLOUR
attribute vec4 a_colour;

varying mediump vec4 v_colour;
#endif

#ifdef CLAY
attribute vec3 a_normal;

varying mediump vec3 v_normal;
#endif

void main()
{
#ifdef TRANSFORM
    gl_Position = u_t_modelViewProjection * vec4(a_position, 1.0);
#else
    // Depth counts away from the eye, z towards it.
    gl_Position = vec4(a_position.xy, a_position.z * -0.5, 1.0);
#endif

#ifdef TEXTURE
    vec2 uv = a_uv0 * u_m_uvOffsetScale.zw + u_m_uvOffsetScale.xy;
    v_uv = vec2(uv.x, 1.0 - uv.y);
#endif

#ifdef VERTEX_COLOUR
    v_colour = a_colour;
#endif

#ifdef CLAY
    v_normal = a_normal;
#endif
}
