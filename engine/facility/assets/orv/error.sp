1.0
vertex_source_file orv#error.vert
fragment_source_file orv#error.frag

uniform u_t_modelViewProjection T_MODEL_VIEW_PROJECTION

uniform u_m_errorTexture M_ERROR_TEXTURE
