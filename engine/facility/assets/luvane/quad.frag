// A flat textured shape in the scene, unlit: fragment stage. M_DIFFUSE_TEXTURE times M_DIFFUSE_COLOUR; the opacity is
// M_OPACITY times the texture's alpha, straight. To blend it: SRC_ALPHA and ONE_MINUS_SRC_ALPHA.

precision mediump float;

#ifdef GL_FRAGMENT_PRECISION_HIGH
varying highp vec2 v_uv;
#else
varying mediump vec2 v_uv;
#endif

uniform sampler2D u_m_diffuseTexture;
uniform vec4 u_m_diffuseColour;
uniform float u_m_opacity;

void main()
{
    gl_FragColor = texture2D(u_m_diffuseTexture, v_uv) * vec4(u_m_diffuseColour.rgb, u_m_opacity);
}
