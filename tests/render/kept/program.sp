1.0
// a program of one's own, with a define that its name may carry
vertex_source_file program.vert
fragment_source_file program.frag

uniform u_t_modelViewProjection T_MODEL_VIEW_PROJECTION
uniform u_m_uvOffsetScale M_UV_OFFSET_SCALE
uniform u_m_diffuseTexture M_DIFFUSE_TEXTURE
uniform u_m_tint M_TINT
