package velmark5.demo;

import java.util.Locale;
import velmark5.BlendMode;
import velmark5.Colour;
import velmark5.Font;
import velmark5.MemoryPool;
import velmark5.Toolkit;

/**
 * What is written over the picture, in all three kinds of font: the name, the frame rate, labels of the instruments.
 */
final class Hud implements Scene {
  private static final int GOLD = 0xFFFFD9A0;
  private static final int ICE = 0xFFCFE4FF;
  private static final int SHADE = 0xFF02040A;

  private final Toolkit toolkit;
  private final MemoryPool pool;
  private final Spectrum spectrum;
  private final Radar radar;
  private Lettering letters;
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
  public void showRate(String reading) {
    rate = reading;
  }

  @Override
  public void resize(int newWidth, int newHeight) {
    width = newWidth;
    height = newHeight;
    if (letters != null) {
      letters.close();
    }
    int size = Math.max(9, Math.min(width, height) / 48);
    letters = new Lettering(toolkit, pool, size, java.awt.Font.PLAIN, 0xFF050A18, 0xFFF4FBFF, 0xFF5FD8B8);
  }

  @Override
  public void paint(double seconds) {
    int left = spectrum.panel().x();
    int baseline = left + letters.title.ascent();
    letters.title.draw("velmark5", left, baseline);
    int line = baseline + letters.body.lineHeight() * 4 / 3;
    letters.shadowed(width + " × " + height + ", drawn by the processor alone", left + 2, line, ICE, SHADE);
    letters.shadowed(rate, left + 2, line + letters.body.lineHeight(), GOLD, SHADE);

    Font small = letters.small;
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

  /** A clock at the upper right, on a plate. */
  private void paintStamp(double seconds) {
    int whole = (int) seconds;
    String text = String.format(Locale.ROOT, "%02d:%02d.%d", whole / 60, whole % 60, (int) (seconds * 10) % 10);
    Font small = letters.small;
    int margin = spectrum.panel().x();
    int wide = small.width(text) + 12;
    int tall = small.lineHeight() + 6;
    toolkit.fillRect(width - margin - wide, margin, wide, tall, 0x90060C18, BlendMode.ALPHA);
    small.draw(text, width - margin - wide + 6, margin + 3 + small.ascent(), Colour.withAlpha(GOLD, 220));
  }
}
