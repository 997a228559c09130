// Hooks for turning a platform's hardware faults into failures. Linux needs none: a wild pointer ends the process.
#pragma once

struct JNIEnv_;

inline void setup_se_handling(JNIEnv_*) {}
inline void restore_se_handling() {}
