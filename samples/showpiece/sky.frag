// The sky: looks up its cube map in the direction of the point.

precision mediump float;

uniform samplerCube u_m_skyTexture;

varying vec3 v_direction;

void main()
{
    gl_FragColor = vec4(textureCube(u_m_skyTexture, v_direction).rgb, 1.0);
}
