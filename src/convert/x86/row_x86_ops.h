// The v_* operations of row_x86_kernels.inc that are one intrinsic at every
// vector width: the including file defines QK_X86_OP(name) as its width's
// intrinsic of that name (_mm_name, _mm256_name, _mm512_name).
#ifndef QKCORE_SRC_CONVERT_X86_ROW_X86_OPS_H
#define QKCORE_SRC_CONVERT_X86_ROW_X86_OPS_H

#define v_add_epi16 QK_X86_OP(add_epi16)
#define v_add_epi32 QK_X86_OP(add_epi32)
#define v_madd_epi16 QK_X86_OP(madd_epi16)
#define v_mulhi_epi16 QK_X86_OP(mulhi_epi16)
#define v_mullo_epi16 QK_X86_OP(mullo_epi16)
#define v_packs_epi32 QK_X86_OP(packs_epi32)
#define v_packus_epi16 QK_X86_OP(packus_epi16)
#define v_set1_epi16 QK_X86_OP(set1_epi16)
#define v_set1_epi32 QK_X86_OP(set1_epi32)
#define v_set1_epi8 QK_X86_OP(set1_epi8)
#define v_shuffle_epi8 QK_X86_OP(shuffle_epi8)
#define v_slli_epi16 QK_X86_OP(slli_epi16)
#define v_slli_epi32 QK_X86_OP(slli_epi32)
#define v_srai_epi16 QK_X86_OP(srai_epi16)
#define v_srai_epi32 QK_X86_OP(srai_epi32)
#define v_srli_epi16 QK_X86_OP(srli_epi16)
#define v_srli_epi32 QK_X86_OP(srli_epi32)
#define v_sub_epi16 QK_X86_OP(sub_epi16)
#define v_sub_epi32 QK_X86_OP(sub_epi32)
#define v_subs_epu16 QK_X86_OP(subs_epu16)
#define v_unpackhi_epi16 QK_X86_OP(unpackhi_epi16)
#define v_unpackhi_epi64 QK_X86_OP(unpackhi_epi64)
#define v_unpackhi_epi8 QK_X86_OP(unpackhi_epi8)
#define v_unpacklo_epi16 QK_X86_OP(unpacklo_epi16)
#define v_unpacklo_epi64 QK_X86_OP(unpacklo_epi64)
#define v_unpacklo_epi8 QK_X86_OP(unpacklo_epi8)
// Compares into lanes of ones, for files without mask registers.
#ifndef QK_MASK_REGISTERS
#define v_cmpeq_epi16 QK_X86_OP(cmpeq_epi16)
#define v_movemask_epi8 QK_X86_OP(movemask_epi8)
#endif

#endif  // QKCORE_SRC_CONVERT_X86_ROW_X86_OPS_H
