// What the natives of the calling thread have in hand while they may call back into the client, in a texture request or
// a collection of memory: the callback must not take it away from them.
#pragma once

#include "natives/contract.h"

class memorymanager;
class model;
struct threadresource;

namespace natives {

// Lives as long as the native's work. Callbacks call natives too, so the marks of a thread nest.
class in_use {
 public:
  // scratch: of a draw, which needs its target too. The toolkit is in use under every mark.
  explicit in_use(const model* mesh = nullptr, const threadresource* scratch = nullptr)
      : used_model(mesh), used_scratch(scratch), outer(innermost) {
    innermost = this;
  }
  ~in_use() { innermost = outer; }
  in_use(const in_use&) = delete;
  in_use& operator=(const in_use&) = delete;

  // Each raises IllegalStateException for what is in use.
  static void refuse(const model& mesh);
  static void refuse(const threadresource& scratch);
  static void refuse(const memorymanager& pool);
  static void refuse_target();
  static void refuse_toolkit();

 private:
  template <class Uses>
  static void refuse(const char* name, Uses uses);

  const model* const used_model;
  const threadresource* const used_scratch;
  const in_use* const outer;
  inline static thread_local const in_use* innermost = nullptr;
};

}  // namespace natives
