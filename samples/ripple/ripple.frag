// Rings of two shades, by the distance from the middle.

precision mediump float;

uniform float u_time;
uniform vec4 u_m_colour;

varying vec2 v_uv0;

void main()
{
    float wave = 0.5 + 0.5 * sin(60.0 * distance(v_uv0, vec2(0.5)) - 6.0 * u_time);
    gl_FragColor = vec4(u_m_colour.rgb * (0.35 + 0.65 * wave), 1.0);
}
