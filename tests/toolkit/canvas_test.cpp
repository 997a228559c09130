// Presentation on a desktop of the tests' own: what is asked of AWT, X11 and the system, in which order, and that every
// failure half way gives everything back.
#include <gtest/gtest.h>

#include "support/allocation_failure.h"
#include "support/toolkit_fixture.h"
#include "toolkit/canvas.h"
#include "util/exception.h"
#include "util/memorymanager/alignedmemory.h"

// The fixtures come before Xlib's macros.
#include <dlfcn.h>

#include <cerrno>
#include <cstdlib>
#include <memory>
#include <set>

#include "natives/objconvert.h"
#include "toolkit/display_binding.h"

namespace {

// Everything that a canvas can reach. A call whose name, and count from 0, is in `failing` fails.
struct fake_desktop {
  std::vector<std::string> log;
  std::set<std::string> failing;
  std::map<std::string, int> counts;
  bool server_refuses_memory = false;
  int others_errors = 0;  // errors of others, reported at the next XSync, and by then heard by others
  int locks = 0, surfaces = 0, infos = 0, images = 0;
  std::set<void*> mapped;            // our sides
  std::set<unsigned long> attached;  // the server's sides
  std::set<int> segments;            // not marked for removal
  XErrorHandler handler = nullptr;

  std::remove_pointer_t<_XPrivDisplay> display{};
  Screen screens[2]{};
  JAWT_X11DrawingSurfaceInfo platform{};
  JAWT_DrawingSurfaceInfo info{};
  JAWT_DrawingSurface surface{};

  bool call(const std::string& name, const std::string& details = "") {
    log.push_back(details.empty() ? name : name + " " + details);
    return failing.count(name + std::to_string(counts[name]++)) == 0;
  }
  void expect_nothing_held() const {
    EXPECT_EQ(locks, 0) << "AWT is still locked";
    EXPECT_TRUE(surfaces == 0 && infos == 0) << "a drawing surface was not given back";
    EXPECT_EQ(images, 0);
    EXPECT_TRUE(mapped.empty() && attached.empty() && segments.empty()) << "shared memory is left over";
    EXPECT_EQ(handler, &fake_desktop::other_handler) << "the error handler was not put back";
  }
  static int other_handler(Display*, XErrorEvent*);
  static const display_binding& binding();
};

fake_desktop* desk = nullptr;

template <class... Numbers>
std::string numbers(Numbers... values) {
  std::string text;
  ((text += (text.empty() ? "" : ",") + std::to_string(values)), ...);
  return text;
}

int fake_desktop::other_handler(Display*, XErrorEvent*) { return --desk->others_errors; }

void report(unsigned long serial) {
  XErrorEvent event{};
  event.serial = serial;
  desk->handler(reinterpret_cast<Display*>(&desk->display), &event);
}

int destroy_image(XImage* image) {
  desk->call("destroy image");
  --desk->images;
  delete image;  // but not the pixels
  return 1;
}

XImage* make_image(const char* name, Display*, Visual* visual, unsigned depth, int format, char* data, unsigned width,
                   unsigned height, const std::string& more) {
  EXPECT_EQ(visual, desk->screens[0].root_visual);
  if (!desk->call(name, numbers(depth, format, width, height) + more)) return nullptr;
  ++desk->images;
  auto* image = new XImage{};
  image->data = data;
  image->f.destroy_image = destroy_image;
  return image;
}

void JNICALL awt_lock(JNIEnv*) { desk->call("Lock"), ++desk->locks; }
void JNICALL awt_unlock(JNIEnv*) { desk->call("Unlock"), --desk->locks; }
JAWT_DrawingSurface* JNICALL get_surface(JNIEnv*, jobject component) {
  EXPECT_NE(component, nullptr);
  if (!desk->call("GetDrawingSurface")) return nullptr;
  ++desk->surfaces;
  return &desk->surface;
}
void JNICALL free_surface(JAWT_DrawingSurface*) { desk->call("FreeDrawingSurface"), --desk->surfaces; }
jint JNICALL lock_surface(JAWT_DrawingSurface*) {
  if (!desk->call("ds.Lock")) return JAWT_LOCK_ERROR | JAWT_LOCK_SURFACE_CHANGED;
  ++desk->locks;
  return JAWT_LOCK_SURFACE_CHANGED | JAWT_LOCK_BOUNDS_CHANGED;
}
void JNICALL unlock_surface(JAWT_DrawingSurface*) { desk->call("ds.Unlock"), --desk->locks; }
JAWT_DrawingSurfaceInfo* JNICALL get_info(JAWT_DrawingSurface*) {
  if (!desk->call("GetInfo")) return nullptr;
  ++desk->infos;
  return &desk->info;
}
void JNICALL free_info(JAWT_DrawingSurfaceInfo*) { desk->call("FreeInfo"), --desk->infos; }

const display_binding& fake_desktop::binding() {
  static const display_binding fakes = [] {
    display_binding b{};
    b.JAWT_GetAWT = [](JNIEnv*, JAWT* awt) -> jboolean {
      if (!desk->call("GetAWT", numbers(awt->version & 0xF))) return JNI_FALSE;
      awt->Lock = awt_lock, awt->Unlock = awt_unlock;
      awt->GetDrawingSurface = get_surface, awt->FreeDrawingSurface = free_surface;
      return JNI_TRUE;
    };
    b.XQueryExtension = [](Display*, const char* name, int*, int*, int*) -> int {
      EXPECT_GT(desk->locks, 0);
      return desk->call("XQueryExtension", name);
    };
    b.XShmQueryVersion = [](Display*, int*, int*, int*) -> int { return desk->call("XShmQueryVersion"); };
    b.XShmCreateImage = [](Display* d, Visual* v, unsigned depth, int format, char* data, XShmSegmentInfo* segment,
                           unsigned w, unsigned h) {
      segment->shmseg = 0;
      return make_image("XShmCreateImage", d, v, depth, format, data, w, h, "");
    };
    b.XCreateImage = [](Display* d, Visual* v, unsigned depth, int format, int offset, char* data, unsigned w,
                        unsigned h, int pad, int stride) {
      return make_image("XCreateImage", d, v, depth, format, data, w, h, " " + numbers(offset, pad, stride));
    };
    b.XShmAttach = [](Display*, XShmSegmentInfo* segment) -> int {
      ++desk->display.request;
      EXPECT_TRUE(desk->mapped.count(segment->shmaddr) == 1 && segment->readOnly == 0);
      segment->shmseg = 100 + static_cast<unsigned long>(segment->shmid);
      if (!desk->call("XShmAttach")) return 0;
      if (!desk->server_refuses_memory) desk->attached.insert(segment->shmseg);
      return 1;
    };
    b.XShmDetach = [](Display*, XShmSegmentInfo* segment) -> int {
      EXPECT_GT(desk->locks, 0);
      desk->attached.erase(segment->shmseg);
      return desk->call("XShmDetach");
    };
    b.XShmPutImage = [](Display*, Drawable drawable, GC gc, XImage* image, int x, int y, int to_x, int to_y, unsigned w,
                        unsigned h, int event) -> int {
      EXPECT_TRUE(gc == desk->screens[0].default_gc && desk->mapped.count(image->data) == 1 && desk->locks > 0);
      return desk->call("XShmPutImage", numbers(drawable, x, y, to_x, to_y, w, h, event));
    };
    b.XPutImage = [](Display*, Drawable drawable, GC gc, XImage*, int x, int y, int to_x, int to_y, unsigned w,
                     unsigned h) -> int {
      EXPECT_TRUE(gc == desk->screens[0].default_gc && desk->locks > 0);
      return desk->call("XPutImage", numbers(drawable, x, y, to_x, to_y, w, h));
    };
    b.XFree = [](void* image) -> int {
      --desk->images;
      delete static_cast<XImage*>(image);
      return desk->call("XFree");
    };
    b.XFlush = [](Display*) -> int {
      EXPECT_GT(desk->locks, 0);
      return desk->call("XFlush");
    };
    b.XSync = [](Display*, int discard) -> int {
      EXPECT_EQ(discard, 0);
      if (desk->others_errors != 0) report(desk->display.request - 2);
      if (desk->server_refuses_memory) report(desk->display.request);
      return desk->call("XSync");
    };
    b.XSetErrorHandler = [](XErrorHandler fresh) { return std::exchange(desk->handler, fresh); };
    b.shmget = [](key_t key, size_t size, int flags) {
      EXPECT_EQ(key, IPC_PRIVATE);
      if (!desk->call("shmget", numbers(size, flags))) return -1;
      return *desk->segments.insert(desk->counts["shmget"]).first;
    };
    b.shmat = [](int, const void*, int) -> void* {
      if (!desk->call("shmat")) return reinterpret_cast<void*>(-1);
      return *desk->mapped.insert(std::malloc(4096)).first;
    };
    b.shmdt = [](const void* address) {
      desk->mapped.erase(const_cast<void*>(address));
      std::free(const_cast<void*>(address));
      return desk->call("shmdt") ? 0 : -1;
    };
    b.shmctl = [](int id, int command, shmid_ds*) {
      EXPECT_EQ(command, IPC_RMID);
      desk->segments.erase(id);
      return desk->call("remove") ? 0 : -1;
    };
    return b;
  }();
  return fakes;
}

using strings = std::vector<std::string>;
strings operator+(strings a, const strings& b) {
  a.insert(a.end(), b.begin(), b.end());
  return a;
}

class canvas_test : public toolkit_fixture {
 public:
  static constexpr int w = 30, h = 20;
  fake_desktop desktop;
  const jobject component = java.new_object("java/awt/Canvas");
  const jobject canvas_peer = java.new_object("za");
  Visual visuals[2]{};

  canvas_test() {
    desk = &desktop;
    desktop.handler = &fake_desktop::other_handler;
    desktop.screens[0].root_visual = &visuals[0], desktop.screens[1].root_visual = &visuals[1];
    desktop.screens[0].default_gc = reinterpret_cast<GC>(&visuals[0]);
    desktop.display.screens = desktop.screens;
    desktop.display.request = 40;
    desktop.platform.drawable = 7;
    desktop.platform.display = reinterpret_cast<Display*>(&desktop.display);
    desktop.info.platformInfo = &desktop.platform;
    desktop.surface.Lock = lock_surface, desktop.surface.Unlock = unlock_surface;
    desktop.surface.GetDrawingSurfaceInfo = get_info, desktop.surface.FreeDrawingSurfaceInfo = free_info;
  }
  std::unique_ptr<canvas> make() {
    return std::make_unique<canvas>(kit().vm, component, w, h, fake_desktop::binding());
  }
  // A canvas without shared memory forgets its pixels when it goes; the test gives them back.
  void drop_plain(std::unique_ptr<canvas> c) {
    unsigned int* const pixels = c->colourbuffer;
    c.reset();
    pixels[w * h - 1] = 1;
    _aligned_free(pixels);
  }
  template <class Failure = IllegalStateException, class Body>
  std::string failure_of(Body&& body) {
    try {
      body();
    } catch (Failure* failure) {
      const std::unique_ptr<Failure> owned(failure);
      return failure->text();
    }
    return "";
  }
  // What was called since the last time.
  void expect_calls(const strings& expected) { EXPECT_EQ(std::exchange(desktop.log, {}), expected); }
  void forget_calls() { desktop.log.clear(); }
};

const strings open_surface{"GetAWT 4", "Lock", "GetDrawingSurface", "ds.Lock", "GetInfo"};
const strings close_surface{"FreeInfo", "ds.Unlock", "FreeDrawingSurface", "Unlock"};
const strings open_flip{"GetAWT 3", "GetDrawingSurface", "ds.Lock", "GetInfo"};
const strings close_flip{"FreeInfo", "ds.Unlock", "FreeDrawingSurface"};

TEST_F(canvas_test, shared_images_come_and_go_in_order) {
  const strings one{"XShmCreateImage 24,2,30,20", "shmget 2400,1023", "shmat", "XShmAttach"};
  std::unique_ptr<canvas> c = make();
  expect_calls(open_surface + strings{"XQueryExtension MIT-SHM", "XShmQueryVersion"} + one + one +
               strings{"XSync", "remove", "remove"} + close_surface);
  EXPECT_TRUE(c->use_shm);
  EXPECT_EQ(static_cast<void*>(c->colourbuffer), c->shm[0].shmaddr);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(c->depthbuffer) % 64, 0u);
  EXPECT_EQ(desktop.segments.size(), 0u) << "a killed process would leave segments";
  c.reset();
  const strings gone{"XShmDetach", "destroy image", "shmdt"};
  expect_calls((strings{"GetAWT 4", "Lock"}) + gone + gone + strings{"XFlush", "Unlock"});
  desktop.expect_nothing_held();
}

TEST_F(canvas_test, a_display_without_the_extension_gets_one_plain_image_whose_pixels_outlive_it) {
  desktop.failing = {"XQueryExtension0", "XShmQueryVersion0"};
  for (const strings& asked : {strings{"XQueryExtension MIT-SHM"}, {"XQueryExtension MIT-SHM", "XShmQueryVersion"}}) {
    std::unique_ptr<canvas> c = make();
    expect_calls(open_surface + asked + strings{"XCreateImage 24,2,30,20 0,32,0"} + close_surface);
    EXPECT_FALSE(c->use_shm);
    drop_plain(std::move(c));
    expect_calls((strings{"GetAWT 4", "Lock", "XFree", "Unlock"}));
    desktop.expect_nothing_held();
  }
}

TEST_F(canvas_test, shared_memory_that_does_not_work_falls_back_and_leaves_nothing) {
  desktop.others_errors = 1;
  for (const char* call : {"XShmCreateImage", "shmget", "shmat", "XShmAttach", "refused"}) {
    for (const char* which : {"0", "1"}) {
      SCOPED_TRACE(std::string(call) + which);
      desktop.counts.clear();
      desktop.failing = {std::string(call) + which};
      desktop.server_refuses_memory = std::string(call) == "refused";
      std::unique_ptr<canvas> c = make();
      EXPECT_FALSE(c->use_shm);
      EXPECT_EQ(desktop.images, 1);
      EXPECT_TRUE(desktop.mapped.empty() && desktop.attached.empty() && desktop.segments.empty());
      drop_plain(std::move(c));
      desktop.expect_nothing_held();
      EXPECT_EQ(desktop.others_errors, 0) << "an error of someone else was swallowed";
    }
  }
}

TEST_F(canvas_test, a_component_without_a_surface_or_memory_raises_and_leaves_nothing) {
  const int weak = java.weak_references();
  for (const char* call : {"GetAWT0", "GetDrawingSurface0", "ds.Lock0", "GetInfo0", "XCreateImage0"}) {
    SCOPED_TRACE(call);
    desktop.counts.clear();
    desktop.failing = {call, "XQueryExtension0"};
    EXPECT_NE(failure_of([&] { make(); }), "");
    EXPECT_EQ(java.weak_references(), weak);
    desktop.expect_nothing_held();
  }
  for (const int buffer : {1, 2}) {
    desktop.counts.clear();
    desktop.failing = {"XQueryExtension0"};
    allocation_failure::fail_memalign(buffer, ENOMEM);
    EXPECT_EQ(failure_of<RuntimeException>([&] { make(); }), "Cannot allocate memory");
    EXPECT_EQ(java.weak_references(), weak);
    desktop.expect_nothing_held();
  }
}

TEST_F(canvas_test, flips_take_turns_and_take_the_targets_along) {
  std::unique_ptr<canvas> c = make();
  unsigned int* const first = c->colourbuffer;
  forget_calls();
  c->flip(5, 6, 20, 10);
  expect_calls(open_flip + strings{"XShmPutImage 7,5,6,0,0,20,10,0", "XFlush"} + close_flip);
  EXPECT_EQ(static_cast<void*>(c->colourbuffer), c->shm[1].shmaddr);
  EXPECT_EQ(kit().colourbuffer, c->colourbuffer);
  EXPECT_EQ(Rasterizer_n::m_pColourBuffer, c->colourbuffer);
  c->flip(0, 0, w, h);
  EXPECT_EQ(c->colourbuffer, first);
  forget_calls();
  c->flip_dirtyrect(0, 0, w, h, 1, 2);
  expect_calls(open_flip + close_flip);
  EXPECT_EQ(c->colourbuffer, first);
  c.reset();
  desktop.expect_nothing_held();
}

TEST_F(canvas_test, a_plain_flip_leaves_the_targets) {
  desktop.failing = {"XQueryExtension0"};
  std::unique_ptr<canvas> c = make();
  unsigned int* const first = c->colourbuffer;
  forget_calls();
  c->flip(5, 6, 20, 10);
  expect_calls(open_flip + strings{"XPutImage 7,5,6,0,0,20,10", "XFlush"} + close_flip);
  EXPECT_EQ(c->colourbuffer, first);
  EXPECT_EQ(kit().colourbuffer, nullptr);
  EXPECT_EQ(Rasterizer_n::m_pColourBuffer, nullptr);
  drop_plain(std::move(c));
}

TEST_F(canvas_test, flips_without_a_surface_return_quietly) {
  std::unique_ptr<canvas> c = make();
  unsigned int* const first = c->colourbuffer;
  const std::map<std::string, strings> undone{{"GetAWT0", {}},
                                              {"GetDrawingSurface0", {}},
                                              {"ds.Lock0", {"FreeDrawingSurface"}},
                                              {"GetInfo0", {"ds.Unlock", "FreeDrawingSurface"}}};
  std::size_t done = 0;
  for (const char* call : {"GetAWT0", "GetDrawingSurface0", "ds.Lock0", "GetInfo0"}) {
    const strings expected =
        strings(open_flip.begin(), open_flip.begin() + static_cast<long>(++done)) + undone.at(call);
    for (const bool dirty : {false, true}) {
      forget_calls();
      desktop.counts.clear();
      desktop.failing = {call};
      dirty ? c->flip_dirtyrect(0, 0, 1, 1, 1, 1) : c->flip(0, 0, w, h);
      expect_calls(expected);
      EXPECT_EQ(c->colourbuffer, first);
    }
  }
  java.collect(component);
  c->flip(0, 0, w, h);
  expect_calls({"GetAWT 3"});
  const jweak reference = std::exchange(c->java_canvas, nullptr);
  EXPECT_DEATH(c->flip(0, 0, w, h), R"(\.\./canvas:194: void canvas::flip\(s32, s32, s32, s32\): .*java_canvas)");
  c->java_canvas = reference;
}

TEST_F(canvas_test, resizing_replaces_everything_even_when_it_fails) {
  std::unique_ptr<canvas> c = make();
  const int weak = java.weak_references();
  c->flip(0, 0, w, h);
  c->resized(java.new_object("java/awt/Panel"), 8, 4);
  EXPECT_TRUE(c->width == 8 && c->height == 4 && c->current == 0);
  EXPECT_EQ(desktop.images, 2);
  EXPECT_EQ(java.weak_references(), weak);
  desktop.counts.clear();
  desktop.failing = {"ds.Lock0"};
  EXPECT_NE(failure_of([&] { c->resized(component, w, h); }), "");
  desktop.expect_nothing_held();
  EXPECT_TRUE(c->width == 0 && c->colourbuffer == nullptr && c->depthbuffer == nullptr);
  kit().set_active_canvas(c.get());
  c->flip(0, 0, 0, 0);
  c->resized(component, w, h);
  EXPECT_TRUE(c->width == w && c->use_shm);
  desktop.counts.clear();
  desktop.failing = {"XQueryExtension0"};
  c->resized(component, w, h);
  EXPECT_FALSE(c->use_shm);
  drop_plain(std::move(c));
  desktop.expect_nothing_held();
  EXPECT_EQ(java.weak_references(), weak - 1);
}

// --- The natives ---------------------------------------------------------------------------------------------------

TEST_F(canvas_test, natives_check_the_component_and_the_size_and_need_a_display) {
  const auto failure = [&](jobject on, jint width, jint height) {
    Java_za_n(env, canvas_peer, 0, on, width, height);
    EXPECT_EQ(java.nativeid(canvas_peer), 0);
    return java.take_exception();
  };
  EXPECT_EQ(failure(nullptr, w, h), "java.lang.NullPointerException: ");
  EXPECT_EQ(failure(component, 0, h), "java.lang.IllegalArgumentException: width: 0 is less than 1");
  EXPECT_EQ(failure(component, w, -1), "java.lang.IllegalArgumentException: height: -1 is less than 1");
  EXPECT_EQ(failure(component, 65536, 1), "java.lang.IllegalArgumentException: width: 65536 is more than 65535");
  EXPECT_NE(failure(component, 30000, 30000).find("30000x30000 needs 3600000000 bytes"), std::string::npos);
  EXPECT_EQ(failure(component, w, h), "java.lang.IllegalStateException: no display: AWT has not loaded libX11.so.6");
  EXPECT_EQ(dlopen("libX11.so.6", RTLD_LAZY | RTLD_NOLOAD), nullptr) << "X11 was loaded into a headless process";
  Java_za_H(env, canvas_peer, 0, 0, 1, 1);
  EXPECT_EQ(java.take_exception(), "java.lang.NullPointerException: ");
}

TEST_F(canvas_test, natives_check_the_flipped_rectangle_and_take_back_the_target) {
  objconvert::set_canvas(env, canvas_peer, make().release());
  Java_ja_PA(env, peer, canvas_peer);
  EXPECT_EQ(kit().colourbuffer[w * h - 1], 0u);
  forget_calls();
  const jint wrong[][4] = {{1, 0, w, h}, {0, 1, w, h}, {-1, 0, 1, 1}, {0, 0, -1, 1}, {0, 0, 1, 0x7FFFFFFF}};
  for (const jint(&r)[4] : wrong) {
    Java_za_H(env, canvas_peer, r[0], r[1], r[2], r[3]);
    EXPECT_EQ(java.take_exception().rfind("java.lang.IllegalArgumentException: ", 0), 0u);
  }
  expect_calls({});
  Java_za_H(env, canvas_peer, 0, 0, w, h);
  EXPECT_EQ(desktop.counts["XShmPutImage"], 1);
  Java_za_ma(env, canvas_peer);
  EXPECT_EQ(java.nativeid(canvas_peer), 0);
  EXPECT_EQ(kit().colourbuffer, nullptr) << "drawing would write to unmapped memory";
  EXPECT_EQ(Rasterizer_n::m_pColourBuffer, nullptr);
  EXPECT_EQ(kit().depthbuffer, nullptr);
  Java_za_ma(env, canvas_peer);
  EXPECT_EQ(java.take_exception(), "");
  desktop.expect_nothing_held();
}

// The size of a target outlives its image, and a flip puts the canvas's image in its place.
TEST_F(canvas_test, a_flip_under_the_size_of_a_larger_target_is_refused) {
  objconvert::set_canvas(env, canvas_peer, make().release());
  const jobject sprite = java.new_object("fa"), depths = java.new_object("oa");
  const auto to_sprite = [&](int height) {
    Java_fa_M(env, sprite, java.nativeid(sprite));
    Java_fa_UA(env, sprite, 0, w, height);
    Java_ja_d(env, peer, java.nativeid(sprite), 0);
  };
  Java_oa_g(env, depths, w, h + 1);
  const std::map<std::string, std::function<void()>> setups{
      {"a depth image alone", [&] { Java_ja_d(env, peer, 0, java.nativeid(depths)); }},
      {"a sprite, then nothing", [&] { to_sprite(h + 1), Java_ja_d(env, peer, 0, 0); }},
      {"a sprite that is gone", [&] { to_sprite(h + 1), Java_fa_M(env, sprite, java.nativeid(sprite)); }},
      {"a sprite", [&] { to_sprite(h + 1); }}};
  for (const auto& [name, set_up] : setups) {
    SCOPED_TRACE(name);
    Java_ja_PA(env, peer, canvas_peer);
    set_up();
    const unsigned int* const target = kit().colourbuffer;
    forget_calls();
    Java_za_H(env, canvas_peer, 0, 0, w, h);
    EXPECT_EQ(java.take_exception(),
              "java.lang.IllegalStateException: canvas: 30x20 cannot become the target of 30x21");
    expect_calls({});
    EXPECT_EQ(kit().colourbuffer, target);
    to_sprite(h);
    Java_za_H(env, canvas_peer, 0, 0, w, h);
    EXPECT_EQ(java.take_exception(), "") << "a target of the canvas's size";
  }
  Java_fa_M(env, sprite, java.nativeid(sprite));
  Java_oa_za(env, depths, java.nativeid(depths));
  Java_za_ma(env, canvas_peer);
  desktop.expect_nothing_held();
}

}  // namespace
