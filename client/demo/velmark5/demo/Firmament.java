package velmark5.demo;

import velmark5.BlendMode;
import velmark5.Colour;
import velmark5.Matrix;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.ThreadResource;
import velmark5.Tint;
import velmark5.Toolkit;

/** The sky behind the island: colours from the horizon up, sun, moon, stars and clouds. */
final class Firmament implements Scene {
  private static final int STARS = 420;
  private static final int CLOUDS = 16;
  private static final double FAR = 5000;

  private final Toolkit toolkit;
  private final ThreadResource resource;
  private final Pilot pilot;
  private final Daylight day;
  private final Sprite[] shapes = new Sprite[3];
  private final Sprite halo;
  private int width;
  private int height;
  private double focus;
  private Matrix screen = Matrix.IDENTITY;

  Firmament(Toolkit toolkit, Pilot pilot, Daylight day) {
    this.toolkit = toolkit;
    this.pilot = pilot;
    this.day = day;
    resource = toolkit.createThreadResource();
    for (int i = 0; i < shapes.length; i++) {
      shapes[i] = cloud(i);
    }
    halo = halo();
  }

  /** Light that fades from a middle, for the sun and the moon. */
  private Sprite halo() {
    int side = 256;
    int[] pixels = new int[side * side];
    for (int i = 0; i < pixels.length; i++) {
      double far = Math.hypot(i % side - (side - 1) / 2.0, i / side - (side - 1) / 2.0) / (side / 2.0);
      int v = (int) (255 * Math.pow(Math.max(0, 1 - far), 2.2));
      pixels[i] = Colour.rgb(v, v, v);
    }
    return toolkit.createSprite(pixels, side, side, side, true);
  }

  private Sprite cloud(int seed) {
    int wide = 320;
    int tall = 112;
    int[] pixels = new int[wide * tall];
    for (int y = 0; y < tall; y++) {
      for (int x = 0; x < wide; x++) {
        double puffs = 0;
        for (int i = 0; i < 12; i++) {
          double px = wide * (0.16 + 0.68 * Noise.hash(seed * 100 + i));
          double rise = 1 - Math.abs(px / wide - 0.5) * 2;
          double r = 16 + 26 * rise * (0.5 + 0.5 * Noise.hash(seed * 100 + i + 30));
          double py = tall * 0.74 - r * 0.5 - 14 * rise * Noise.hash(seed * 100 + i + 60);
          puffs += Math.max(0, 1 - Math.hypot(x - px, (y - py) * 1.25) / (r * 1.5));
        }
        double wisps = Noise.creased(seed + 3, x * 0.035, y * 0.06, 4);
        double dense = Math.max(0, Math.min(1, (puffs - 0.25) * 1.3 + (wisps - 0.5) * 0.9));
        dense *= Math.min(1, (tall - y) / 26.0) * Math.min(1, puffs * 3);
        double bright = Math.min(1, 0.80 + 0.24 * (1 - y / (double) tall) + 0.12 * (wisps - 0.5));
        int v = (int) (255 * bright);
        pixels[y * wide + x] = Colour.argb((int) (250 * dense), v, v, v);
      }
    }
    return toolkit.createSprite(pixels, wide, tall, wide, false);
  }

  @Override
  public void resize(int newWidth, int newHeight) {
    width = newWidth;
    height = newHeight;
    focus = height / 2.0 / Math.tan(Village.FIELD_OF_VIEW / 2);
  }

  /** Row at which an elevation appears in the middle of the view. */
  private float row(double elevation) {
    double off = Math.max(-1.35, Math.min(1.35, elevation - pilot.pitch()));
    return (float) (height / 2.0 - focus * Math.tan(off));
  }

  @Override
  public void paint(double seconds) {
    screen = Village.projection(width, height);
    Matrix turned = pilot.camera();
    float[] rows = turned.toArray();
    // The sky has no place: only the camera's directions count.
    rows[12] = 0;
    rows[13] = 0;
    rows[14] = 0;
    screen = Matrix.of(rows).then(screen);
    int horizon = day.horizon();
    int deep = Colour.mix(Colour.scale(0xFF2C6C84, 0.25 + 0.75 * (1 - day.night())), horizon, 0.25);
    band(-1.4, -0.32, deep, deep);
    band(-0.32, -0.075, deep, horizon);
    band(-0.075, 0.015, horizon, horizon);
    band(0.015, 0.26, horizon, day.middle());
    band(0.26, 0.95, day.middle(), day.zenith());
    band(0.95, 2.4, day.zenith(), day.zenith());
    paintStars(seconds);
    paintSun();
    paintMoon();
    paintClouds(seconds);
  }

  private void band(double from, double to, int low, int high) {
    float top = row(to);
    float bottom = row(from);
    if (bottom <= top) {
      return;
    }
    resource.fillTriangle(0, top, high, 0, bottom, low, width, bottom, low);
    resource.fillTriangle(0, top, high, width, bottom, low, width, top, high);
  }

  private Matrix.ScreenPoint place(double x, double up, double z) {
    double length = Math.sqrt(x * x + up * up + z * z) / FAR;
    return screen.project(x / length, -up / length, z / length, new Rect(0, 0, width, height));
  }

  private void paintStars(double seconds) {
    double night = day.night();
    if (night < 0.3) {
      return;
    }
    for (int i = 0; i < STARS; i++) {
      double angle = 2 * Math.PI * Noise.hash(i * 3 + 1);
      double up = 0.06 + 0.9 * Noise.hash(i * 3 + 2);
      double level = Math.sqrt(1 - up * up);
      var point = place(level * Math.cos(angle), up, level * Math.sin(angle));
      if (point.visible() && inside(point, 3)) {
        double light = (night - 0.3) / 0.7 * (0.25 + 0.75 * Math.pow(Noise.hash(i * 3 + 3), 3))
            * (0.8 + 0.2 * Math.sin(seconds * 3 + i));
        int size = Noise.hash(i * 3 + 3) > 0.86 ? 2 : 1;
        toolkit.fillRect((int) point.x(), (int) point.y(), size, size, Colour.scale(0xFFE8F0FF, light), BlendMode.ADD);
      }
    }
  }

  private boolean inside(Matrix.ScreenPoint point, double margin) {
    return point.x() > -margin && point.x() < width + margin && point.y() > -margin && point.y() < height + margin;
  }

  private void paintSun() {
    double[] p = day.sunPlace();
    var point = place(p[0], p[1], p[2]);
    if (!point.visible() || !inside(point, height * 0.5) || p[1] < -0.2) {
      return;
    }
    int radius = height / 26;
    shine(point, 15 * radius, Colour.scale(day.light(), 0.30));
    int disc = Colour.mix(day.light(), Colour.WHITE, 0.5);
    toolkit.fillCircle((int) point.x(), (int) point.y(), radius, disc, BlendMode.REPLACE);
  }

  private void shine(Matrix.ScreenPoint point, int reach, int light) {
    Rect area = new Rect((int) point.x() - reach, (int) point.y() - reach, 2 * reach, 2 * reach);
    halo.drawScaled(area, Tint.multiply(light), BlendMode.ADD);
  }

  private void paintMoon() {
    double[] p = day.moonPlace();
    var point = place(p[0], p[1], p[2]);
    if (day.night() < 0.2 || !point.visible() || !inside(point, height * 0.2)) {
      return;
    }
    int radius = height / 34;
    shine(point, 6 * radius, 0xFF38404C);
    int x = (int) point.x();
    int y = (int) point.y();
    toolkit.fillCircle(x, y, radius, 0xFFE8ECF4, BlendMode.REPLACE);
    toolkit.fillCircle(x - radius / 3, y - radius / 4, radius / 4, 0xFFCDD3E0, BlendMode.REPLACE);
    toolkit.fillCircle(x + radius / 3, y + radius / 3, radius / 3, 0xFFD4DAE6, BlendMode.REPLACE);
  }

  private void paintClouds(double seconds) {
    int lit = Colour.mix(Colour.mix(day.light(), Colour.WHITE, 0.70), day.horizon(), 0.12);
    int tone = Colour.mix(lit, 0xFF1C2440, day.night() * 0.9);
    for (int i = 0; i < CLOUDS; i++) {
      double angle = 2 * Math.PI * (i + 0.6 * Noise.hash(i + 700)) / CLOUDS + seconds * 0.004;
      double up = 0.10 + 0.26 * Noise.hash(i + 720);
      var point = place(Math.cos(angle), up, Math.sin(angle));
      if (!point.visible()) {
        continue;
      }
      int wide = (int) (height * (0.34 + 0.42 * Noise.hash(i + 740)));
      int tall = wide * 112 / 320;
      if (inside(point, wide)) {
        Rect area = new Rect((int) point.x() - wide / 2, (int) point.y() - tall / 2, wide, tall);
        shapes[i % shapes.length].drawScaled(area, Tint.multiply(tone), BlendMode.ALPHA);
      }
    }
  }
}
