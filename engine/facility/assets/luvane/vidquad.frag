// A video frame on a flat shape in the scene: fragment stage.
//
// M_DIFFUSE_TEXTURE is an external texture, filled by the platform's video decoder, where GL_OES_EGL_image_external is
// there, and an ordinary one elsewhere. M_DIFFUSE_COLOUR tints it. A video has no alpha: the opacity is M_OPACITY.

#ifdef GL_OES_EGL_image_external
#extension GL_OES_EGL_image_external : require
#define VIDEO samplerExternalOES
#else
#define VIDEO sampler2D
#endif

precision mediump float;

#ifdef GL_FRAGMENT_PRECISION_HIGH
varying highp vec2 v_uv;
#else
varying mediump vec2 v_uv;
#endif

uniform VIDEO u_m_diffuseTexture;
uniform vec4 u_m_diffuseColour;
uniform float u_m_opacity;

void main()
{
    gl_FragColor = vec4(texture2D(u_m_diffuseTexture, v_uv).rgb * u_m_diffuseColour.rgb, u_m_opacity);
}
