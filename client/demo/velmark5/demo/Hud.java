package velmark5.demo;

import java.util.Locale;
import velmark5.BlendMode;
import velmark5.Colour;
import velmark5.Font;
import velmark5.Glyphs;
import velmark5.MemoryPool;
import velmark5.PalettedFont;
import velmark5.Toolkit;

/** What is written over the picture, in all three kinds of font: the name, the frame rate, labels of the instruments. */
final class Hud implements Scene {
  private static final int BANDS = 12;
  private static final int GOLD = 0xFFFFD9A0;
  private static final int ICE = 0xFFCFE4FF;

  private final Toolkit toolkit;
  private final MemoryPool pool;
  private final Spectrum spectrum;
  private final Radar radar;
  private PalettedFont title;
  private Font body;
  private Font small;
  private String rate = "";
  private int width;
  private int height;

  Hud(Toolkit toolkit, MemoryPool pool, Spectrum spectrum, Radar radar) {
    this.toolkit = toolkit;
    this.pool = pool;
    this.spectrum = spectrum;
    this.radar = radar;
  }

  @Override
  public void showRate(double framesPerSecond, double milliseconds) {
    rate = String.format(Locale.ROOT, "%.0f frames/s   %.1f ms", framesPerSecond, milliseconds);
  }

  @Override
  public void resize(int newWidth, int newHeight) {
    width = newWidth;
    height = newHeight;
    if (title != null) {
      title.close();
      body.close();
      small.close();
    }
    int size = Math.max(9, Math.min(width, height) / 48);
    int[] palette = new int[BANDS + 2];
    palette[1] = 0xFF050A18;
    for (int i = 0; i < BANDS; i++) {
      palette[i + 2] = Colour.mix(0xFFF4FBFF, 0xFF5FD8B8, i / (BANDS - 1.0));
    }
    var bold = new java.awt.Font(java.awt.Font.SANS_SERIF, java.awt.Font.BOLD, size * 3);
    title = toolkit.createPalettedFont(pool, Glyphs.outlined(bold, Glyphs.LATIN, BANDS), palette);
    var plain = new java.awt.Font(java.awt.Font.SANS_SERIF, java.awt.Font.PLAIN, size);
    body = toolkit.createSmoothFont(pool, Glyphs.smooth(plain, Glyphs.LATIN));
    var narrow = new java.awt.Font(java.awt.Font.MONOSPACED, java.awt.Font.PLAIN, Math.max(9, size * 3 / 4));
    small = toolkit.createMonoFont(pool, Glyphs.hard(narrow, Glyphs.LATIN));
  }

  @Override
  public void paint(double seconds) {
    int left = spectrum.panel().x();
    int baseline = left + title.ascent();
    title.draw("velmark5", left, baseline);
    int line = baseline + body.lineHeight() + body.lineHeight() / 3;
    shadowed(width + " × " + height + ", drawn by the processor alone", left + 2, line, ICE);
    shadowed(rate, left + 2, line + body.lineHeight(), GOLD);

    var plot = spectrum.plot();
    int label = Colour.withAlpha(ICE, 150);
    small.drawUpwards("SIGNAL", plot.x() - 3, plot.bottom() - 1, label);
    small.drawUpwards("PAST", plot.x() - 3, spectrum.past().bottom() - 1, label);
    for (int i = 1; i < 4; i++) {
      String megahertz = 20 * i + " MHz";
      int x = plot.x() + plot.width() * i / 4 - small.width(megahertz) / 2;
      small.draw(megahertz, x, plot.y() + small.ascent() + 2, label);
    }
    radar.label(small);
    paintStamp(seconds);
  }

  private void shadowed(String text, int x, int y, int colour) {
    body.draw(text, x + 1, y + 1, 0xFF02040A);
    body.draw(text, x, y, colour);
  }

  /** A clock at the upper right, on a plate. */
  private void paintStamp(double seconds) {
    int whole = (int) seconds;
    String text = String.format(Locale.ROOT, "%02d:%02d.%d", whole / 60, whole % 60, (int) (seconds * 10) % 10);
    int margin = spectrum.panel().x();
    int wide = small.width(text) + 12;
    int tall = small.lineHeight() + 6;
    toolkit.fillRect(width - margin - wide, margin, wide, tall, 0x90060C18, BlendMode.ALPHA);
    small.draw(text, width - margin - wide + 6, margin + 3 + small.ascent(), Colour.withAlpha(GOLD, 220));
  }
}
