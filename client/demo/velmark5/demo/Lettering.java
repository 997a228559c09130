package velmark5.demo;

import velmark5.Colour;
import velmark5.Font;
import velmark5.Glyphs;
import velmark5.MemoryPool;
import velmark5.PalettedFont;
import velmark5.Toolkit;

/** The fonts that a scene writes with, one of each kind, in a size that suits the window. */
final class Lettering implements AutoCloseable {
  private static final int BANDS = 12;

  /** For the name: bands of colour in an outline. */
  final PalettedFont title;

  /** For lines of text, with smooth edges. */
  final Font body;

  /** For labels, hard and narrow. */
  final Font small;

  /** Fonts around a size of the body; the title's colours are its outline, its top and its foot. */
  Lettering(Toolkit toolkit, MemoryPool pool, int size, int style, int outline, int top, int foot) {
    int[] palette = new int[BANDS + 2];
    palette[1] = outline;
    for (int i = 0; i < BANDS; i++) {
      palette[i + 2] = Colour.mix(top, foot, i / (BANDS - 1.0));
    }
    var large = new java.awt.Font(java.awt.Font.SANS_SERIF, java.awt.Font.BOLD, size * 3);
    title = toolkit.createPalettedFont(pool, Glyphs.outlined(large, Glyphs.LATIN, BANDS), palette);
    var plain = new java.awt.Font(java.awt.Font.SANS_SERIF, style, size);
    body = toolkit.createSmoothFont(pool, Glyphs.smooth(plain, Glyphs.LATIN));
    var narrow = new java.awt.Font(java.awt.Font.MONOSPACED, style, Math.max(9, size * 4 / 5));
    small = toolkit.createMonoFont(pool, Glyphs.hard(narrow, Glyphs.LATIN));
  }

  /** A line of the body font over its own dark copy. */
  void shadowed(String text, int x, int y, int colour, int shadow) {
    body.draw(text, x + 1, y + 1, shadow);
    body.draw(text, x, y, colour);
  }

  @Override
  public void close() {
    title.close();
    body.close();
    small.close();
  }
}
