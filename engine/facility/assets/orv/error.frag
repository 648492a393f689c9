// Stands in for a program that could not be built: fragment stage. Unlit, so that it is seen in the dark too, and
// opaque, whatever the material wanted.

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
