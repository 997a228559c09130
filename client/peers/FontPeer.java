import java.util.Objects;
import java.util.function.ToIntFunction;
import velmark5.ClippingMask;
import velmark5.Font;
import velmark5.Glyphs;
import velmark5.Glyphs.Glyph;

/** What the three kinds of font share: the arrays they are loaded from, and the layout of text. */
abstract class FontPeer extends Peer implements Font {
  private final ba pool;
  private final Glyphs glyphs;

  FontPeer(ja toolkit, ba pool, Glyphs glyphs) {
    super(toolkit);
    this.pool = pool;
    this.glyphs = glyphs;
  }

  abstract void plot(char glyph, int x, int y, int colour, boolean solid);

  abstract void plot(char glyph, int x, int y, int colour, boolean solid, wa mask, int maskX, int maskY);

  abstract void plotUpwards(char glyph, int x, int y, int colour, boolean solid);

  abstract void unload();

  final void loaded() {
    pool.residents++;
  }

  static byte[][] pixels(Glyphs glyphs) {
    return glyphs.list().stream().map(Glyph::pixels).toArray(byte[][]::new);
  }

  static int[] measures(Glyphs glyphs, ToIntFunction<Glyph> measure) {
    return glyphs.list().stream().mapToInt(measure).toArray();
  }

  @Override
  final void destroy() {
    unload();
    pool.residents--;
  }

  @Override
  public final Glyphs glyphs() {
    return glyphs;
  }

  final void draw(CharSequence text, int x, int y, int colour, boolean solid) {
    handle();
    glyphs.lay(text, (glyph, across, line) -> plot((char) glyph, x + across, y + line, colour, solid));
  }

  final void draw(
      CharSequence text, int x, int y, int colour, boolean solid, ClippingMask mask, int maskX, int maskY) {
    handle();
    wa shape = (wa) Objects.requireNonNull(mask, "mask");
    shape.handle();
    glyphs.lay(
        text,
        (glyph, across, line) ->
            plot((char) glyph, x + across, y + line, colour, solid, shape, maskX, maskY));
  }

  /** The library turns the picture and leaves its offsets out, so they are turned here. */
  final void drawUpwards(CharSequence text, int x, int y, int colour, boolean solid) {
    handle();
    glyphs.lay(
        text,
        (index, across, line) -> {
          Glyph glyph = glyphs.list().get(index);
          int left = x + line + glyph.yOffset();
          int top = y - across - glyph.xOffset() - glyph.width();
          plotUpwards((char) index, left, top, colour, solid);
        });
  }

  @Override
  public final void draw(CharSequence text, int x, int y, int colour) {
    draw(text, x, y, colour, true);
  }

  @Override
  public final void draw(CharSequence text, int x, int y, int colour, ClippingMask mask, int maskX, int maskY) {
    draw(text, x, y, colour, true, mask, maskX, maskY);
  }

  @Override
  public final void drawUpwards(CharSequence text, int x, int y, int colour) {
    drawUpwards(text, x, y, colour, true);
  }
}
