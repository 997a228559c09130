// The functions of AWT, Xlib and the system that presentation calls. The library links to none of AWT and X11: it loads
// and draws in a headless runtime too, and binds them when the first canvas is made, from what AWT has loaded by then.
//
// Includes Xlib's headers, which define macros with everyday names: for the sources of the canvas only.
#pragma once

#include <jawt_md.h>

// Xlib before its extension.
#include <X11/extensions/XShm.h>
#include <sys/shm.h>

struct display_binding {
  decltype(&::JAWT_GetAWT) JAWT_GetAWT;

  decltype(&::XQueryExtension) XQueryExtension;
  decltype(&::XCreateImage) XCreateImage;
  decltype(&::XPutImage) XPutImage;
  decltype(&::XFree) XFree;
  decltype(&::XFlush) XFlush;
  decltype(&::XSync) XSync;
  decltype(&::XSetErrorHandler) XSetErrorHandler;

  decltype(&::XShmQueryVersion) XShmQueryVersion;
  decltype(&::XShmCreateImage) XShmCreateImage;
  decltype(&::XShmAttach) XShmAttach;
  decltype(&::XShmDetach) XShmDetach;
  decltype(&::XShmPutImage) XShmPutImage;

  int (*shmget)(key_t key, size_t size, int flags);
  void* (*shmat)(int id, const void* address, int flags);
  int (*shmdt)(const void* address);
  int (*shmctl)(int id, int command, shmid_ds* state);

  // The process's own, bound at the first call that succeeds. Throws IllegalStateException* in a runtime without AWT's
  // display support.
  static const display_binding& get(JavaVM* vm);
};
