import velmark5.ClippingMask;
import velmark5.Glyphs;
import velmark5.Glyphs.Glyph;
import velmark5.PalettedFont;

/** Font of glyphs with a palette. */
final class ia extends FontPeer implements PalettedFont {
  long nativeid;

  native void EA(
      int unused, ba pool, byte[][] glyphs, int[] palette, int[] widths, int[] heights, int[] yOffsets, int[] xOffsets);

  native void UA(char glyph, int x, int y, int colour, boolean solid);

  native void GA(char glyph, int x, int y, int colour, boolean solid, wa mask, int maskX, int maskY);

  native void f(char glyph, int x, int y, int colour, boolean solid);

  native void ma();

  ia(ja toolkit, ba pool, Glyphs glyphs, int[] palette) {
    super(toolkit, pool, glyphs);
    for (Glyph glyph : glyphs.list()) {
      for (byte index : glyph.pixels()) {
        if ((index & 255) >= palette.length && index != 0) {
          throw new IllegalArgumentException(
              "palette: " + palette.length + " colours, '" + glyph.character() + "' uses " + (index & 255));
        }
      }
    }
    EA(
        0,
        pool,
        pixels(glyphs),
        palette,
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
    GA(glyph, x, y, colour, solid, mask, maskX, maskY);
  }

  @Override
  void plotUpwards(char glyph, int x, int y, int colour, boolean solid) {
    f(glyph, x, y, colour, solid);
  }

  @Override
  void unload() {
    ma();
  }

  @Override
  public void draw(CharSequence text, int x, int y) {
    draw(text, x, y, 0, false);
  }

  @Override
  public void draw(CharSequence text, int x, int y, ClippingMask mask, int maskX, int maskY) {
    draw(text, x, y, 0, false, mask, maskX, maskY);
  }

  @Override
  public void drawUpwards(CharSequence text, int x, int y) {
    drawUpwards(text, x, y, 0, false);
  }
}
