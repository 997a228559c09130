// The bridge between a Java peer and its native object: the long field "nativeid" of the peer holds the address.
#pragma once

#include <jni.h>

class toolkit;
class memorymanager;
class model;
class Sprite_c;
class DepthBuffer_c;
class clippingmask;
class Matrix_c;
class ground;
class font_mono;
class font_paletted;
class font_alpha;
class shadow;
struct threadresource;
class canvas;

// For each peer class: a weak reference that keeps it identified.
extern jweak cl_toolkit, cl_memorypool, cl_model, cl_sprite, cl_depthbuffer, cl_clippingmask, cl_matrix, cl_ground,
    cl_font_mono, cl_font_paletted, cl_font_alpha, cl_shadow, cl_threadresource, cl_canvas;

namespace objconvert {

// The field "nativeid" of each peer class, looked up when the first object of the class is bound.
extern jfieldID toolkit_nativeid, memorypool_nativeid, model_nativeid, sprite_nativeid, depthbuffer_nativeid,
    clippingmask_nativeid, matrix_nativeid, ground_nativeid, font_mono_nativeid, font_paletted_nativeid,
    font_alpha_nativeid, shadow_nativeid, threadresource_nativeid, canvas_nativeid;

// Binds the peer to the object; null unbinds it.
void set_toolkit(JNIEnv* env, jobject peer, toolkit* value);
void set_memorypool(JNIEnv* env, jobject peer, memorymanager* value);
void set_model(JNIEnv* env, jobject peer, model* value);
void set_sprite(JNIEnv* env, jobject peer, Sprite_c* value);
void set_depthbuffer(JNIEnv* env, jobject peer, DepthBuffer_c* value);
void set_clippingmask(JNIEnv* env, jobject peer, clippingmask* value);
void set_matrix(JNIEnv* env, jobject peer, Matrix_c* value);
void set_ground(JNIEnv* env, jobject peer, ground* value);
void set_font_mono(JNIEnv* env, jobject peer, font_mono* value);
void set_font_paletted(JNIEnv* env, jobject peer, font_paletted* value);
void set_font_alpha(JNIEnv* env, jobject peer, font_alpha* value);
void set_shadow(JNIEnv* env, jobject peer, shadow* value);
void set_threadresource(JNIEnv* env, jobject peer, threadresource* value);
void set_canvas(JNIEnv* env, jobject peer, canvas* value);

// The object of the peer, null when it has none. A null peer throws NullPointerException*.
toolkit* get_toolkit(JNIEnv* env, jobject peer);
memorymanager* get_memorypool(JNIEnv* env, jobject peer);
model* get_model(JNIEnv* env, jobject peer);
clippingmask* get_clippingmask(JNIEnv* env, jobject peer);
ground* get_ground(JNIEnv* env, jobject peer);
font_mono* get_font_mono(JNIEnv* env, jobject peer);
font_paletted* get_font_paletted(JNIEnv* env, jobject peer);
font_alpha* get_font_alpha(JNIEnv* env, jobject peer);
shadow* get_shadow(JNIEnv* env, jobject peer);
canvas* get_canvas(JNIEnv* env, jobject peer);

}  // namespace objconvert
