import java.awt.Component;
import java.util.LinkedHashSet;
import java.util.List;
import java.util.Objects;
import java.util.Set;
import velmark5.BlendMode;
import velmark5.Canvas;
import velmark5.ClippingMask;
import velmark5.DepthBuffer;
import velmark5.Font;
import velmark5.Glyphs;
import velmark5.Matrix;
import velmark5.MemoryPool;
import velmark5.Mesh;
import velmark5.Model;
import velmark5.ModelSettings;
import velmark5.NativeLibrary;
import velmark5.PalettedFont;
import velmark5.PointLight;
import velmark5.Rect;
import velmark5.Spans;
import velmark5.Sprite;
import velmark5.Sun;
import velmark5.TextureMetrics;
import velmark5.TextureSource;
import velmark5.ThreadResource;
import velmark5.Toolkit;
import velmark5.Water;

/** Toolkit. Knows what it made, and what the library's pointers stand on, so that neither outlives the other. */
final class ja implements Toolkit {
  private static final int CLEAR_COLOUR = 1;
  private static final int CLEAR_DEPTH = 2;

  /** The one that is open, if any. */
  private static ja current;

  long nativeid;

  private final Set<Peer> made = new LinkedHashSet<>();
  private final o images = new o();

  private za canvas;
  private fa sprite;
  private oa depth;
  private int width;
  private int height;

  private TextureSource textures;
  private ba ownPool;
  private Runnable pressureListener;
  private boolean collecting;

  native void q(Object textureSource, int textureCount);

  native void ma();

  native void Y(int time);

  native void da();

  native void n(ba pool);

  native void PA(za canvas);

  native int za();

  native int oa();

  native int j();

  native void N();

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

  native void k();

  native void A(int x, int y, int width, int height);

  native void GA(float near, float far);

  native void xa(int[] out);

  native void d(long sprite, long depth);

  native void V(
      short id,
      short averageHsl,
      int alphaKind,
      byte lightingKind,
      byte attributeA,
      int attributeB,
      boolean attributeC,
      byte greyBlend,
      byte brighten,
      byte scrollU,
      byte scrollV,
      boolean flatColour,
      boolean doNotDraw,
      boolean attributeD,
      boolean wrapU,
      boolean wrapV,
      byte attributeE,
      boolean attributeF,
      boolean attributeG,
      int attributeH);

  native void F(
      short id,
      int[] pixels,
      short averageHsl,
      int alphaKind,
      byte lightingKind,
      byte attributeA,
      int attributeB,
      boolean attributeC,
      byte greyBlend,
      byte brighten,
      byte scrollU,
      byte scrollV,
      boolean flatColour,
      boolean doNotDraw,
      boolean attributeD,
      boolean wrapU,
      boolean wrapV,
      byte attributeE,
      boolean attributeF,
      boolean attributeG,
      int attributeH);

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

  ja(TextureSource textures, int count) {
    synchronized (ja.class) {
      if (current != null) {
        throw new IllegalStateException("A toolkit is open already");
      }
      q(textures, count);
      current = this;
      // The library counts on from one toolkit to the next.
      oa();
    }
    this.textures = textures;
    try {
      for (int id = 0; id < count; id++) {
        upload(id, textures.metrics(id));
      }
    } catch (RuntimeException | Error e) {
      close();
      throw e;
    }
  }

  private void upload(int id, TextureMetrics metrics) {
    V(
        (short) id,
        (short) metrics.averageHsl(),
        metrics.alpha().code(),
        (byte) metrics.lighting(),
        (byte) 0,
        0,
        false,
        (byte) metrics.greyBlend(),
        (byte) metrics.brighten(),
        (byte) metrics.scrollU(),
        (byte) metrics.scrollV(),
        metrics.flatColour(),
        metrics.hidden(),
        false,
        metrics.wrapU(),
        metrics.wrapV(),
        (byte) 0,
        false,
        false,
        0);
  }

  private void upload(int id, int[] pixels, TextureMetrics metrics) {
    F(
        (short) id,
        pixels,
        (short) metrics.averageHsl(),
        metrics.alpha().code(),
        (byte) metrics.lighting(),
        (byte) 0,
        0,
        false,
        (byte) metrics.greyBlend(),
        (byte) metrics.brighten(),
        (byte) metrics.scrollU(),
        (byte) metrics.scrollV(),
        metrics.flatColour(),
        metrics.hidden(),
        false,
        metrics.wrapU(),
        metrics.wrapV(),
        (byte) 0,
        false,
        false,
        0);
  }

  // Called by the library.

  /** A texture is needed, in the middle of drawing: it is uploaded now, or there is none. Nothing may be thrown. */
  boolean SA(short id) {
    int number = Short.toUnsignedInt(id);
    try {
      int[] pixels = textures == null ? null : textures.pixels(number);
      if (pixels != null) {
        upload(number, pixels, textures.metrics(number));
      }
      return pixels != null;
    } catch (Throwable e) {
      report(e);
      return false;
    }
  }

  private static void report(Throwable e) {
    Thread thread = Thread.currentThread();
    thread.getUncaughtExceptionHandler().uncaughtException(thread, e);
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

  // Lifetime.

  private void live() {
    if (nativeid == 0) {
      throw new IllegalStateException("This toolkit is closed");
    }
  }

  private <P extends Peer> P keep(P peer) {
    made.add(peer);
    return peer;
  }

  void forget(Peer peer) {
    made.remove(peer);
  }

  boolean uses(ba pool) {
    return ownPool == pool;
  }

  void requireOutsideCollection(String what) {
    if (collecting) {
      throw new IllegalStateException("While memory is being collected " + what);
    }
  }

  boolean isTarget(za candidate) {
    return canvas == candidate;
  }

  /** Looks away from a target that is about to go. */
  void leaveTarget(Peer going) {
    if (going == canvas || going == sprite || going == depth) {
      drawToNothing();
    }
  }

  private <P extends Peer> P own(P peer) {
    Objects.requireNonNull(peer);
    live();
    peer.handle();
    if (peer.toolkit != this) {
      throw new IllegalStateException("This " + peer.name() + " belongs to another toolkit");
    }
    return peer;
  }

  private static long handleOf(Peer peer) {
    return peer == null ? 0 : peer.handle();
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

  // What it makes.

  @Override
  public MemoryPool createPool(int bytes) {
    live();
    return keep(new ba(this, bytes));
  }

  @Override
  public void setPool(MemoryPool pool) {
    ba peer = own((ba) pool);
    n(peer);
    ownPool = peer;
  }

  @Override
  public void onMemoryPressure(Runnable listener) {
    live();
    pressureListener = listener;
  }

  @Override
  public Canvas createCanvas(Component component, int width, int height) {
    live();
    NativeLibrary.prepareDisplay();
    return keep(new za(this, component, width, height));
  }

  @Override
  public Sprite createSprite(int width, int height) {
    live();
    fa peer = new fa(this);
    peer.UA(0, width, height);
    return keep(peer);
  }

  @Override
  public Sprite createSprite(int[] pixels, int width, int height, int stride, boolean opaque) {
    Objects.requireNonNull(pixels, "pixels");
    live();
    fa peer = new fa(this);
    peer.RA(0, pixels, 0, stride, width, height, opaque);
    return keep(peer);
  }

  @Override
  public Sprite createSprite(int[] palette, byte[] indices, byte[] alpha, int width, int height, int stride) {
    Objects.requireNonNull(palette, "palette");
    Objects.requireNonNull(indices, "indices");
    live();
    fa peer = new fa(this);
    peer.EA(0, palette, indices, alpha, 0, stride, width, height);
    return keep(peer);
  }

  @Override
  public Sprite captureSprite(Rect area, boolean opaque) {
    live();
    fa peer = new fa(this);
    try {
      peer.K(0, area.x(), area.y(), area.width(), area.height(), opaque);
    } catch (Exception e) {
      throw Peer.translated(e);
    }
    return keep(peer);
  }

  @Override
  public DepthBuffer createDepthBuffer(int width, int height) {
    live();
    return keep(new oa(this, width, height));
  }

  @Override
  public ClippingMask createMask(MemoryPool pool, Spans spans) {
    return keep(new wa(this, own((ba) pool), spans));
  }

  @Override
  public Font createMonoFont(MemoryPool pool, Glyphs glyphs) {
    return keep(new m(this, own((ba) pool), glyphs));
  }

  @Override
  public Font createSmoothFont(MemoryPool pool, Glyphs glyphs) {
    return keep(new ea(this, own((ba) pool), glyphs));
  }

  @Override
  public PalettedFont createPalettedFont(MemoryPool pool, Glyphs glyphs, int[] palette) {
    return keep(new ia(this, own((ba) pool), glyphs, palette));
  }

  @Override
  public Model createModel(MemoryPool pool, Mesh mesh, ModelSettings settings) {
    return keep(new h(this, own((ba) pool), mesh, settings));
  }

  @Override
  public ThreadResource createThreadResource() {
    live();
    return keep(new a(this));
  }

  // Targets.

  @Override
  public void drawTo(Canvas target) {
    za peer = own((za) target);
    PA(peer);
    setTarget(peer, null, null, peer.width(), peer.height());
  }

  @Override
  public void drawTo(Sprite colour, DepthBuffer depths) {
    live();
    if (colour == null && depths == null) {
      throw new IllegalArgumentException("sprite, depth: at least one is needed");
    }
    if (colour != null) {
      own((fa) colour);
    }
    if (depths != null) {
      own((oa) depths);
    }
    fa image = (fa) colour;
    oa depthImage = (oa) depths;
    d(handleOf(image), handleOf(depthImage));
    if (image != null) {
      setTarget(null, image, depthImage, image.width(), image.height());
    } else {
      setTarget(null, null, depthImage, depthImage.width(), depthImage.height());
    }
  }

  /** Leaving a canvas alone would leave the primitives drawing to it; no image at all stops them too. */
  @Override
  public void drawToNothing() {
    live();
    PA(null);
    d(0, 0);
    setTarget(null, null, null, 0, 0);
  }

  private void setTarget(za newCanvas, fa newSprite, oa newDepth, int newWidth, int newHeight) {
    canvas = newCanvas;
    sprite = newSprite;
    depth = newDepth;
    width = newWidth;
    height = newHeight;
  }

  @Override
  public int targetWidth() {
    live();
    return width;
  }

  @Override
  public int targetHeight() {
    live();
    return height;
  }

  @Override
  public void copyFromTarget(Sprite colour, DepthBuffer depths, Rect area, int x, int y) {
    live();
    images.AA(
        nativeid,
        handleOf((fa) colour),
        handleOf((oa) depths),
        area.x(),
        area.y(),
        area.width(),
        area.height(),
        x,
        y,
        colour != null,
        depths != null);
  }

  @Override
  public void copyToTarget(Sprite colour, DepthBuffer depths, Rect area, int x, int y) {
    live();
    images.BA(
        nativeid,
        handleOf((fa) colour),
        handleOf((oa) depths),
        area.x(),
        area.y(),
        area.width(),
        area.height(),
        x,
        y,
        colour != null,
        depths != null);
  }

  // Viewport.

  @Override
  public Rect viewport() {
    live();
    int[] out = new int[4];
    xa(out);
    return new Rect(out[0], out[1], out[2], out[3]);
  }

  @Override
  public void setViewport(Rect area) {
    live();
    A(area.x(), area.y(), area.width(), area.height());
  }

  @Override
  public void resetViewport() {
    live();
    k();
  }

  @Override
  public void setDepthRange(float near, float far) {
    live();
    GA(near, far);
  }

  // Scene.

  @Override
  public void setCamera(Matrix camera) {
    live();
    AA(camera.toArray());
  }

  @Override
  public void setProjection(Matrix projection) {
    live();
    wa(projection.toArray());
  }

  @Override
  public void setAmbient(float level) {
    live();
    IA(level);
  }

  @Override
  public void setSun(Sun sun) {
    live();
    m(sun.colour(), sun.front(), sun.back(), sun.x(), sun.y(), sun.z());
  }

  @Override
  public void setFog(int colour, int fogDepth) {
    live();
    c(colour, fogDepth);
  }

  @Override
  public void setPointLights(List<PointLight> lights) {
    live();
    int[] places = new int[5 * lights.size()];
    float[] strengths = new float[lights.size()];
    for (int i = 0; i < strengths.length; i++) {
      PointLight light = lights.get(i);
      places[5 * i] = light.x();
      places[5 * i + 1] = light.y();
      places[5 * i + 2] = light.z();
      places[5 * i + 3] = light.range();
      places[5 * i + 4] = light.colour();
      strengths[i] = light.strength();
    }
    Q(strengths.length, places, strengths);
  }

  @Override
  public void enterWater(Water water) {
    live();
    M(water.height(), water.colour(), water.range(), 0);
  }

  @Override
  public void changeWater(Water water) {
    live();
    JA(water.height(), water.colour(), water.range(), 0);
  }

  @Override
  public void leaveWater() {
    live();
    O();
  }

  @Override
  public void setShadowResolution(int perTile) {
    live();
    J(perTile);
  }

  // Drawing.

  @Override
  public void clear(int colour) {
    live();
    ba(CLEAR_COLOUR, colour);
  }

  @Override
  public void clearDepth() {
    live();
    ba(CLEAR_DEPTH, 0);
  }

  @Override
  public void clearAll(int colour) {
    live();
    ba(CLEAR_COLOUR | CLEAR_DEPTH, colour);
  }

  @Override
  public void fillMask(int colour, ClippingMask mask, int x, int y) {
    DA(colour, own((wa) mask), x, y);
  }

  @Override
  public void fillRect(int x, int y, int w, int h, int colour, BlendMode mode) {
    live();
    B(x, y, w, h, colour, mode.code());
  }

  @Override
  public void horizontalLine(int x, int y, int length, int colour, BlendMode mode) {
    live();
    XA(x, y, length, colour, mode.code());
  }

  @Override
  public void verticalLine(int x, int y, int length, int colour, BlendMode mode) {
    live();
    G(x, y, length, colour, mode.code());
  }

  @Override
  public void line(int x0, int y0, int x1, int y1, int colour, BlendMode mode) {
    live();
    YA(x0, y0, x1, y1, colour, mode.code());
  }

  @Override
  public void line(
      int x0, int y0, int x1, int y1, int colour, BlendMode mode, ClippingMask mask, int maskX, int maskY) {
    R(x0, y0, x1, y1, colour, mode.code(), own((wa) mask), maskX, maskY);
  }

  @Override
  public void fillCircle(int x, int y, int radius, int colour, BlendMode mode) {
    live();
    CA(x, y, radius, colour, mode.code());
  }

  @Override
  public void scroll(int dx, int dy) {
    live();
    VA(dx, dy);
  }

  @Override
  public int[] readArea(Rect area) {
    live();
    try {
      return E(area.x(), area.y(), area.width(), area.height());
    } catch (Exception e) {
      throw Peer.translated(e);
    }
  }

  @Override
  public void writeArea(Rect area, int[] pixels, int offset, int stride) {
    Objects.requireNonNull(pixels, "pixels");
    live();
    BA(area.x(), area.y(), area.width(), area.height(), pixels, offset, stride);
  }

  @Override
  public Rect clip() {
    live();
    int[] out = new int[4];
    qa(out);
    return Rect.between(out[0], out[1], out[2], out[3]);
  }

  @Override
  public void setClip(Rect area) {
    live();
    r(area.x(), area.y(), area.right(), area.bottom());
  }

  @Override
  public void narrowClip(Rect area) {
    live();
    o(area.x(), area.y(), area.right(), area.bottom());
  }

  @Override
  public void resetClip() {
    live();
    L();
  }

  // The rest.

  @Override
  public void advance(int milliseconds) {
    live();
    if (milliseconds < 0) {
      throw new IllegalArgumentException("milliseconds: " + milliseconds + " is negative");
    }
    Y(milliseconds);
  }

  @Override
  public int allocatedBytes() {
    live();
    return za();
  }

  @Override
  public int takeModelCount() {
    live();
    return oa();
  }
}
