package velmark5.demo;

import velmark5.BlendMode;
import velmark5.ClippingMask;
import velmark5.Colour;
import velmark5.Font;
import velmark5.MemoryPool;
import velmark5.Spans;
import velmark5.Sprite;
import velmark5.Toolkit;

/** What lies over the village: its name, figures, help, and a round map that turns with the camera. */
final class Overlay implements Scene {
  private static final String HELP = "drag: look   W A S D: move   Q E: down, up   Shift: faster   F: fly";
  private static final int PALE = 0xFFFDF6E8;
  private static final int GOLD = 0xFFFFE0A0;
  private static final int SHADE = 0xFF140C08;
  private static final int MAP = 256;
  private static final double MAP_REACH = 3300;

  private final Toolkit toolkit;
  private final MemoryPool pool;
  private final Pilot pilot;
  private final Daylight day;
  private final boolean steered;
  private final Sprite map;
  private Lettering letters;
  private ClippingMask disc;
  private String rate = "";
  private int width;
  private int height;
  private int margin;
  private int radius;

  Overlay(Toolkit toolkit, MemoryPool pool, Pilot pilot, Daylight day, boolean steered) {
    this.toolkit = toolkit;
    this.pool = pool;
    this.pilot = pilot;
    this.day = day;
    this.steered = steered;
    int[] pixels = new int[MAP * MAP];
    for (int i = 0; i < pixels.length; i++) {
      double x = (i % MAP - MAP / 2.0) * 2 * MAP_REACH / MAP;
      double z = (MAP / 2.0 - i / MAP) * 2 * MAP_REACH / MAP;
      pixels[i] = mapColour(x, z);
    }
    map = toolkit.createSprite(pixels, MAP, MAP, MAP, true);
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
      disc.close();
    }
    int least = Math.min(width, height);
    margin = Math.max(8, least / 28);
    radius = Math.max(14, least * 12 / 100);
    disc = toolkit.createMask(pool, Spans.ellipse(2 * radius + 1, 2 * radius + 1));
    int size = Math.max(9, least / 46);
    letters = new Lettering(toolkit, pool, size, java.awt.Font.BOLD, 0xFF2A1A10, 0xFFFFFFF4, 0xFFFFB860);
  }

  @Override
  public void paint(double seconds) {
    int models = toolkit.takeModelCount();
    int x = margin + 2;
    int step = letters.body.lineHeight() * 5 / 4;
    int line = height - margin;
    if (steered && x + letters.body.width(HELP) < width - 2 * (margin + radius)) {
      letters.shadowed(HELP, x, line, PALE, SHADE);
      line -= step;
    }
    letters.shadowed((rate + "   " + models + " models   " + day.clock()).strip(), x, line, GOLD, SHADE);
    line -= step;
    letters.shadowed(width + " × " + height + ", drawn by the processor alone", x, line, PALE, SHADE);
    letters.title.draw("velmark5", margin, line - step - letters.body.lineHeight() / 4);
    paintMap();
  }

  /** The map, turned so that up is where the camera looks, with the camera in its middle. */
  private void paintMap() {
    int centreX = width - margin - radius;
    int centreY = height - margin - radius;
    int[] rim = {0xFF20140C, 0xFF5A4028, 0xFFC89A5C, 0xFFF0D49C, 0xFF8A6438, 0xFF20140C};
    for (int i = 0; i < rim.length; i++) {
      toolkit.fillCircle(centreX, centreY, radius + rim.length - i, rim[i], BlendMode.REPLACE);
    }
    toolkit.fillMask(0xFF123048, disc, centreX - radius, centreY - radius);
    double scale = radius / 2300.0;
    double c = Math.cos(pilot.heading());
    double s = Math.sin(pilot.heading());
    // East and south of the map as they lie on the screen.
    double side = 2 * MAP_REACH * scale;
    double[] east = {c * side, -s * side};
    double[] south = {s * side, c * side};
    double px = (pilot.x() + MAP_REACH) / (2 * MAP_REACH);
    double pz = (MAP_REACH - pilot.z()) / (2 * MAP_REACH);
    double left = centreX - px * east[0] - pz * south[0];
    double top = centreY - px * east[1] - pz * south[1];
    map.drawAcross(
        (float) left, (float) top, (float) (left + east[0]), (float) (top + east[1]), (float) (left + south[0]),
        (float) (top + south[1]), disc, centreX - radius, centreY - radius, BlendMode.REPLACE);
    mark(centreX, centreY, Island.VILLAGE_X, Island.VILLAGE_Z, scale, 0xFFFF6A3C);
    mark(centreX, centreY, Island.MOUND_X, Island.MOUND_Z, scale, 0xFF60D8FF);
    mark(centreX, centreY, Island.MILL_X, Island.MILL_Z, scale, 0xFFF8F0E0);
    // What the camera sees, and north.
    for (int ray = -1; ray <= 1; ray += 2) {
      int rayX = centreX + (int) (ray * radius * 0.62);
      toolkit.line(centreX, centreY, rayX, centreY - (int) (radius * 0.9), 0x90FFFFFF, BlendMode.ALPHA, disc,
          centreX - radius, centreY - radius);
    }
    toolkit.fillCircle(centreX, centreY, Math.max(2, radius / 22), 0xFFFFFFFF, BlendMode.REPLACE);
    Font small = letters.small;
    String[] names = {"N", "E", "S", "W"};
    for (int i = 0; i < 4; i++) {
      double angle = i * Math.PI / 2 - pilot.heading();
      int x = centreX + (int) Math.round(0.84 * radius * Math.sin(angle)) - small.width(names[i]) / 2;
      int y = centreY - (int) Math.round(0.84 * radius * Math.cos(angle)) + small.ascent() / 3;
      small.draw(names[i], x + 1, y + 1, 0xFF101418);
      small.draw(names[i], x, y, i == 0 ? 0xFFFFC060 : 0xFFF4F4F4);
    }
  }

  private void mark(int centreX, int centreY, double x, double z, double scale, int colour) {
    double dx = (x - pilot.x()) * scale;
    double dz = (z - pilot.z()) * scale;
    double c = Math.cos(pilot.heading());
    double s = Math.sin(pilot.heading());
    double right = dx * c - dz * s;
    double ahead = dx * s + dz * c;
    if (Math.hypot(right, ahead) < radius * 0.95) {
      int size = Math.max(2, radius / 20);
      toolkit.fillCircle(centreX + (int) right, centreY - (int) ahead, size + 1, 0xFF101418, BlendMode.REPLACE);
      toolkit.fillCircle(centreX + (int) right, centreY - (int) ahead, size, colour, BlendMode.REPLACE);
    }
  }

  /** The map's colour for a place. */
  private static int mapColour(double x, double z) {
    double h = Island.height(x, z);
    if (h < 0) {
      return Colour.mix(0xFF2F7088, 0xFF123048, Math.min(1, -h / 120));
    }
    if (Island.riverDistance(x, z) < 75 && h < 100) {
      return 0xFF58B0C8;
    }
    if (Island.pathDistance(x, z) < 45) {
      return 0xFFD8BC88;
    }
    int ground = h < 28 ? 0xFFE0CE98 : h > 330 ? Colour.mix(0xFF76885C, 0xFFE8E6E0, (h - 330) / 900) : 0xFF6E9644;
    return Colour.scale(ground, 1 - 0.35 * Math.min(1, Island.slope(x, z)));
  }
}
