package velmark5.demo;

import velmark5.BlendMode;
import velmark5.ClippingMask;
import velmark5.Colour;
import velmark5.Font;
import velmark5.MemoryPool;
import velmark5.Spans;
import velmark5.Sprite;
import velmark5.ThreadResource;
import velmark5.Toolkit;

/** A round instrument: a beam that sweeps over a disc, cut to the disc's shape by a mask. */
final class Radar implements Scene {
  private static final int GLASS = 0xFF04140F;
  private static final int PHOSPHOR = 0xFF4DFFB0;
  private static final int TAIL = 380;
  private static final double TURNS_PER_SECOND = 0.22;

  private final Toolkit toolkit;
  private final MemoryPool pool;
  private final ThreadResource resource;
  private ClippingMask disc;
  private Sprite knot;
  private int centreX;
  private int centreY;
  private int radius;

  Radar(Toolkit toolkit, MemoryPool pool) {
    this.toolkit = toolkit;
    this.pool = pool;
    resource = toolkit.createThreadResource();
  }

  @Override
  public void resize(int width, int height) {
    radius = Math.max(12, Math.min(width, height) * 15 / 100);
    int margin = Math.max(8, Math.min(width, height) / 24);
    centreX = width - margin - radius;
    centreY = height - margin - radius;
    if (disc != null) {
      disc.close();
    }
    disc = toolkit.createMask(pool, Spans.ellipse(2 * radius + 1, 2 * radius + 1));
    paintKnot();
  }

  @Override
  public void paint(double seconds) {
    double beam = seconds * TURNS_PER_SECOND * 2 * Math.PI;
    paintRim();
    toolkit.fillMask(GLASS, disc, centreX - radius, centreY - radius);
    // The tail from its faint end to the beam, each ray over the one before.
    for (int i = TAIL; i >= 0; i--) {
      double fade = Math.pow(1 - i / (double) (TAIL + 1), 2.2);
      ray(beam - i * 0.0048, Colour.mix(GLASS, 0xFF1FA870, fade * 0.8), BlendMode.REPLACE);
    }
    resource.line(
        centreX,
        centreY,
        centreX + (int) Math.round((radius - 3) * Math.cos(beam)),
        centreY + (int) Math.round((radius - 3) * Math.sin(beam)),
        Colour.withAlpha(PHOSPHOR, 150),
        3,
        BlendMode.ALPHA);
    paintScale();
    knot.draw(
        centreX - knot.width() / 2, centreY - knot.height() / 2, disc, centreX - radius, centreY - radius);
    paintEchoes(beam, seconds);
    paintShine();
  }

  /** The sign of the knot, three rings in a sprite. */
  private void paintKnot() {
    if (knot != null) {
      knot.close();
    }
    int size = Math.max(5, radius / 5);
    knot = toolkit.createSprite(2 * size + 1, 2 * size + 1);
    toolkit.drawTo(knot, null);
    toolkit.clear(Colour.TRANSPARENT);
    for (int i = 0; i < 72; i++) {
      double t = 2 * Math.PI * i / 72;
      double r = size * (0.62 + 0.24 * Math.cos(3 * t));
      int x = size + (int) Math.round(r * Math.cos(2 * t));
      int y = size + (int) Math.round(r * Math.sin(2 * t));
      toolkit.fillRect(x, y, 2, 2, Colour.withAlpha(PHOSPHOR, 150), BlendMode.REPLACE);
    }
  }

  private void paintRim() {
    int[] metal = {0xFF0B1018, 0xFF2C3848, 0xFF5D6E82, 0xFF8496AA, 0xFF3A4656, 0xFF0D131B};
    for (int i = 0; i < metal.length; i++) {
      toolkit.fillCircle(centreX, centreY, radius + metal.length - i + 1, metal[i], BlendMode.REPLACE);
    }
  }

  private void ray(double angle, int colour, BlendMode mode) {
    line(0, angle, 2 * radius, angle, colour, mode);
  }

  /** A line between two points given by distance and angle, inside the glass. */
  private void line(double r0, double angle0, double r1, double angle1, int colour, BlendMode mode) {
    toolkit.line(
        centreX + (int) Math.round(r0 * Math.cos(angle0)),
        centreY + (int) Math.round(r0 * Math.sin(angle0)),
        centreX + (int) Math.round(r1 * Math.cos(angle1)),
        centreY + (int) Math.round(r1 * Math.sin(angle1)),
        colour,
        mode,
        disc,
        centreX - radius,
        centreY - radius);
  }

  private void paintScale() {
    int faint = Colour.scale(PHOSPHOR, 0.20);
    for (int ring = 1; ring <= 3; ring++) {
      double r = radius * ring / 3.0 - (ring == 3 ? 3 : 0);
      int parts = 24 + 24 * ring;
      for (int i = 0; i < parts; i++) {
        line(r, 2 * Math.PI * i / parts, r, 2 * Math.PI * (i + 1) / parts, faint, BlendMode.ADD);
      }
    }
    for (int i = 0; i < 36; i++) {
      double angle = 2 * Math.PI * i / 36;
      line(radius * (i % 3 == 0 ? 0.90 : 0.95), angle, radius - 3, angle, Colour.scale(PHOSPHOR, 0.4), BlendMode.ADD);
    }
    int length = 2 * radius + 1;
    toolkit.line(centreX - radius, centreY, centreX - radius + length, centreY, faint, BlendMode.ADD, disc,
        centreX - radius, centreY - radius);
    toolkit.line(centreX, centreY - radius, centreX, centreY - radius + length, faint, BlendMode.ADD, disc,
        centreX - radius, centreY - radius);
  }

  /** Letters of the four directions, cut to the glass like everything on it. */
  void label(Font font) {
    String letters = "ESWN";
    for (int i = 0; i < 4; i++) {
      String letter = letters.substring(i, i + 1);
      double r = radius * 0.80;
      int x = centreX + (int) Math.round(r * Math.cos(i * Math.PI / 2)) - font.width(letter) / 2;
      int y = centreY + (int) Math.round(r * Math.sin(i * Math.PI / 2)) + font.ascent() / 3;
      font.draw(letter, x + 1, y, Colour.withAlpha(PHOSPHOR, 170), disc, centreX - radius, centreY - radius);
    }
  }

  /** The rocks around the knot from above: they light up as the beam passes and fade until it comes round again. */
  private void paintEchoes(double beam, double seconds) {
    for (int i = 0; i < Stones.COUNT; i++) {
      double[] at = Stones.place(i, seconds);
      double angle = Math.atan2(-at[2], at[0]);
      double r = radius * 0.9 * Math.hypot(at[0], at[2]) / Stones.REACH;
      double since = (beam - angle) / (2 * Math.PI);
      double light = Math.pow(1 - (since - Math.floor(since)), 2.5);
      int x = centreX + (int) (r * Math.cos(angle));
      int y = centreY + (int) (r * Math.sin(angle));
      int size = 2 + i % 3;
      for (int ring = 3; ring > 0; ring--) {
        toolkit.fillCircle(x, y, size * ring / 2, Colour.scale(PHOSPHOR, 0.38 * light), BlendMode.ADD);
      }
    }
  }

  /** A reflection on the upper half of the glass. */
  private void paintShine() {
    for (int i = 0; i < 10; i++) {
      toolkit.fillCircle(
          centreX - radius * 30 / 100,
          centreY - radius * 38 / 100,
          (int) (radius * (0.50 - 0.045 * i)),
          Colour.scale(0xFFBFE8FF, 0.008),
          BlendMode.ADD);
    }
  }
}
