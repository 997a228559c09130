// The limit of presenting: a bare loop over two shared-memory images in a window of its own, and nothing else in the
// process. Speaks with the driver over its standard streams: a line "FRAMES WAIT" shows that many frames and is
// answered by the nanoseconds until the display has shown the last. Each frame is flushed; WAIT says what else the loop
// does:
//   0  nothing: the display may fall behind
//   1  XSync after each frame
//   2  XGetWindowAttributes before each frame, as AWT does whenever it gives out a drawing surface
//
// Usage: bare WIDTH HEIGHT
#include <X11/Xlib.h>
#include <X11/Xutil.h>

// Xlib before its extension.
#include <X11/extensions/XShm.h>
#include <sys/ipc.h>
#include <sys/shm.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>

int main(int argc, char** argv) {
  if (argc != 3) return 2;
  const int width = std::atoi(argv[1]);
  const int height = std::atoi(argv[2]);
  Display* const display = XOpenDisplay(nullptr);
  if (display == nullptr || !XShmQueryExtension(display)) {
    std::fprintf(stderr, "bare: no display that shares memory\n");
    return 1;
  }
  XSetWindowAttributes attributes{};
  attributes.override_redirect = True;
  const Window window = XCreateWindow(display, DefaultRootWindow(display), 0, 0, static_cast<unsigned>(width),
                                      static_cast<unsigned>(height), 0, 24, InputOutput, DefaultVisual(display, 0),
                                      CWOverrideRedirect, &attributes);
  XShmSegmentInfo segments[2];
  XImage* images[2];
  for (int i = 0; i < 2; ++i) {
    images[i] = XShmCreateImage(display, DefaultVisual(display, 0), 24, ZPixmap, nullptr, &segments[i],
                                static_cast<unsigned>(width), static_cast<unsigned>(height));
    const std::size_t size = static_cast<std::size_t>(images[i]->bytes_per_line) * static_cast<std::size_t>(height);
    segments[i].shmid = shmget(IPC_PRIVATE, size, IPC_CREAT | 0600);
    segments[i].shmaddr = images[i]->data = static_cast<char*>(shmat(segments[i].shmid, nullptr, 0));
    segments[i].readOnly = False;
    std::memset(images[i]->data, i == 0 ? 0x30 : 0x60, size);
    XShmAttach(display, &segments[i]);
    XSync(display, False);
    shmctl(segments[i].shmid, IPC_RMID, nullptr);
  }

  int frames, wait;
  while (std::scanf("%d %d", &frames, &wait) == 2) {
    XMapRaised(display, window);
    XSync(display, False);
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < frames; ++i) {
      XWindowAttributes unused;
      if (wait == 2) XGetWindowAttributes(display, window, &unused);
      XShmPutImage(display, window, DefaultGC(display, 0), images[i & 1], 0, 0, 0, 0, static_cast<unsigned>(width),
                   static_cast<unsigned>(height), False);
      wait == 1 ? XSync(display, False) : XFlush(display);
    }
    XSync(display, False);
    const auto time = std::chrono::steady_clock::now() - start;
    XUnmapWindow(display, window);
    XSync(display, False);
    std::printf("%lld\n", static_cast<long long>(std::chrono::nanoseconds(time).count()));
    std::fflush(stdout);
  }
  return 0;
}
