package velmark5.demo;

import velmark5.BlendMode;
import velmark5.Colour;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.Tint;
import velmark5.Toolkit;

/** A translucent panel: a curve over a grid, and below it the curve's past, which scrolls down one row per frame. */
final class Spectrum implements Scene {
  /** Colours of the waterfall from silence to full strength. */
  private static final int[] HEAT = {
    0xFF04060F, 0xFF0D1540, 0xFF252B86, 0xFF5B2E9E, 0xFFA8358F, 0xFFE3506A, 0xFFF98E4A, 0xFFFDCB5C, 0xFFFFF7D0
  };

  private static final int HATCH = 6;

  private final Toolkit toolkit;
  private final Sprite hatch;
  private Sprite waterfall;
  private double[] levels = {};
  private Rect panel = new Rect(0, 0, 0, 0);
  private Rect plot = panel;
  private Rect past = panel;

  /** Rows at the top of the plot that are left to its labels. */
  private int labelled;

  Spectrum(Toolkit toolkit) {
    this.toolkit = toolkit;
    // A fine diagonal pattern that the panel is tiled with.
    int[] pattern = new int[HATCH * HATCH];
    for (int i = 0; i < HATCH; i++) {
      pattern[i * HATCH + HATCH - 1 - i] = 0x14CFE4FF;
    }
    hatch = toolkit.createSprite(pattern, HATCH, HATCH, HATCH, false);
  }

  Rect panel() {
    return panel;
  }

  Rect plot() {
    return plot;
  }

  Rect past() {
    return past;
  }

  @Override
  public void resize(int width, int height) {
    int unit = Math.max(1, Math.min(width, height) / 120);
    int margin = Math.max(8, Math.min(width, height) / 24);
    int wide = Math.max(40, width * 29 / 100);
    int tall = Math.max(40, height * 31 / 100);
    panel = new Rect(margin, height - margin - tall, wide, tall);
    // Room for upright labels at the left.
    int indent = Math.max(9, 2 * unit + height / 64);
    int inner = wide - indent - 2 * unit;
    int plotTall = (tall - 6 * unit) * 55 / 100;
    plot = new Rect(panel.x() + indent, panel.y() + 2 * unit, inner, plotTall);
    past = Rect.between(plot.x(), plot.bottom() + 2 * unit, plot.right(), panel.bottom() - 2 * unit)
        .intersect(new Rect(0, 0, width, height));
    labelled = Math.min(plotTall / 3, Math.max(13, height / 36));
    levels = new double[inner];
    if (waterfall != null) {
      waterfall.close();
    }
    waterfall = toolkit.createSprite(Math.max(1, past.width()), Math.max(1, past.height()));
    toolkit.drawTo(waterfall, null);
    toolkit.clear(HEAT[0]);
    // A past to look at from the first frame on.
    for (int row = past.height(); row > 0; row--) {
      measure(-row / 60.0);
      addRow();
    }
  }

  /** Strengths of 0 to 1 along the band at a moment: a floor of noise, standing tones and a few that wander. */
  private void measure(double seconds) {
    for (int i = 0; i < levels.length; i++) {
      double at = i / (double) levels.length;
      double level = 0.10 + 0.14 * Noise.smooth(5 + (int) (seconds * 20), at * 45) * (1.2 - at);
      level += 0.75 * tone(at, 0.13, 0.012) * (0.65 + 0.35 * Math.sin(seconds * 5.1));
      level += 0.6 * tone(at, 0.30 + 0.05 * Math.sin(seconds * 0.9), 0.010);
      level += 0.85 * tone(at, 0.55 + 0.13 * Math.sin(seconds * 0.53 + 1), 0.016);
      level += 0.45 * tone(at, 0.80 + 0.03 * Math.sin(seconds * 2.6), 0.02) * (Math.sin(seconds * 8) > 0 ? 1 : 0.15);
      level += 0.22 * tone(at, 0.45, 0.2) * Noise.smooth(9, seconds * 0.7);
      levels[i] = Math.min(1, level);
    }
  }

  private static double tone(double at, double centre, double width) {
    double d = (at - centre) / width;
    return Math.exp(-d * d);
  }

  @Override
  public void prepare(double seconds) {
    measure(seconds);
    toolkit.drawTo(waterfall, null);
    addRow();
  }

  private void addRow() {
    toolkit.scroll(0, 1);
    for (int x = 0; x < levels.length; x++) {
      double heat = levels[x] * (HEAT.length - 1);
      int band = Math.min((int) heat, HEAT.length - 2);
      toolkit.fillRect(x, 0, 1, 1, Colour.mix(HEAT[band], HEAT[band + 1], heat - band), BlendMode.REPLACE);
    }
  }

  @Override
  public void paint(double seconds) {
    toolkit.fillRect(panel, 0xA8060C18, BlendMode.ALPHA);
    toolkit.withClip(panel, () -> hatch.drawTiled(panel, Tint.NONE, BlendMode.ALPHA));
    toolkit.drawRect(panel, 0x00283A50, BlendMode.ADD);
    toolkit.withClip(plot, this::paintPlot);
    if (!past.isEmpty()) {
      toolkit.copyToTarget(waterfall, null, new Rect(0, 0, past.width(), past.height()), past.x(), past.y());
      toolkit.drawRect(past, 0x00202C3C, BlendMode.ADD);
    }
  }

  private void paintPlot() {
    for (int i = 0; i <= 12; i++) {
      int x = plot.x() + (plot.width() - 1) * i / 12;
      toolkit.verticalLine(x, plot.y(), plot.height(), i % 3 == 0 ? 0x00203048 : 0x00101A28, BlendMode.ADD);
    }
    for (int i = 0; i <= 5; i++) {
      int y = plot.y() + (plot.height() - 1) * i / 5;
      toolkit.horizontalLine(plot.x(), y, plot.width(), 0x00152133, BlendMode.ADD);
    }
    int before = 0;
    for (int i = 0; i < levels.length; i++) {
      int x = plot.x() + i;
      int y = plot.bottom() - 1 - (int) (levels[i] * (plot.height() - labelled));
      int tint = Colour.mix(0xFF2FA8FF, 0xFFFF6AA0, levels[i] * 1.1);
      toolkit.verticalLine(x, y, plot.bottom() - y, Colour.withAlpha(tint, 70), BlendMode.ALPHA);
      if (i > 0) {
        toolkit.line(x - 1, before, x, y, Colour.mix(tint, Colour.WHITE, 0.35), BlendMode.REPLACE);
      }
      before = y;
    }
  }
}
