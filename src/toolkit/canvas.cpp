#include "toolkit/canvas.h"

#include <sys/ipc.h>

#include <cstddef>
#include <cstdint>

#include "raster/Rasterizer.h"
#include "raster/imagememory.h"
#include "toolkit/display_binding.h"
#include "toolkit/toolkit.h"
#include "util/assertion.h"
#include "util/exception.h"
#include "util/memorymanager/alignedmemory.h"

static_assert(sizeof(canvas::segment) == sizeof(XShmSegmentInfo) &&
              offsetof(canvas::segment, shmid) == offsetof(XShmSegmentInfo, shmid) &&
              offsetof(canvas::segment, shmaddr) == offsetof(XShmSegmentInfo, shmaddr) &&
              offsetof(canvas::segment, readOnly) == offsetof(XShmSegmentInfo, readOnly));

namespace {

constexpr int image_depth = 24;
constexpr int create_for_all = 0x3FF;  // IPC_CREAT, and permissions 0777

XShmSegmentInfo* x_segment(canvas::segment& segment) { return reinterpret_cast<XShmSegmentInfo*>(&segment); }

std::size_t buffer_size(int width, int height) { return static_cast<std::size_t>(width) * 4 * height; }

// Keeps AWT, and with it the display connection, to this thread.
class awt_lock {
 public:
  awt_lock(const JAWT& locked, JNIEnv* environment) : awt(locked), env(environment) { awt.Lock(env); }
  ~awt_lock() { awt.Unlock(env); }
  awt_lock(const awt_lock&) = delete;
  awt_lock& operator=(const awt_lock&) = delete;

 private:
  const JAWT& awt;
  JNIEnv* env;
};

// The locked surface of a component, as far as AWT gives it; undone in reverse.
class drawing_surface {
 public:
  drawing_surface(const JAWT& from, JNIEnv* env, jweak component) : awt(from) {
    // A component that was collected has no surface, and AWT does not ask.
    jobject target = env->NewLocalRef(component);
    if (target == nullptr) return;
    ds = awt.GetDrawingSurface(env, target);
    env->DeleteLocalRef(target);
    if (ds == nullptr) return;
    locked = (ds->Lock(ds) & JAWT_LOCK_ERROR) == 0;
    if (locked) info = ds->GetDrawingSurfaceInfo(ds);
  }
  ~drawing_surface() {
    if (info != nullptr) ds->FreeDrawingSurfaceInfo(info);
    if (locked) ds->Unlock(ds);
    if (ds != nullptr) awt.FreeDrawingSurface(ds);
  }
  drawing_surface(const drawing_surface&) = delete;
  drawing_surface& operator=(const drawing_surface&) = delete;

  // Null when there is nothing to draw on.
  const JAWT_X11DrawingSurfaceInfo* x11() const {
    return info != nullptr ? static_cast<const JAWT_X11DrawingSurfaceInfo*>(info->platformInfo) : nullptr;
  }

 private:
  const JAWT& awt;
  JAWT_DrawingSurface* ds = nullptr;
  bool locked = false;
  JAWT_DrawingSurfaceInfo* info = nullptr;
};

// Notices errors that the display reports to requests made from here on. Xlib's handler is one for the process, so
// this holds AWT's lock, and passes on what belongs to others.
class error_trap {
 public:
  error_trap(const display_binding& functions, Display* watched) : binding(functions), display(watched) {
    first = NextRequest(display);
    failed = false;
    trapped = this;
    previous = binding.XSetErrorHandler(&error_trap::handle);
  }
  ~error_trap() {
    binding.XSetErrorHandler(previous);
    trapped = nullptr;
  }
  error_trap(const error_trap&) = delete;
  error_trap& operator=(const error_trap&) = delete;

  // Waits until the display has dealt with all requests.
  bool all_well() {
    binding.XSync(display, False);
    return !failed;
  }

 private:
  static int handle(Display* display, XErrorEvent* error) {
    if (display == trapped->display && error->serial >= trapped->first) {
      trapped->failed = true;
      return 0;
    }
    return trapped->previous != nullptr ? trapped->previous(display, error) : 0;
  }

  static error_trap* trapped;
  const display_binding& binding;
  Display* display;
  unsigned long first;
  bool failed;
  XErrorHandler previous;
};

error_trap* error_trap::trapped = nullptr;

bool get_awt(const display_binding& binding, JNIEnv* env, jint version, JAWT& awt) {
  awt.version = version;
  return binding.JAWT_GetAWT(env, &awt) != JNI_FALSE;
}

}  // namespace

canvas::canvas(JavaVM* machine, jobject component, int w, int h, const display_binding& functions)
    : vm(machine), binding(functions) {
  JNIEnv* env = get_env();
  java_canvas = env->NewWeakGlobalRef(component);
  if (java_canvas == nullptr) throw new JavaExceptionPending;
  try {
    create_backbuffer(w, h);
  } catch (...) {
    env->DeleteWeakGlobalRef(java_canvas);
    throw;
  }
}

canvas::~canvas() {
  free_backbuffer();
  if (java_canvas != nullptr) get_env()->DeleteWeakGlobalRef(java_canvas);
  java_canvas = nullptr;
}

JNIEnv* canvas::get_env() const {
  void* env = nullptr;
  vm->GetEnv(&env, 0x10001);
  return static_cast<JNIEnv*>(env);
}

void canvas::resized(jobject component, int w, int h) {
  free_backbuffer();
  JNIEnv* env = get_env();
  if (java_canvas != nullptr) env->DeleteWeakGlobalRef(java_canvas);
  java_canvas = env->NewWeakGlobalRef(component);
  if (java_canvas == nullptr) throw new JavaExceptionPending;
  create_backbuffer(w, h);
}

void canvas::create_backbuffer(int new_width, int new_height) {
  width = new_width;
  height = new_height;
  try {
    depthbuffer = static_cast<float*>(_aligned_malloc(raster::whole_groups(buffer_size(width, height)), 64));
    JNIEnv* env = get_env();
    JAWT awt = {};
    if (!get_awt(binding, env, JAWT_VERSION_1_4, awt))
      throw new IllegalStateException("component: AWT gives no drawing surfaces");
    const awt_lock lock(awt, env);
    const drawing_surface surface(awt, env, java_canvas);
    if (surface.x11() == nullptr) throw new IllegalStateException("component: AWT gives no drawing surface for it");
    display = surface.x11()->display;

    use_shm = false;
    int opcode, first_event, first_error, major, minor;
    Bool pixmaps;
    if (binding.XQueryExtension(display, "MIT-SHM", &opcode, &first_event, &first_error) &&
        binding.XShmQueryVersion(display, &major, &minor, &pixmaps)) {
      use_shm = create_shared_images();
    }
    if (!use_shm) create_local_image();
  } catch (...) {
    _aligned_free(depthbuffer);
    depthbuffer = nullptr;
    width = 0;
    height = 0;
    throw;
  }
}

// Makes both images, or none: a display may offer the extension and still be unable to reach our memory.
bool canvas::create_shared_images() {
  current = 0;
  error_trap trap(binding, display);
  int made = 0;
  bool attached = true;
  while (made < 2 && attached && map_shared_image(made)) {
    attached = binding.XShmAttach(display, x_segment(shm[made])) != 0;
    ++made;
  }
  attached = trap.all_well() && attached;

  // Both sides are attached now, or never will be. From here the kernel removes a segment with its last user, even
  // when this process is killed.
  for (int i = 0; i < made; ++i) binding.shmctl(shm[i].shmid, IPC_RMID, nullptr);
  if (attached && made == 2) {
    colourbuffer = reinterpret_cast<unsigned int*>(image[current]->data);
    return true;
  }
  // Detaching what the display never attached is one more error that nobody needs to hear of.
  for (int i = 0; i < made; ++i) release_shared_image(i);
  trap.all_well();
  return false;
}

// An image in shared memory, our side only.
bool canvas::map_shared_image(int i) {
  XImage* const fresh = binding.XShmCreateImage(display, ScreenOfDisplay(display, 0)->root_visual, image_depth, ZPixmap,
                                                nullptr, x_segment(shm[i]), width, height);
  if (fresh == nullptr) return false;
  void* const nowhere = reinterpret_cast<void*>(-1);
  void* address = nowhere;
  shm[i].shmid = binding.shmget(IPC_PRIVATE, buffer_size(width, height), create_for_all);
  if (shm[i].shmid != -1) {
    address = binding.shmat(shm[i].shmid, nullptr, 0);
    if (address == nowhere) binding.shmctl(shm[i].shmid, IPC_RMID, nullptr);
  }
  if (address == nowhere) {
    XDestroyImage(fresh);
    return false;
  }
  image[i] = fresh;
  shm[i].shmaddr = fresh->data = static_cast<char*>(address);
  shm[i].readOnly = False;
  return true;
}

void canvas::create_local_image() {
  colourbuffer = static_cast<unsigned int*>(_aligned_malloc(raster::whole_groups(buffer_size(width, height)), 64));
  image[0] = binding.XCreateImage(display, ScreenOfDisplay(display, 0)->root_visual, image_depth, ZPixmap, 0,
                                  reinterpret_cast<char*>(colourbuffer), width, height, 32, 0);
  if (image[0] == nullptr) {
    _aligned_free(colourbuffer);
    colourbuffer = nullptr;
    throw new IllegalStateException("component: the display has no images of depth 24");
  }
}

void canvas::release_shared_image(int i) {
  binding.XShmDetach(display, x_segment(shm[i]));
  XDestroyImage(image[i]);
  image[i] = nullptr;
  binding.shmdt(shm[i].shmaddr);
}

void canvas::free_backbuffer() {
  colourbuffer = nullptr;
  _aligned_free(depthbuffer);
  depthbuffer = nullptr;
  if (image[0] == nullptr) return;  // a resize failed

  JNIEnv* env = get_env();
  JAWT awt = {};
  if (!get_awt(binding, env, JAWT_VERSION_1_4, awt)) return;
  const awt_lock lock(awt, env);
  if (use_shm) {
    release_shared_image(0);
    release_shared_image(1);
    binding.XFlush(display);
  } else {
    // The colour buffer is forgotten by now, so its memory stays with those who may still hold its address.
    _aligned_free(colourbuffer);
    binding.XFree(image[0]);
    image[0] = nullptr;
  }
}

void canvas::flip(int x, int y, int w, int h) {
  assertion::require(java_canvas != nullptr, "java_canvas", "../canvas", 194, "void canvas::flip(s32, s32, s32, s32)");
  JNIEnv* env = get_env();
  JAWT awt = {};
  if (!get_awt(binding, env, JAWT_VERSION_1_3, awt)) return;
  const drawing_surface surface(awt, env, java_canvas);
  if (surface.x11() == nullptr || image[0] == nullptr) return;
  display = surface.x11()->display;
  const GC gc = ScreenOfDisplay(display, 0)->default_gc;
  if (use_shm) {
    binding.XShmPutImage(display, surface.x11()->drawable, gc, image[current], x, y, 0, 0, w, h, False);
    current ^= 1;
    colourbuffer = reinterpret_cast<unsigned int*>(image[current]->data);
    Rasterizer_n::m_pColourBuffer = colourbuffer;
    toolkit::m_pInstance->colourbuffer = colourbuffer;
  } else {
    binding.XPutImage(display, surface.x11()->drawable, gc, image[0], x, y, 0, 0, w, h);
  }
  // AWT does not flush whenever it unlocks. A frame that stays in the connection's buffer shows with the next one.
  binding.XFlush(display);
}

void canvas::flip_dirtyrect(int, int, int, int, int, int) {
  JNIEnv* env = get_env();
  JAWT awt = {};
  if (!get_awt(binding, env, JAWT_VERSION_1_3, awt)) return;
  const drawing_surface surface(awt, env, java_canvas);
}
