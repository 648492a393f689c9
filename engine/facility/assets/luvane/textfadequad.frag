// A line of text that fades out at its ends: fragment stage.
//
// M_DIFFUSE_TEXTURE  the line, in one channel or with alpha: the alpha is the ink
// M_DIFFUSE_COLOUR   the colour of the ink, M_OPACITY its opacity; straight, not premultiplied
// M_FADE             Vector2f: the parts of the line, at its start and at its end, over which the text comes and goes,
//                    as in 0.1 0.1; zero cuts it off sharply. The line is as long as the mesh's u from 0 to 1

precision mediump float;

#ifdef GL_FRAGMENT_PRECISION_HIGH
varying highp vec2 v_uv;
#else
varying mediump vec2 v_uv;
#endif
varying mediump float v_along;

uniform sampler2D u_m_diffuseTexture;
uniform vec4 u_m_diffuseColour;
uniform float u_m_opacity;
uniform vec2 u_m_fade;

void main()
{
    float ink = texture2D(u_m_diffuseTexture, v_uv).a * u_m_opacity;
    if (u_m_fade.x > 0.0)
        ink *= clamp(v_along / u_m_fade.x, 0.0, 1.0);
    if (u_m_fade.y > 0.0)
        ink *= clamp((1.0 - v_along) / u_m_fade.y, 0.0, 1.0);
    gl_FragColor = vec4(u_m_diffuseColour.rgb, ink);
}
