1.0
vertex_source_file mirror.vert
fragment_source_file mirror.frag

uniform u_t_modelViewProjection T_MODEL_VIEW_PROJECTION

// a solid whose program asks for this property is a mirror
uniform u_m_mirrorTexture M_MIRROR_TEXTURE
uniform u_m_tint M_TINT
