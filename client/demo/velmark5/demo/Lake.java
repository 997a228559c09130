package velmark5.demo;

import velmark5.BlendMode;
import velmark5.Colour;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.Toolkit;

/** The water: everything above the horizon once more, row by row upside down, darker and disturbed by waves. */
final class Lake implements Scene {
  private final Toolkit toolkit;
  private Sprite above;
  private int width;
  private int height;
  private int horizon;

  Lake(Toolkit toolkit) {
    this.toolkit = toolkit;
  }

  @Override
  public void resize(int newWidth, int newHeight) {
    width = newWidth;
    height = newHeight;
    horizon = Sky.horizon(height);
    if (above != null) {
      above.close();
    }
    above = toolkit.createSprite(width, Math.max(1, horizon));
  }

  @Override
  public void paint(double seconds) {
    int rows = height - horizon;
    toolkit.copyFromTarget(above, null, new Rect(0, 0, width, horizon), 0, 0);
    for (int row = 0; row < rows; row++) {
      double near = row / (double) rows;
      // Waves grow towards the viewer, and the picture of the sky is stretched.
      double phase = 90 / (near * 4 + 0.25);
      double wave = Math.sin(phase + seconds * 1.7) + 0.6 * Math.sin(phase * 2.3 - seconds * 2.3);
      int source = horizon - 2 - (int) (row * 1.45 + wave * (0.6 + 7 * near));
      source = Math.max(0, Math.min(horizon - 1, source));
      int shift = (int) (wave * 4.5 * near);
      copyRow(source, horizon + row, shift);
      int veil = Colour.withAlpha(Colour.mix(0xFF0C1B30, 0xFF02060E, near), (int) (70 + 120 * near));
      toolkit.horizontalLine(0, horizon + row, width, veil, BlendMode.ALPHA);
    }
    paintGlitter(seconds, rows);
    paintHaze();
  }

  /** A row of the mirror, moved sideways; the edge it leaves open keeps the row's own end. */
  private void copyRow(int source, int row, int shift) {
    int moved = Math.min(Math.abs(shift), width - 1);
    toolkit.copyToTarget(above, null, new Rect(0, source, width, 1), 0, row);
    if (shift != 0) {
      Rect part = new Rect(shift > 0 ? 0 : moved, source, width - moved, 1);
      toolkit.copyToTarget(above, null, part, shift > 0 ? moved : 0, row);
    }
  }

  /** A thin veil of mist where land and water meet. */
  private void paintHaze() {
    int deep = height / 36;
    for (int i = -deep; i <= deep; i++) {
      double thick = 1 - Math.abs(i) / (double) (deep + 1);
      toolkit.horizontalLine(
          0, horizon + i, width, Colour.withAlpha(0xFF7F93B0, (int) (58 * thick * thick)), BlendMode.ALPHA);
    }
  }

  /** The moon's path: short strokes of light that come and go. */
  private void paintGlitter(double seconds, int rows) {
    int centre = Sky.moonX(width);
    for (int i = 0; i < 240; i++) {
      double near = Math.pow(Noise.hash(i + 600), 1.4);
      double beat = Math.sin(seconds * (1.2 + 2 * Noise.hash(i + 601)) + i * 2.4);
      if (beat < 0.1) {
        continue;
      }
      double spread = height * (0.03 + 0.075 * near);
      double side = Noise.hash(i + 602) + Noise.hash(i + 603) - 1;
      int length = 2 + (int) (beat * (3 + 20 * near));
      int x = centre + (int) (side * spread) - length / 2;
      int y = horizon + 2 + (int) (near * (rows - 4));
      toolkit.horizontalLine(x, y, length, Colour.scale(0xFFBFD4F5, 0.34 * beat * (1 - Math.abs(side))), BlendMode.ADD);
    }
  }
}
