// A planar mirror: the mirror image covers the whole view and is rendered upside down, so it is read where the
// fragment stands on the screen, with v turned over.

precision mediump float;

uniform sampler2D u_m_mirrorTexture;
uniform vec4 u_m_tint;

varying vec3 v_clip;

void main()
{
    vec2 place = v_clip.xy / v_clip.z * 0.5 + 0.5;
    gl_FragColor = vec4(texture2D(u_m_mirrorTexture, vec2(place.x, 1.0 - place.y)).rgb * u_m_tint.rgb, 1.0);
}
