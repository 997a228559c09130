// Presentation on a desktop of the tests' own: what is asked of AWT, X11 and the system, in which order, and that every
// failure half way gives everything back.
#include <gtest/gtest.h>

#include "support/toolkit_fixture.h"
#include "toolkit/canvas.h"
#include "util/exception.h"
#include "util/memorymanager/alignedmemory.h"

// The fixtures come before Xlib's macros.
#include <dlfcn.h>

#include <cerrno>
#include <cstdlib>
#include <map>
#include <memory>
#include <set>

#include "natives/native.h"
#include "toolkit/display_binding.h"

namespace {

using strings = std::vector<std::string>;
strings operator+(strings a, const strings& b) {
  a.insert(a.end(), b.begin(), b.end());
  return a;
}

std::string numbers(auto... values) {
  std::string text;
  ((text += (text.empty() ? "" : ",") + std::to_string(values)), ...);
  return text;
}

std::string at(const void* memory) { return "memory " + numbers(reinterpret_cast<std::uintptr_t>(memory)); }

// Everything that a canvas can reach. A call whose name, and count from 0, is in `failing` fails.
struct fake_desktop {
  strings log;
  std::set<std::string> failing;
  std::map<std::string, int> counts;
  std::multiset<std::string> held;  // locks, images, memory: all that must be given back
  bool server_refuses_memory = false;
  int others_errors = 0;  // errors of others, reported at the next XSync, and by then heard by others
  XErrorHandler handler = nullptr;

  std::remove_pointer_t<_XPrivDisplay> display{};
  Screen screens[2]{};
  JAWT_X11DrawingSurfaceInfo platform{};
  JAWT_DrawingSurfaceInfo info{};
  JAWT_DrawingSurface surface{};

  bool call(const std::string& name, const std::string& details = "") {
    log.push_back(details.empty() ? name : name + " " + details);
    return !failing.contains(name + std::to_string(counts[name]++));
  }
  // A call that gives something, or takes it back.
  bool take(const std::string& thing, const std::string& name, const std::string& details = "") {
    const bool works = call(name, details);
    if (works) held.insert(thing);
    return works;
  }
  int give(const std::string& thing, const std::string& name) {
    EXPECT_TRUE(held.contains(thing)) << name << ": no " << thing;
    if (held.contains(thing)) held.erase(held.find(thing));
    return call(name);
  }
  void expect_nothing_held() const {
    EXPECT_EQ(held, std::multiset<std::string>());
    EXPECT_EQ(handler, &fake_desktop::other_handler) << "the error handler was not put back";
  }
  void report_error(unsigned long serial) {
    XErrorEvent event{};
    event.serial = serial;
    handler(reinterpret_cast<Display*>(&display), &event);
  }
  static int other_handler(Display*, XErrorEvent*);
  static const display_binding& binding();
};

fake_desktop* desk = nullptr;

int fake_desktop::other_handler(Display*, XErrorEvent*) { return --desk->others_errors; }

XImage* make_image(const char* name, Visual* visual, char* data, const std::string& details) {
  EXPECT_EQ(visual, desk->screens[0].root_visual);
  if (!desk->take("image", name, details)) return nullptr;
  auto* image = new XImage{};
  image->data = data;
  image->f.destroy_image = [](XImage* unused) {
    delete unused;  // but not the pixels
    return desk->give("image", "destroy image");
  };
  return image;
}

// What a present must look like, for the log.
int put(const char* name, GC gc, const std::string& details) {
  EXPECT_TRUE(gc == desk->screens[0].default_gc && desk->held.contains("lock"));
  return desk->call(name, details);
}

const display_binding& fake_desktop::binding() {
  static const display_binding fakes = [] {
    display_binding b{};
    b.JAWT_GetAWT = [](JNIEnv*, JAWT* awt) -> jboolean {
      awt->Lock = [](JNIEnv*) { desk->take("lock", "Lock"); };
      awt->Unlock = [](JNIEnv*) { desk->give("lock", "Unlock"); };
      awt->GetDrawingSurface = [](JNIEnv*, jobject component) {
        EXPECT_NE(component, nullptr);
        return desk->take("surface", "GetDrawingSurface") ? &desk->surface : nullptr;
      };
      awt->FreeDrawingSurface = [](JAWT_DrawingSurface*) { desk->give("surface", "FreeDrawingSurface"); };
      return desk->call("GetAWT", numbers(awt->version & 0xF));
    };
    b.XQueryExtension = [](Display*, const char* name, auto...) -> int { return desk->call("XQueryExtension", name); };
    b.XShmQueryVersion = [](auto...) -> int { return desk->call("XShmQueryVersion"); };
    b.XShmCreateImage = [](Display*, Visual* v, unsigned depth, int format, char* data, auto, unsigned w, unsigned h) {
      return make_image("XShmCreateImage", v, data, numbers(depth, format, w, h));
    };
    b.XCreateImage = [](Display*, Visual* v, unsigned depth, int format, int offset, char* data, auto... rest) {
      return make_image("XCreateImage", v, data, numbers(depth, format, offset, rest...));
    };
    b.XShmAttach = [](Display*, XShmSegmentInfo* segment) -> int {
      ++desk->display.request;
      EXPECT_TRUE(desk->held.contains(at(segment->shmaddr)) && segment->readOnly == 0);
      segment->shmseg = 100 + static_cast<unsigned long>(segment->shmid);
      if (!desk->call("XShmAttach")) return 0;
      if (!desk->server_refuses_memory) desk->held.insert("server's " + numbers(segment->shmseg));
      return 1;
    };
    b.XShmDetach = [](Display*, XShmSegmentInfo* segment) -> int {
      EXPECT_TRUE(desk->held.contains("lock"));
      desk->held.erase("server's " + numbers(segment->shmseg));
      return desk->call("XShmDetach");
    };
    b.XShmPutImage = [](Display*, Drawable drawable, GC gc, XImage* image, auto... rest) {
      EXPECT_TRUE(desk->held.contains(at(image->data)));
      return put("XShmPutImage", gc, numbers(drawable, rest...));
    };
    b.XPutImage = [](Display*, Drawable drawable, GC gc, XImage*, auto... rest) {
      return put("XPutImage", gc, numbers(drawable, rest...));
    };
    b.XFree = [](void* image) {
      delete static_cast<XImage*>(image);
      return desk->give("image", "XFree");
    };
    b.XFlush = [](Display*) -> int {
      EXPECT_TRUE(desk->held.contains("lock"));
      return desk->call("XFlush");
    };
    b.XSync = [](Display*, int discard) -> int {
      EXPECT_EQ(discard, 0);
      if (desk->others_errors != 0) desk->report_error(desk->display.request - 2);
      if (desk->server_refuses_memory) desk->report_error(desk->display.request);
      return desk->call("XSync");
    };
    b.XSetErrorHandler = [](XErrorHandler fresh) { return std::exchange(desk->handler, fresh); };
    b.shmget = [](key_t key, size_t size, int flags) {
      EXPECT_EQ(key, IPC_PRIVATE);
      const int id = desk->counts["shmget"];
      return desk->take("segment " + numbers(id), "shmget", numbers(size, flags)) ? id : -1;
    };
    b.shmat = [](auto...) {
      if (!desk->call("shmat")) return reinterpret_cast<void*>(-1);
      void* const memory = std::malloc(4096);
      desk->held.insert(at(memory));
      return memory;
    };
    b.shmdt = [](const void* memory) {
      const int result = desk->give(at(memory), "shmdt") - 1;
      std::free(const_cast<void*>(memory));
      return result;
    };
    b.shmctl = [](int id, int command, auto...) {
      EXPECT_EQ(command, IPC_RMID);
      return desk->give("segment " + numbers(id), "remove") - 1;
    };
    return b;
  }();
  return fakes;
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
    desktop.surface.Lock = [](JAWT_DrawingSurface*) -> jint {
      const jint news = JAWT_LOCK_SURFACE_CHANGED | JAWT_LOCK_BOUNDS_CHANGED;
      return desk->take("lock", "ds.Lock") ? news : news | JAWT_LOCK_ERROR;
    };
    desktop.surface.Unlock = [](JAWT_DrawingSurface*) { desk->give("lock", "ds.Unlock"); };
    desktop.surface.GetDrawingSurfaceInfo = [](JAWT_DrawingSurface*) {
      return desk->take("info", "GetInfo") ? &desk->info : nullptr;
    };
    desktop.surface.FreeDrawingSurfaceInfo = [](JAWT_DrawingSurfaceInfo*) { desk->give("info", "FreeInfo"); };
  }

  // From here on these calls fail; those since before are forgotten.
  void failing(const std::set<std::string>& calls) {
    desktop.counts.clear();
    desktop.log.clear();
    desktop.failing = calls;
  }
  std::unique_ptr<canvas> make() {
    return std::make_unique<canvas>(kit().vm, component, w, h, fake_desktop::binding());
  }
  // A canvas without shared memory forgets its pixels when it goes; the test gives them back.
  void drop(std::unique_ptr<canvas> c) {
    unsigned int* const pixels = c->use_shm ? nullptr : c->colourbuffer;
    c.reset();
    if (pixels != nullptr) pixels[w * h - 1] = 1;
    _aligned_free(pixels);
    desktop.expect_nothing_held();
  }
  std::string failure_of(const std::function<void()>& body) {
    natives::frame(env, body);
    return java.take_exception();
  }
  // What was called since the last time.
  void expect_calls(const strings& expected) { EXPECT_EQ(std::exchange(desktop.log, {}), expected); }
};

const strings open_surface{"GetAWT 4", "Lock", "GetDrawingSurface", "ds.Lock", "GetInfo", "XQueryExtension MIT-SHM"};
const strings close_surface{"FreeInfo", "ds.Unlock", "FreeDrawingSurface", "Unlock"};
const strings open_flip{"GetAWT 3", "GetDrawingSurface", "ds.Lock", "GetInfo"};
const strings close_flip{"FreeInfo", "ds.Unlock", "FreeDrawingSurface"};

TEST_F(canvas_test, shared_images_take_turns_and_take_the_targets_along) {
  const strings one{"XShmCreateImage 24,2,30,20", "shmget 2400,1023", "shmat", "XShmAttach"};
  std::unique_ptr<canvas> c = make();
  expect_calls(open_surface + strings{"XShmQueryVersion"} + one + one + strings{"XSync", "remove", "remove"} +
               close_surface);  // removed from the start: a killed process leaves no segment
  unsigned int* const first = c->colourbuffer;
  EXPECT_EQ(static_cast<void*>(first), c->shm[0].shmaddr);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(c->depthbuffer) % 64, 0u);
  c->flip(5, 6, 20, 10);
  expect_calls(open_flip + strings{"XShmPutImage 7,5,6,0,0,20,10,0", "XFlush"} + close_flip);
  EXPECT_EQ(static_cast<void*>(c->colourbuffer), c->shm[1].shmaddr);
  EXPECT_TRUE(kit().colourbuffer == c->colourbuffer && Rasterizer_n::m_pColourBuffer == c->colourbuffer);
  c->flip(0, 0, w, h);
  EXPECT_EQ(c->colourbuffer, first);
  failing({});
  c->flip_dirtyrect(0, 0, w, h, 1, 2);
  expect_calls(open_flip + close_flip);
  EXPECT_EQ(c->colourbuffer, first);
  c.reset();
  const strings gone{"XShmDetach", "destroy image", "shmdt"};
  expect_calls((strings{"GetAWT 4", "Lock"}) + gone + gone + strings{"XFlush", "Unlock"});
  desktop.expect_nothing_held();
}

TEST_F(canvas_test, without_shared_memory_there_is_one_plain_image_whose_pixels_outlive_it) {
  failing({"XQueryExtension0"});
  std::unique_ptr<canvas> c = make();
  expect_calls(open_surface + strings{"XCreateImage 24,2,0,30,20,32,0"} + close_surface);
  unsigned int* const first = c->colourbuffer;
  c->flip(5, 6, 20, 10);
  expect_calls(open_flip + strings{"XPutImage 7,5,6,0,0,20,10", "XFlush"} + close_flip);
  EXPECT_TRUE(c->colourbuffer == first && kit().colourbuffer == nullptr && Rasterizer_n::m_pColourBuffer == nullptr);
  drop(std::move(c));
  expect_calls({"GetAWT 4", "Lock", "XFree", "Unlock"});
}

// Whatever fails in a canvas's life: it is not made, or works with plain images, or shows nothing; nothing is left
// over.
TEST_F(canvas_test, every_failure_half_way_gives_everything_back) {
  const int weak = java.weak_references();
  int refused = 0, plain = 0;
  for (const std::string call :
       {"GetAWT", "GetDrawingSurface", "ds.Lock", "GetInfo", "XCreateImage", "XShmQueryVersion", "XShmCreateImage",
        "shmget", "shmat", "XShmAttach", "memory", "refused"}) {
    for (const char* count : {"0", "1", "2"}) {
      SCOPED_TRACE(call + count);
      failing({call + count, call == "XCreateImage" || call == "memory" ? "XQueryExtension0" : ""});
      if (call == "memory") allocation_failure::fail_memalign(std::atoi(count) + 1, ENOMEM);
      desktop.others_errors = 1;
      desktop.server_refuses_memory = call == "refused";
      std::unique_ptr<canvas> c;
      const std::string failure = failure_of([&] { c = make(); });
      allocation_failure::none();
      if (c == nullptr) {
        const std::string why = call == "memory" ? no_memory : "java.lang.IllegalStateException: component: ";
        EXPECT_EQ(failure.rfind(why, 0), 0u) << failure;
        ++refused;
      } else {
        EXPECT_EQ(desktop.others_errors, desktop.counts["XSync"] == 0 ? 1 : 0) << "someone else's error was swallowed";
        const unsigned int* const first = c->colourbuffer;
        c->flip(0, 0, w, h);
        EXPECT_EQ(c->colourbuffer != first, desktop.counts["XShmPutImage"] == 1);
        plain += c->use_shm ? 0 : 1;
        c->flip_dirtyrect(0, 0, 1, 1, 1, 1);
        drop(std::move(c));
      }
      desktop.expect_nothing_held();
      EXPECT_EQ(java.weak_references(), weak);
    }
  }
  EXPECT_EQ(refused, 7) << "without AWT, a surface and its lock and info, an image, and both buffers";
  EXPECT_EQ(plain, 15);
}

TEST_F(canvas_test, a_component_that_was_collected_shows_nothing) {
  std::unique_ptr<canvas> c = make();
  failing({});
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
  EXPECT_TRUE(desktop.held.count("image") == 2 && java.weak_references() == weak);
  failing({"ds.Lock0"});
  EXPECT_NE(failure_of([&] { c->resized(component, w, h); }), "");
  desktop.expect_nothing_held();
  EXPECT_TRUE(c->width == 0 && c->colourbuffer == nullptr && c->depthbuffer == nullptr);
  kit().set_active_canvas(c.get());
  c->flip(0, 0, 0, 0);
  c->resized(component, w, h);
  EXPECT_TRUE(c->width == w && c->use_shm);
  failing({"XQueryExtension0"});
  c->resized(component, w, h);
  EXPECT_FALSE(c->use_shm);
  drop(std::move(c));
  EXPECT_EQ(java.weak_references(), weak - 1);
}

// --- The natives ---------------------------------------------------------------------------------------------------

TEST_F(canvas_test, natives_check_the_component_and_the_size_and_need_a_display) {
  const auto make_on = [&](jobject on, jint width, jint height) {
    return [=, this] { Java_za_n(env, canvas_peer, 0, on, width, height); };
  };
  expect_raised(null_pointer, {make_on(nullptr, w, h), [&] { Java_za_H(env, canvas_peer, 0, 0, 1, 1); }});
  expect_raised(bad_argument + "width: 0 is less than 1", {make_on(component, 0, h)});
  expect_raised(bad_argument + "height: -1 is less than 1", {make_on(component, w, -1)});
  expect_raised(bad_argument + "width: 65536 is more than 65535", {make_on(component, 65536, 1)});
  expect_raised(bad_argument + "width, height: 30000x30000 needs 3600000000 bytes", {make_on(component, 30000, 30000)});
  expect_raised("java.lang.IllegalStateException: no display: AWT has not loaded libX11.so.6",
                {make_on(component, w, h)});
  EXPECT_EQ(java.nativeid(canvas_peer), 0);
  EXPECT_EQ(dlopen("libX11.so.6", RTLD_LAZY | RTLD_NOLOAD), nullptr) << "X11 was loaded into a headless process";
}

TEST_F(canvas_test, natives_check_the_flipped_rectangle_and_take_back_the_target) {
  objconvert::set_canvas(env, canvas_peer, make().release());
  Java_ja_PA(env, peer, canvas_peer);
  EXPECT_EQ(kit().colourbuffer[w * h - 1], 0u);
  failing({});
  const auto flip = [&](int x, int y, int width, int height) {
    return [=, this] { Java_za_H(env, canvas_peer, x, y, width, height); };
  };
  expect_raised(bad_argument,
                {flip(1, 0, w, h), flip(0, 1, w, h), flip(-1, 0, 1, 1), flip(0, 0, -1, 1), flip(0, 0, 1, 0x7FFFFFFF)});
  expect_calls({});
  flip(0, 0, w, h)();
  EXPECT_EQ(desktop.counts["XShmPutImage"], 1);
  Java_za_ma(env, canvas_peer);
  EXPECT_EQ(java.nativeid(canvas_peer), 0);
  EXPECT_TRUE(kit().colourbuffer == nullptr && kit().depthbuffer == nullptr)
      << "drawing would write to unmapped memory";
  EXPECT_EQ(Rasterizer_n::m_pColourBuffer, nullptr);
  Java_za_ma(env, canvas_peer);
  desktop.expect_nothing_held();
}

// The size of a target outlives its image, and a flip puts the canvas's image in its place.
TEST_F(canvas_test, a_flip_under_the_size_of_a_larger_target_is_refused) {
  objconvert::set_canvas(env, canvas_peer, make().release());
  const jobject sprite = java.new_object("fa"), depths = java.new_object("oa");
  const auto end_sprite = [&] { Java_fa_M(env, sprite, java.nativeid(sprite)); };
  const auto to_sprite = [&](int height) {
    end_sprite();
    Java_fa_UA(env, sprite, 0, w, height);
    Java_ja_d(env, peer, java.nativeid(sprite), 0);
  };
  Java_oa_g(env, depths, w, h + 1);
  const std::function<void()> larger[] = {[&] { Java_ja_d(env, peer, 0, java.nativeid(depths)); },  // depth alone
                                          [&] { to_sprite(h + 1), Java_ja_d(env, peer, 0, 0); },    // then nothing
                                          [&] { to_sprite(h + 1), end_sprite(); }, [&] { to_sprite(h + 1); }};
  for (const auto& set_up : larger) {
    Java_ja_PA(env, peer, canvas_peer);
    set_up();
    const unsigned int* const target = kit().colourbuffer;
    failing({});
    expect_raised("java.lang.IllegalStateException: canvas: 30x20 cannot become the target of 30x21",
                  {[&] { Java_za_H(env, canvas_peer, 0, 0, w, h); }});
    expect_calls({});
    EXPECT_EQ(kit().colourbuffer, target);
    to_sprite(h);
    EXPECT_EQ(raised([&] { Java_za_H(env, canvas_peer, 0, 0, w, h); }), "") << "a target of the canvas's size";
  }
  end_sprite();
  Java_oa_za(env, depths, java.nativeid(depths));
  Java_za_ma(env, canvas_peer);
  desktop.expect_nothing_held();
}

}  // namespace
