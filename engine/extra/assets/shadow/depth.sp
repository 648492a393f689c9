1.0
vertex_source_file shadow#depth.vert
fragment_source_file shadow#depth.frag

uniform u_s_model S_MODEL
uniform u_s_clip S_CLIP
uniform u_s_depth S_DEPTH
uniform u_s_split S_SPLIT

uniform u_j_count J_COUNT
uniform u_j_world J_WORLD
uniform u_j_weightFilled J_WEIGHT_FILLED

uniform u_m_uvOffsetScale M_UV_OFFSET_SCALE
uniform u_m_opacity M_OPACITY
uniform u_m_cutoff M_CUTOFF
uniform u_m_diffuseTexture M_DIFFUSE_TEXTURE
