// A flat textured shape in the scene, unlit: fragment stage. As luvane#quad.sp, but the colour that comes out is already
// multiplied with the opacity: to blend it ONE and ONE_MINUS_SRC_ALPHA. The texture is straight, as picture files are.

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
    vec4 colour = texture2D(u_m_diffuseTexture, v_uv) * vec4(u_m_diffuseColour.rgb, u_m_opacity);
    gl_FragColor = vec4(colour.rgb * colour.a, colour.a);
}
