// The exported natives, for tests that call them as a Java runtime would.
#pragma once

#include <jni.h>

// Kept as a table: one native a line.
// clang-format off
extern "C" {

void Java_ja_q(JNIEnv*, jobject, jobject, jint);
void Java_ja_ma(JNIEnv*, jobject);
void Java_ja_Y(JNIEnv*, jobject, jint);
void Java_ja_da(JNIEnv*, jobject);
void Java_ja_n(JNIEnv*, jobject, jobject);
void Java_ja_PA(JNIEnv*, jobject, jobject);
void Java_ja_V(JNIEnv*, jobject, jshort, jshort, jint, jbyte, jbyte, jint, jboolean, jbyte, jbyte, jbyte, jbyte, jboolean, jboolean, jboolean, jboolean, jboolean, jbyte, jboolean, jboolean, jint);
void Java_ja_F(JNIEnv*, jobject, jshort, jintArray, jshort, jint, jbyte, jbyte, jint, jboolean, jbyte, jbyte, jbyte, jbyte, jboolean, jboolean, jboolean, jboolean, jboolean, jbyte, jboolean, jboolean, jint);
jint Java_ja_za(JNIEnv*, jobject);
jint Java_ja_oa(JNIEnv*, jobject);
jint Java_ja_j(JNIEnv*, jobject);
void Java_ja_N(JNIEnv*, jobject);
void Java_ja_ba(JNIEnv*, jobject, jint, jint);
void Java_ja_DA(JNIEnv*, jobject, jint, jobject, jint, jint);
void Java_ja_B(JNIEnv*, jobject, jint, jint, jint, jint, jint, jint);
void Java_ja_XA(JNIEnv*, jobject, jint, jint, jint, jint, jint);
void Java_ja_G(JNIEnv*, jobject, jint, jint, jint, jint, jint);
void Java_ja_YA(JNIEnv*, jobject, jint, jint, jint, jint, jint, jint);
void Java_ja_R(JNIEnv*, jobject, jint, jint, jint, jint, jint, jint, jobject, jint, jint);
void Java_ja_CA(JNIEnv*, jobject, jint, jint, jint, jint, jint);
void Java_ja_b(JNIEnv*, jobject, jint, jint, jint, jint, jint);
jintArray Java_ja_E(JNIEnv*, jobject, jint, jint, jint, jint);
void Java_ja_BA(JNIEnv*, jobject, jint, jint, jint, jint, jintArray, jint, jint);
void Java_ja_VA(JNIEnv*, jobject, jint, jint);
void Java_ja_L(JNIEnv*, jobject);
void Java_ja_r(JNIEnv*, jobject, jint, jint, jint, jint);
void Java_ja_o(JNIEnv*, jobject, jint, jint, jint, jint);
void Java_ja_qa(JNIEnv*, jobject, jintArray);
void Java_ja_RA(JNIEnv*, jobject, jboolean);
void Java_ja_AA(JNIEnv*, jobject, jfloatArray);
void Java_ja_wa(JNIEnv*, jobject, jfloatArray);
void Java_ja_IA(JNIEnv*, jobject, jfloat);
void Java_ja_m(JNIEnv*, jobject, jint, jfloat, jfloat, jfloat, jfloat, jfloat);
void Java_ja_c(JNIEnv*, jobject, jint, jint);
void Java_ja_Q(JNIEnv*, jobject, jint, jintArray, jfloatArray);
void Java_ja_M(JNIEnv*, jobject, jint, jint, jint, jint);
void Java_ja_JA(JNIEnv*, jobject, jint, jint, jint, jint);
void Java_ja_O(JNIEnv*, jobject);
void Java_ja_J(JNIEnv*, jobject, jint);
void Java_ja_k(JNIEnv*, jobject);
void Java_ja_A(JNIEnv*, jobject, jint, jint, jint, jint);
void Java_ja_GA(JNIEnv*, jobject, jfloat, jfloat);
void Java_ja_xa(JNIEnv*, jobject, jintArray);
void Java_ja_d(JNIEnv*, jobject, jlong, jlong);

void Java_a_ha(JNIEnv*, jobject, jint, jint, jint, jint, jint);
void Java_a_R(JNIEnv*, jobject, jlong);
void Java_a_JA(JNIEnv*, jobject, jlong);
void Java_a_UA(JNIEnv*, jobject, jlong);
void Java_a_K(JNIEnv*, jobject, jlong, jint, jint, jint, jint, jint, jint, jint);
void Java_a_ra(JNIEnv*, jobject, jlong, jfloat, jfloat, jfloat, jfloat, jfloat, jfloat, jint, jint, jint);
void Java_a_wa(JNIEnv*, jobject, jlong, jobject, jfloatArray, jintArray);

void Java_ba_sa(JNIEnv*, jobject, jint, jint);
void Java_ba_ma(JNIEnv*, jobject);
void Java_ba_ha(JNIEnv*, jobject);
void Java_ba_u(JNIEnv*, jobject);

void Java_ea_n(JNIEnv*, jobject, jint, jobject, jobjectArray, jintArray, jintArray, jintArray, jintArray);
void Java_ea_UA(JNIEnv*, jobject, jchar, jint, jint, jint, jboolean);
void Java_ea_P(JNIEnv*, jobject, jchar, jint, jint, jint, jboolean, jobject, jint, jint);
void Java_ea_f(JNIEnv*, jobject, jchar, jint, jint, jint, jboolean);
void Java_ea_ma(JNIEnv*, jobject);

void Java_m_n(JNIEnv*, jobject, jint, jobject, jobjectArray, jintArray, jintArray, jintArray, jintArray);
void Java_m_UA(JNIEnv*, jobject, jchar, jint, jint, jint, jboolean);
void Java_m_MA(JNIEnv*, jobject, jchar, jint, jint, jint, jboolean, jobject, jint, jint);
void Java_m_f(JNIEnv*, jobject, jchar, jint, jint, jint, jboolean);
void Java_m_ma(JNIEnv*, jobject);

void Java_ia_EA(JNIEnv*, jobject, jint, jobject, jobjectArray, jintArray, jintArray, jintArray, jintArray, jintArray);
void Java_ia_UA(JNIEnv*, jobject, jchar, jint, jint, jint, jboolean);
void Java_ia_GA(JNIEnv*, jobject, jchar, jint, jint, jint, jboolean, jobject, jint, jint);
void Java_ia_f(JNIEnv*, jobject, jchar, jint, jint, jint, jboolean);
void Java_ia_ma(JNIEnv*, jobject);

void Java_fa_UA(JNIEnv*, jobject, jint, jint, jint);
void Java_fa_K(JNIEnv*, jobject, jint, jint, jint, jint, jint, jboolean);
void Java_fa_RA(JNIEnv*, jobject, jint, jintArray, jint, jint, jint, jint, jboolean);
void Java_fa_EA(JNIEnv*, jobject, jint, jintArray, jbyteArray, jbyteArray, jint, jint, jint, jint);
void Java_fa_M(JNIEnv*, jobject, jlong);
jint Java_fa_da(JNIEnv*, jobject, jlong);
jint Java_fa_GA(JNIEnv*, jobject, jlong);
jint Java_fa_WA(JNIEnv*, jobject, jlong);
jint Java_fa_ba(JNIEnv*, jobject, jlong);
void Java_fa_U(JNIEnv*, jobject, jlong, jint, jint, jint, jint);
void Java_fa_F(JNIEnv*, jobject, jlong, jintArray);
void Java_fa_na(JNIEnv*, jobject, jlong, jint, jint, jint, jint, jintArray, jint, jint);
void Java_fa_ea(JNIEnv*, jobject, jlong, jint, jint, jint, jint, jint, jint);
void Java_fa_j(JNIEnv*, jobject, jlong, jint, jint, jint);
void Java_fa_Y(JNIEnv*, jobject, jlong, jint, jint, jint, jint, jint);
void Java_fa_ha(JNIEnv*, jobject, jlong, jint, jint, jint, jint, jint, jint, jint);
void Java_fa_G(JNIEnv*, jobject, jlong, jint, jint, jint, jint, jint, jint, jint, jint);
void Java_fa_o(JNIEnv*, jobject, jlong, jint, jint, jlong, jint, jint);
void Java_fa_e(JNIEnv*, jobject, jlong, jfloat, jfloat, jfloat, jfloat, jfloat, jfloat, jint, jint, jint);
void Java_fa_FA(JNIEnv*, jobject, jlong, jfloat, jfloat, jfloat, jfloat, jfloat, jfloat, jint, jlong, jint, jint, jint);
void Java_fa_aa(JNIEnv*, jobject, jlong, jint, jint, jint, jint, jint, jint, jint);

void Java_h_U(JNIEnv*, jobject, jobject, jobject, jint, jint, jintArray, jintArray, jintArray, jintArray, jshortArray, jint, jshortArray, jshortArray, jshortArray, jbyteArray, jbyteArray, jbyteArray, jbyteArray, jshortArray, jshortArray, jintArray, jbyte, jshortArray, jint, jbyteArray, jshortArray, jshortArray, jshortArray, jintArray, jintArray, jintArray, jbyteArray, jbyteArray, jintArray, jintArray, jintArray, jintArray, jint, jint, jint, jint, jint, jint, jintArray);
void Java_h_ba(JNIEnv*, jobject, jint);
void Java_h_ma(JNIEnv*, jobject);
void Java_h_KA(JNIEnv*, jobject, jint);
jint Java_h_m(JNIEnv*, jobject);
jboolean Java_h_i(JNIEnv*, jobject);
jboolean Java_h_u(JNIEnv*, jobject);
void Java_h_p(JNIEnv*, jobject, jint);
void Java_h_Q(JNIEnv*, jobject, jint);
jint Java_h_c(JNIEnv*, jobject);
jint Java_h_Z(JNIEnv*, jobject);
jint Java_h_N(JNIEnv*, jobject);
jint Java_h_n(JNIEnv*, jobject);
jint Java_h_RA(JNIEnv*, jobject);
jint Java_h_ya(JNIEnv*, jobject);
jint Java_h_YA(JNIEnv*, jobject);
jint Java_h_o(JNIEnv*, jobject);
jint Java_h_AA(JNIEnv*, jobject);
jint Java_h_ha(JNIEnv*, jobject);

void Java_o_AA(JNIEnv*, jobject, jlong, jlong, jlong, jint, jint, jint, jint, jint, jint, jboolean, jboolean);
void Java_o_BA(JNIEnv*, jobject, jlong, jlong, jlong, jint, jint, jint, jint, jint, jint, jboolean, jboolean);

void Java_oa_g(JNIEnv*, jobject, jint, jint);
void Java_oa_za(JNIEnv*, jobject, jlong);

void Java_wa_l(JNIEnv*, jobject, jint, jobject, jint, jint, jintArray, jintArray);
void Java_wa_ma(JNIEnv*, jobject);

void Java_za_n(JNIEnv*, jobject, jint, jobject, jint, jint);
void Java_za_ma(JNIEnv*, jobject);
void Java_za_wa(JNIEnv*, jobject, jobject, jint, jint);
void Java_za_H(JNIEnv*, jobject, jint, jint, jint, jint);
void Java_za_CA(JNIEnv*, jobject, jint, jint, jint, jint, jint, jint);

}  // extern "C"
// clang-format on
