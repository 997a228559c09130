package velmark5.demo;

import velmark5.BlendMode;
import velmark5.Colour;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.Toolkit;

/** The sky: what stands still is drawn once into a sprite; stars twinkle, a curtain of light moves in front of them. */
final class Sky implements Scene {
  /** Colours from the zenith to the horizon, at even steps. */
  private static final int[] GRADIENT = {
    0xFF03050F, 0xFF060B1E, 0xFF0A1733, 0xFF12294C, 0xFF234465, 0xFF48607B, 0xFF8C7A83, 0xFFD89A78
  };

  private static final int CURTAIN_LOW = 0xFF35E08A;
  private static final int CURTAIN_HIGH = 0xFF6A3CD8;
  private static final int STEPS = 18;
  private static final int FOOT_STEPS = 5;
  private static final int TWINKLING = 170;

  private final Toolkit toolkit;
  private final int[] curtain = new int[STEPS];
  private Sprite backdrop;
  private int width;
  private int height;
  private int horizon;

  Sky(Toolkit toolkit) {
    this.toolkit = toolkit;
    for (int i = 0; i < STEPS; i++) {
      double up = i / (double) (STEPS - 1);
      curtain[i] = Colour.scale(Colour.mix(CURTAIN_LOW, CURTAIN_HIGH, up * 1.15), 0.62 * Math.pow(1 - up, 1.7));
    }
  }

  /** The row where sky and water meet. */
  static int horizon(int height) {
    return height * 62 / 100;
  }

  static int moonX(int width) {
    return width * 73 / 100;
  }

  private static int moonY(int height) {
    return height * 19 / 100;
  }

  private static int moonRadius(int height) {
    return Math.max(4, height / 19);
  }

  @Override
  public void resize(int newWidth, int newHeight) {
    width = newWidth;
    height = newHeight;
    horizon = horizon(height);
    if (backdrop != null) {
      backdrop.close();
    }
    backdrop = toolkit.createSprite(width, Math.max(1, horizon));
    toolkit.drawTo(backdrop, null);
    for (int y = 0; y < horizon; y++) {
      double along = (GRADIENT.length - 1) * (y + 0.5) / horizon;
      int band = (int) along;
      int colour = Colour.mix(GRADIENT[band], GRADIENT[Math.min(band + 1, GRADIENT.length - 1)], along - band);
      toolkit.horizontalLine(0, y, width, colour, BlendMode.REPLACE);
    }
    paintFaintStars();
    paintMoon();
  }

  private void paintFaintStars() {
    for (int i = 0; i < width * horizon / 500; i++) {
      int x = (int) (Noise.hash(i * 2 + 1) * width);
      int y = (int) (Noise.hash(i * 2 + 2) * horizon);
      double dimming = Math.max(0, 1 - 1.25 * y / horizon);
      double light = Math.pow(Noise.hash(i + 90_001), 6) * 0.8 + 0.08;
      toolkit.fillRect(x, y, 1, 1, Colour.scale(0xFFD8E4FF, light * dimming), BlendMode.ADD);
    }
  }

  private void paintMoon() {
    int x = moonX(width);
    int y = moonY(height);
    int radius = moonRadius(height);
    // Many faint rings, so that no single edge shows.
    for (int i = 80; i > 0; i--) {
      double far = i / 80.0;
      int ring = i % 3 == 0 ? 0xFF010102 : i % 3 == 1 ? 0xFF000101 : 0xFF010101;
      toolkit.fillCircle(x, y, (int) (radius * (1 + 5 * far * far)), ring, BlendMode.ADD);
    }
    for (int i = 24; i > 0; i--) {
      toolkit.fillCircle(x, y, (int) (radius * (1 + 0.5 * i * i / 576.0)), 0xFF020304, BlendMode.ADD);
    }
    toolkit.fillCircle(x, y, radius, 0xFFE9EEF8, BlendMode.REPLACE);
    // Softer light towards one side, then the seas.
    for (int i = 1; i < 8; i++) {
      toolkit.fillCircle(x - radius * i / 60, y - radius * i / 60, radius - radius * i / 40, 0x0CFFFFFF, BlendMode.ALPHA);
    }
    double[][] seas = {{-0.35, -0.25, 0.32}, {0.2, -0.4, 0.2}, {0.3, 0.1, 0.28}, {-0.15, 0.4, 0.22}, {-0.55, 0.25, 0.14}};
    for (double[] sea : seas) {
      for (int i = 0; i < 3; i++) {
        toolkit.fillCircle(
            x + (int) (radius * sea[0]),
            y + (int) (radius * sea[1]),
            (int) (radius * sea[2] * (1 - i * 0.18)),
            0x1E5A6C96,
            BlendMode.ALPHA);
      }
    }
  }

  @Override
  public void paint(double seconds) {
    toolkit.copyToTarget(backdrop, null, new Rect(0, 0, width, horizon), 0, 0);
    paintTwinkling(seconds);
    paintCurtain(seconds * 0.8 + 50, 29, 0.27, 0.30, 0.6);
    paintCurtain(seconds, 11, 0.40, 0.38, 1.0);
    paintMeteor(seconds);
  }

  private void paintTwinkling(double seconds) {
    for (int i = 0; i < TWINKLING; i++) {
      int x = (int) (Noise.hash(i * 5 + 7) * width);
      int y = (int) (Noise.hash(i * 5 + 8) * horizon * 0.72);
      if (Math.hypot(x - moonX(width), y - moonY(height)) < 1.3 * moonRadius(height)) {
        continue;
      }
      double size = Math.pow(Noise.hash(i * 5 + 9), 3);
      double beat = 0.62 + 0.38 * Math.sin(seconds * (1 + 3 * Noise.hash(i)) + i);
      double light = (0.25 + 0.75 * size) * beat * (1 - 0.9 * y / horizon);
      int tint = Colour.mix(0xFFFFE3C4, 0xFFC4D6FF, Noise.hash(i * 5 + 10));
      toolkit.fillRect(x, y, 1, 1, Colour.scale(tint, light), BlendMode.ADD);
      if (size > 0.3) {
        int arm = size > 0.75 ? 3 : 1;
        int glow = Colour.scale(tint, light * 0.35);
        toolkit.horizontalLine(x - arm, y, 2 * arm + 1, glow, BlendMode.ADD);
        toolkit.verticalLine(x, y - arm, 2 * arm + 1, glow, BlendMode.ADD);
      }
    }
  }

  /** A curtain of light: columns of short bars that fade upwards, over a slowly waving foot. */
  private void paintCurtain(double seconds, int seed, double foot, double reach, double strength) {
    int columns = 2;
    for (int x = 0; x < width; x += columns) {
      double u = x / (double) height;
      double wave = 0.6 * Math.sin(u * 2.6 + seconds * 0.21 + seed)
          + 0.35 * Math.sin(u * 6.1 - seconds * 0.17 + seed * 2)
          + 0.5 * (Noise.smooth(seed, u * 2.3 + seconds * 0.06) - 0.5);
      double broad = Noise.smooth(seed + 1, u * 1.5 - seconds * 0.05);
      double fine = Noise.smooth(seed + 2, u * 15 + wave * 5 + seconds * 0.35);
      double finest = Noise.smooth(seed + 3, u * 50 + wave * 9 - seconds * 0.6);
      double light = strength * Math.min(1, Math.max(0, broad * 1.9 - 0.45)) * (0.4 + 0.4 * fine + 0.2 * finest);
      if (light < 0.03) {
        continue;
      }
      double bottom = height * (foot + 0.085 * wave) + (fine - finest) * height * 0.008;
      double tall = height * reach * (0.35 + 0.4 * fine + 0.25 * finest) * (0.6 + 0.4 * broad);
      double step = tall / STEPS;
      // The foot is soft too: thin bars below the brightest one.
      double thin = 0.011 * height / FOOT_STEPS;
      for (int i = 0; i < FOOT_STEPS; i++) {
        bar(x, columns, bottom + i * thin, thin, curtain[0], light * (1 - (i + 1.0) / (FOOT_STEPS + 1)));
      }
      for (int i = 0; i < STEPS; i++) {
        bar(x, columns, bottom - (i + 1) * step, step, curtain[i], light);
      }
    }
  }

  private void bar(int x, int columns, double top, double tall, int colour, double light) {
    int from = (int) Math.round(top);
    int to = (int) Math.round(top + tall);
    toolkit.fillRect(x, from, columns, to - from, Colour.scale(colour, light), BlendMode.ADD);
  }

  /** Every seven seconds something burns up. */
  private void paintMeteor(double seconds) {
    int number = (int) (seconds / 7);
    double age = seconds - number * 7 - 1.2;
    if (age < 0 || age > 0.9) {
      return;
    }
    double x = width * (0.12 + 0.5 * Noise.hash(number + 400)) + age * width * 0.22;
    double y = height * (0.06 + 0.1 * Noise.hash(number + 500)) + age * height * 0.13;
    double light = Math.sin(Math.PI * age / 0.9);
    // It lights up the whole sky for a moment.
    toolkit.fillRect(0, 0, width, horizon, Colour.scale(0xFF6F90C0, 0.16 * light * light), BlendMode.ADD);
    for (int i = 0; i < 16; i++) {
      double a = i * width * 0.005;
      double b = (i + 1) * width * 0.005;
      toolkit.line(
          (int) (x - a),
          (int) (y - a * 0.33),
          (int) (x - b),
          (int) (y - b * 0.33),
          Colour.scale(0xFFDDEBFF, light * (1 - i / 16.0)),
          BlendMode.ADD);
    }
    toolkit.fillCircle((int) x, (int) y, 1, Colour.scale(0xFFFFFFFF, light * 0.6), BlendMode.ADD);
  }
}
