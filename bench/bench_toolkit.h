// A toolkit for benchmarks, with no Java runtime behind it, and a target to draw into.
#pragma once

#include <jni.h>

#include <cstddef>

#include "toolkit/toolkit.h"
#include "util/memorymanager/alignedmemory.h"

class bench_toolkit {
 public:
  bench_toolkit(int width, int height)
      : pixels(static_cast<std::size_t>(width) * static_cast<std::size_t>(height)),
        colour(static_cast<unsigned int*>(buffer(pixels))),
        depth(static_cast<float*>(buffer(pixels))) {
    toolkit& t = kit();
    t.width = width;
    t.height = height;
    t.colourbuffer = colour;
    t.depthbuffer = nullptr;
    t.resetclipping();
    t.setup_backbuffer(colour, nullptr, 0, 0, width);
    for (std::size_t i = 0; i < pixels; ++i) {
      colour[i] = static_cast<unsigned int>(i) * 2654435761u;
      depth[i] = 1;
    }
  }
  ~bench_toolkit() {
    kit().colourbuffer = nullptr;
    kit().depthbuffer = nullptr;
    _aligned_free(colour);
    _aligned_free(depth);
  }
  bench_toolkit(const bench_toolkit&) = delete;
  bench_toolkit& operator=(const bench_toolkit&) = delete;

  // The process's toolkit. It knows just enough Java to be built, and lives until the process ends.
  static toolkit& kit() {
    if (toolkit::m_pInstance == nullptr) {
      static JNINativeInterface_ functions{};
      static JNIEnv env{};
      env.functions = &functions;
      functions.GetJavaVM = [](JNIEnv*, JavaVM**) -> jint { return 0; };
      functions.NewWeakGlobalRef = [](JNIEnv*, jobject) -> jweak { return nullptr; };
      functions.FindClass = [](JNIEnv*, const char*) -> jclass { return nullptr; };
      functions.GetMethodID = [](JNIEnv*, jclass, const char*, const char*) -> jmethodID { return nullptr; };
      toolkit::m_pInstance = new toolkit(&env, nullptr, nullptr, 0);
    }
    return *toolkit::m_pInstance;
  }

  const std::size_t pixels;
  unsigned int* const colour;
  float* const depth;

 private:
  // As canvases and images get theirs.
  static void* buffer(std::size_t words) { return _aligned_malloc(words * 4, 64); }
};
