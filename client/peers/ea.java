import velmark5.Glyphs;
import velmark5.Glyphs.Glyph;

/** Font of glyphs with coverage. */
final class ea extends FontPeer {
  long nativeid;

  native void n(
      int unused, ba pool, byte[][] glyphs, int[] widths, int[] heights, int[] yOffsets, int[] xOffsets);

  native void UA(char glyph, int x, int y, int colour, boolean solid);

  native void P(char glyph, int x, int y, int colour, boolean solid, wa mask, int maskX, int maskY);

  native void f(char glyph, int x, int y, int colour, boolean solid);

  native void ma();

  ea(ja toolkit, ba pool, Glyphs glyphs) {
    super(toolkit, pool, glyphs);
    n(
        0,
        pool,
        pixels(glyphs),
        measures(glyphs, Glyph::width),
        measures(glyphs, Glyph::height),
        measures(glyphs, Glyph::yOffset),
        measures(glyphs, Glyph::xOffset));
    loaded();
  }

  @Override
  long id() {
    return nativeid;
  }

  @Override
  String name() {
    return "font";
  }

  @Override
  void plot(char glyph, int x, int y, int colour, boolean solid) {
    UA(glyph, x, y, colour, solid);
  }

  @Override
  void plot(char glyph, int x, int y, int colour, boolean solid, wa mask, int maskX, int maskY) {
    P(glyph, x, y, colour, solid, mask, maskX, maskY);
  }

  @Override
  void plotUpwards(char glyph, int x, int y, int colour, boolean solid) {
    f(glyph, x, y, colour, solid);
  }

  @Override
  void unload() {
    ma();
  }
}
