// Replaces a program that could not be built: fragment stage. Unlit, so that it is visible without lights, and always
// opaque.

precision mediump float;

#ifdef GL_FRAGMENT_PRECISION_HIGH
varying highp vec2 v_uv;
#else
varying mediump vec2 v_uv;
#endif

uniform sampler2D u_m_errorTexture;

void main()
{
    gl_FragColor = vec4(texture2D(u_m_errorTexture, v_uv).rgb, 1.0);
}
