import java.util.LinkedHashSet;
import java.util.Objects;
import java.util.Set;
import velmark5.MemoryPool;
import velmark5.TextureSource;

/**
 * Toolkit: its natives, its life, and what the library calls back. Knows what it made, and what the library's pointers
 * stand on, so that neither outlives the other. What a client calls is in the parts, by theme.
 */
final class ja implements ToolkitMaker, ToolkitTargets, ToolkitScene, ToolkitPainter {
  /** The one that is open, if any. */
  private static ja current;

  long nativeid;

  /** For copies between the target and images. */
  final o copies = new o();

  /** What is drawn to. */
  Target target = Target.NOTHING;

  private final Set<Peer> made = new LinkedHashSet<>();
  private final TextureFeed textures;
  private ba ownPool;
  private Runnable pressureListener;
  private boolean collecting;

  // Life, time, counters. da notes that the client is about to quit; j and N do nothing in this library.

  native void q(Object textureSource, int textureCount);

  native void ma();

  native void da();

  native void n(ba pool);

  native void Y(int time);

  native int za();

  native int oa();

  native int j();

  native void N();

  // Textures: what is known of one, and its pixels.

  native void V(
      short id, short averageHsl, int alphaKind, byte lightingKind, byte attributeA, int attributeB, boolean attributeC,
      byte greyBlend, byte brighten, byte scrollU, byte scrollV, boolean flatColour, boolean doNotDraw,
      boolean attributeD, boolean wrapU, boolean wrapV, byte attributeE, boolean attributeF, boolean attributeG,
      int attributeH);

  native void F(
      short id, int[] pixels, short averageHsl, int alphaKind, byte lightingKind, byte attributeA, int attributeB,
      boolean attributeC, byte greyBlend, byte brighten, byte scrollU, byte scrollV, boolean flatColour,
      boolean doNotDraw, boolean attributeD, boolean wrapU, boolean wrapV, byte attributeE, boolean attributeF,
      boolean attributeG, int attributeH);

  // Target and viewport.

  native void PA(za canvas);

  native void d(long sprite, long depth);

  native void A(int x, int y, int width, int height);

  native void k();

  native void xa(int[] out);

  native void GA(float near, float far);

  // Camera, lights, fog, water.

  native void AA(float[] matrix);

  native void wa(float[] matrix);

  native void IA(float ambient);

  native void m(int colour, float front, float back, float x, float y, float z);

  native void c(int colour, int start);

  native void Q(int count, int[] lights, float[] strengths);

  native void M(int height, int colour, int range, int unused);

  native void JA(int height, int colour, int range, int unused);

  native void O();

  native void J(int resolution);

  // Two dimensions: fills, lines, circles, copies, clip. RA turns the writing of depth off and on.

  native void ba(int flags, int colour);

  native void DA(int colour, wa mask, int x, int y);

  native void B(int x, int y, int w, int h, int colour, int mode);

  native void XA(int x, int y, int length, int colour, int mode);

  native void G(int x, int y, int length, int colour, int mode);

  native void YA(int x0, int y0, int x1, int y1, int colour, int mode);

  native void R(int x0, int y0, int x1, int y1, int colour, int mode, wa mask, int maskX, int maskY);

  native void CA(int x, int y, int radius, int colour, int mode);

  native void b(int x, int y, int radius, int colour, int mode);

  native int[] E(int x, int y, int w, int h) throws Exception;

  native void BA(int x, int y, int w, int h, int[] pixels, int offset, int stride);

  native void VA(int dx, int dy);

  native void L();

  native void r(int x0, int y0, int x1, int y1);

  native void o(int x0, int y0, int x1, int y1);

  native void qa(int[] out);

  native void RA(boolean enable);

  // What the library calls.

  /** A texture is needed, in the middle of drawing: it is uploaded now, or there is none. Nothing may be thrown. */
  boolean SA(short id) {
    try {
      return textures.deliver(Short.toUnsignedInt(id));
    } catch (Throwable e) {
      report(e);
      return false;
    }
  }

  /** A pool has no room left. Nothing may be thrown into the allocation that waits. */
  @SuppressWarnings("unused")
  private void h() {
    if (pressureListener == null || collecting) {
      return;
    }
    collecting = true;
    try {
      pressureListener.run();
    } catch (Throwable e) {
      report(e);
    } finally {
      collecting = false;
    }
  }

  /** A shadow is made. Nothing that the library draws yet casts one. */
  @SuppressWarnings("unused")
  private Object WA() {
    return null;
  }

  private static void report(Throwable e) {
    Thread thread = Thread.currentThread();
    thread.getUncaughtExceptionHandler().uncaughtException(thread, e);
  }

  // Life.

  ja(TextureSource source, int count) {
    textures = new TextureFeed(this, source);
    synchronized (ja.class) {
      if (current != null) {
        throw new IllegalStateException("A toolkit is open already");
      }
      q(source, count);
      current = this;
      // The library counts on from one toolkit to the next.
      oa();
    }
    try {
      textures.announce(count);
    } catch (RuntimeException | Error e) {
      close();
      throw e;
    }
  }

  @Override
  public ja live() {
    if (nativeid == 0) {
      throw new IllegalStateException("This toolkit is closed");
    }
    return this;
  }

  @Override
  public void close() {
    if (nativeid == 0) {
      return;
    }
    requireOutsideCollection("the toolkit cannot be closed");
    drawToNothing();
    ownPool = null;
    // What came last goes first, so pools go after the objects that live in them.
    Peer[] rest = made.toArray(new Peer[0]);
    for (int i = rest.length - 1; i >= 0; i--) {
      rest[i].close();
    }
    synchronized (ja.class) {
      ma();
      current = null;
    }
  }

  @Override
  public String toString() {
    return nativeid == 0 ? "toolkit (closed)" : "toolkit";
  }

  // What it made.

  <P extends Peer> P keep(P peer) {
    made.add(peer);
    return peer;
  }

  void forget(Peer peer) {
    made.remove(peer);
  }

  /** The argument, which is open and of this toolkit. */
  <P extends Peer> P own(P peer) {
    Objects.requireNonNull(peer);
    live();
    peer.handle();
    if (peer.toolkit != this) {
      throw new IllegalStateException("This " + peer.name() + " belongs to another toolkit");
    }
    return peer;
  }

  static long handleOf(Peer peer) {
    return peer == null ? 0 : peer.handle();
  }

  boolean isTarget(za canvas) {
    return target.canvas() == canvas;
  }

  /** Looks away from a target that is about to go. */
  void leaveTarget(Peer going) {
    if (target.has(going)) {
      drawToNothing();
    }
  }

  // Memory, time, counters.

  @Override
  public void setPool(MemoryPool pool) {
    ba peer = own((ba) pool);
    n(peer);
    ownPool = peer;
  }

  boolean uses(ba pool) {
    return ownPool == pool;
  }

  @Override
  public void onMemoryPressure(Runnable listener) {
    live();
    pressureListener = listener;
  }

  void requireOutsideCollection(String what) {
    if (collecting) {
      throw new IllegalStateException("While memory is being collected " + what);
    }
  }

  @Override
  public int allocatedBytes() {
    return live().za();
  }

  @Override
  public int takeModelCount() {
    return live().oa();
  }

  @Override
  public void advance(int milliseconds) {
    live();
    if (milliseconds < 0) {
      throw new IllegalArgumentException("milliseconds: " + milliseconds + " is negative");
    }
    Y(milliseconds);
  }
}
