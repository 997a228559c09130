import java.util.Objects;
import velmark5.BlendMode;
import velmark5.Channel;
import velmark5.ClippingMask;
import velmark5.Margins;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.Tint;

/** Sprite. */
final class fa extends Peer implements Sprite {
  long nativeid;

  native void UA(int unused, int w, int h);

  native void K(int unused, int x, int y, int w, int h, boolean opaque) throws Exception;

  native void RA(int unused, int[] pixels, int unusedOffset, int stride, int w, int h, boolean opaque);

  native void EA(
      int unused, int[] palette, byte[] indices, byte[] alpha, int unusedOffset, int stride, int w, int h);

  native void M(long handle);

  native int da(long handle);

  native int GA(long handle);

  native int WA(long handle);

  native int ba(long handle);

  native void U(long handle, int left, int top, int right, int bottom);

  native void F(long handle, int[] result);

  native void na(long handle, int x, int y, int w, int h, int[] pixels, int offset, int stride);

  native void ea(long handle, int x, int y, int w, int h, int fbx, int fby) throws Exception;

  native void j(long handle, int fbx, int fby, int channel) throws Exception;

  native void Y(long handle, int x, int y, int colourOp, int colour, int blend);

  native void ha(long handle, int x, int y, int w, int h, int colourOp, int colour, int blend);

  native void G(long handle, int x, int y, int z, int w, int h, int colourOp, int colour, int blend);

  native void o(long handle, int x, int y, long mask, int maskX, int maskY);

  native void e(
      long handle, float x0, float y0, float x1, float y1, float x2, float y2, int colourOp, int colour, int blend);

  native void FA(
      long handle, float x0, float y0, float x1, float y1, float x2, float y2, int unused, long mask, int maskX,
      int maskY, int blend);

  native void aa(long handle, int x, int y, int w, int h, int colourOp, int colour, int blend);

  /** A peer without a native object. */
  fa(ja toolkit) {
    super(toolkit);
  }

  /** An empty sprite. */
  fa(ja toolkit, int width, int height) {
    this(toolkit);
    UA(0, width, height);
  }

  /** A sprite of colours. */
  fa(ja toolkit, int[] pixels, int width, int height, int stride, boolean opaque) {
    this(toolkit);
    RA(0, pixels, 0, stride, width, height, opaque);
  }

  /** A sprite of numbers in a palette. */
  fa(ja toolkit, int[] palette, byte[] indices, byte[] alpha, int width, int height, int stride) {
    this(toolkit);
    EA(0, palette, indices, alpha, 0, stride, width, height);
  }

  /** A sprite of a part of the frame. */
  fa(ja toolkit, Rect area, boolean opaque) {
    this(toolkit);
    try {
      K(0, area.x(), area.y(), area.width(), area.height(), opaque);
    } catch (Exception e) {
      throw translated(e);
    }
  }

  @Override
  long id() {
    return nativeid;
  }

  @Override
  String name() {
    return "sprite";
  }

  @Override
  void destroy() {
    toolkit.leaveTarget(this);
    M(nativeid);
  }

  @Override
  public int width() {
    return da(handle());
  }

  @Override
  public int height() {
    return GA(handle());
  }

  @Override
  public int fullWidth() {
    return WA(handle());
  }

  @Override
  public int fullHeight() {
    return ba(handle());
  }

  @Override
  public Margins margins() {
    int[] result = new int[4];
    F(handle(), result);
    return new Margins(result[0], result[1], result[2], result[3]);
  }

  @Override
  public void setMargins(Margins margins) {
    U(handle(), margins.left(), margins.top(), margins.right(), margins.bottom());
  }

  @Override
  public void write(Rect area, int[] pixels, int offset, int stride) {
    Objects.requireNonNull(pixels, "pixels");
    na(handle(), area.x(), area.y(), area.width(), area.height(), pixels, offset, stride);
  }

  @Override
  public void capture(Rect area, int frameX, int frameY) {
    try {
      ea(handle(), area.x(), area.y(), area.width(), area.height(), frameX, frameY);
    } catch (Exception e) {
      throw translated(e);
    }
  }

  @Override
  public void captureAlpha(int frameX, int frameY, Channel channel) {
    try {
      j(handle(), frameX, frameY, channel.code());
    } catch (Exception e) {
      throw translated(e);
    }
  }

  @Override
  public void draw(int x, int y, Tint tint, BlendMode mode) {
    Y(handle(), x, y, tint.operation().code(), tint.colour(), mode.code());
  }

  @Override
  public void drawScaled(Rect box, Tint tint, BlendMode mode) {
    ha(
        handle(), box.x(), box.y(), box.width(), box.height(), tint.operation().code(), tint.colour(), mode.code());
  }

  @Override
  public void drawScaled(Rect box, int depth, Tint tint, BlendMode mode) {
    G(
        handle(), box.x(), box.y(), depth, box.width(), box.height(), tint.operation().code(), tint.colour(),
        mode.code());
  }

  @Override
  public void draw(int x, int y, ClippingMask mask, int maskX, int maskY) {
    o(handle(), x, y, ((wa) mask).handle(), maskX, maskY);
  }

  @Override
  public void drawAcross(
      float x0, float y0, float x1, float y1, float x2, float y2, Tint tint, BlendMode mode) {
    e(handle(), x0, y0, x1, y1, x2, y2, tint.operation().code(), tint.colour(), mode.code());
  }

  @Override
  public void drawAcross(
      float x0, float y0, float x1, float y1, float x2, float y2, ClippingMask mask, int maskX, int maskY,
      BlendMode mode) {
    if (mode == BlendMode.ADD) {
      throw new IllegalArgumentException("mode: a masked sprite cannot be added");
    }
    FA(handle(), x0, y0, x1, y1, x2, y2, 0, ((wa) mask).handle(), maskX, maskY, mode.code());
  }

  @Override
  public void drawTiled(Rect area, Tint tint, BlendMode mode) {
    if (fullWidth() <= 0 || fullHeight() <= 0) {
      throw new IllegalArgumentException("sprite: " + fullWidth() + "x" + fullHeight() + " cannot fill an area");
    }
    aa(
        handle(), area.x(), area.y(), area.width(), area.height(), tint.operation().code(), tint.colour(),
        mode.code());
  }
}
