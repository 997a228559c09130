#include "toolkit/display_binding.h"

#include <dlfcn.h>

#include <memory>
#include <string>

#include "util/exception.h"

namespace {

struct close_library {
  void operator()(void* handle) const { dlclose(handle); }
};
using library = std::unique_ptr<void, close_library>;

// A library that AWT has loaded already.
library loaded_library(const char* name) {
  library found(dlopen(name, RTLD_LAZY | RTLD_NOLOAD));
  if (found == nullptr) {
    throw new IllegalStateException((std::string("no display: AWT has not loaded ") + name).c_str());
  }
  return found;
}

// libjawt is loaded by those who use it. It lies in the runtime's library folder, one above that of the virtual
// machine.
library jawt_library(JavaVM* vm) {
  if (library found{dlopen("libjawt.so", RTLD_LAZY | RTLD_NOLOAD)}) return found;
  Dl_info machine;
  if (dladdr(reinterpret_cast<void*>(vm->functions->GetEnv), &machine) != 0 && machine.dli_fname != nullptr) {
    std::string path = machine.dli_fname;
    for (int level = 0; level < 2; ++level) {
      const std::size_t slash = path.rfind('/');
      path.resize(slash == std::string::npos ? 0 : slash);
    }
    if (library found{dlopen((path + "/libjawt.so").c_str(), RTLD_LAZY)}) return found;
  }
  if (library found{dlopen("libjawt.so", RTLD_LAZY)}) return found;
  throw new IllegalStateException("no display: the Java runtime has no libjawt.so");
}

template <class Function>
void bind_function(const library& from, const char* name, Function& function) {
  function = reinterpret_cast<Function>(dlsym(from.get(), name));
  if (function == nullptr) {
    throw new IllegalStateException((std::string("no display: no function ") + name).c_str());
  }
}

display_binding bind(JavaVM* vm) {
  // The X libraries come first: without them libjawt would load them into a headless runtime.
  library x11 = loaded_library("libX11.so.6");
  library xext = loaded_library("libXext.so.6");
  library jawt = jawt_library(vm);

  display_binding b = {};
  bind_function(jawt, "JAWT_GetAWT", b.JAWT_GetAWT);
  bind_function(x11, "XQueryExtension", b.XQueryExtension);
  bind_function(x11, "XCreateImage", b.XCreateImage);
  bind_function(x11, "XPutImage", b.XPutImage);
  bind_function(x11, "XFree", b.XFree);
  bind_function(x11, "XFlush", b.XFlush);
  bind_function(x11, "XSync", b.XSync);
  bind_function(x11, "XSetErrorHandler", b.XSetErrorHandler);
  bind_function(xext, "XShmQueryVersion", b.XShmQueryVersion);
  bind_function(xext, "XShmCreateImage", b.XShmCreateImage);
  bind_function(xext, "XShmAttach", b.XShmAttach);
  bind_function(xext, "XShmDetach", b.XShmDetach);
  bind_function(xext, "XShmPutImage", b.XShmPutImage);
  b.shmget = ::shmget;
  b.shmat = ::shmat;
  b.shmdt = ::shmdt;
  b.shmctl = ::shmctl;

  // Bound for the rest of the process.
  static_cast<void>(x11.release());
  static_cast<void>(xext.release());
  static_cast<void>(jawt.release());
  return b;
}

}  // namespace

const display_binding& display_binding::get(JavaVM* vm) {
  static const display_binding bound = bind(vm);  // a failure leaves it to the next call
  return bound;
}
