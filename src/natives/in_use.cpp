#include "natives/in_use.h"

#include "model/model.h"

namespace natives {

template <class Uses>
void in_use::refuse(const char* name, Uses uses) {
  if (!contract::checked) return;
  for (const in_use* mark = innermost; mark != nullptr; mark = mark->outer) {
    if (uses(*mark)) contract::fail_state("%s: it is in use by a call that has not returned", name);
  }
}

void in_use::refuse(const model& mesh) {
  refuse("model", [&](const in_use& mark) { return mark.used_model == &mesh; });
}
void in_use::refuse(const threadresource& scratch) {
  refuse("resource", [&](const in_use& mark) { return mark.used_scratch == &scratch; });
}
void in_use::refuse(const memorymanager& pool) {
  refuse("pool", [&](const in_use& mark) { return mark.used_model != nullptr && mark.used_model->pool == &pool; });
}
void in_use::refuse_target() {
  refuse("target", [](const in_use& mark) { return mark.used_scratch != nullptr; });
}
void in_use::refuse_toolkit() {
  refuse("toolkit", [](const in_use&) { return true; });
}

}  // namespace natives
