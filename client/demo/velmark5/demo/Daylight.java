package velmark5.demo;

import velmark5.Colour;
import velmark5.Sun;

/** The time of day: where the sun stands, and which colours it makes. A day takes a few minutes. */
final class Daylight {
  private static final double DAY_SECONDS = 240;

  /** The show starts in the afternoon. */
  private static final double START = 0.660;

  // Times of the day as parts of it, and the colours at them: zenith, middle of the sky, horizon, sun.
  private static final double[] TIMES = {0, 0.22, 0.27, 0.34, 0.50, 0.62, 0.70, 0.755, 0.80, 0.86, 1};
  private static final int[] ZENITH = {
    0xFF050B1E, 0xFF0C1838, 0xFF2C4A80, 0xFF3A78C4, 0xFF2F74CC, 0xFF3672C0, 0xFF3A68B4, 0xFF2E3A6C, 0xFF141C40,
    0xFF070D24, 0xFF050B1E
  };
  private static final int[] MIDDLE = {
    0xFF0B1530, 0xFF253258, 0xFF8C86A0, 0xFF86B6E4, 0xFF78B2EC, 0xFF86B4DC, 0xFFA4BCDC, 0xFF9A7490, 0xFF33345C,
    0xFF101B3A, 0xFF0B1530
  };
  private static final int[] HORIZON = {
    0xFF16233F, 0xFF5A4A60, 0xFFF0B088, 0xFFD8E4EC, 0xFFCFE2F0, 0xFFE8E4DA, 0xFFF8DCB4, 0xFFE8865C, 0xFF6A4A60,
    0xFF1E2B4A, 0xFF16233F
  };
  private static final int[] LIGHT = {
    0xFF8FA8E0, 0xFF9098C0, 0xFFF0B090, 0xFFFFF0D8, 0xFFFFFCF0, 0xFFFFF0D0, 0xFFFFDCA4, 0xFFF0A078, 0xFF9A88B0,
    0xFF8FA8E0, 0xFF8FA8E0
  };
  private static final double[] AMBIENT = {0.36, 0.38, 0.48, 0.66, 0.76, 0.74, 0.68, 0.52, 0.42, 0.36, 0.36};
  private static final double[] FRONT = {0.34, 0.26, 0.60, 0.80, 0.85, 0.95, 1.05, 0.62, 0.28, 0.34, 0.34};

  private double time;
  private int part;
  private double within;

  void set(double seconds) {
    double t = START + seconds / DAY_SECONDS;
    time = t - Math.floor(t);
    part = 0;
    while (TIMES[part + 1] < time) {
      part++;
    }
    within = (time - TIMES[part]) / (TIMES[part + 1] - TIMES[part]);
  }

  private int pick(int[] colours) {
    return Colour.mix(colours[part], colours[part + 1], within);
  }

  private double pick(double[] values) {
    return Island.mix(values[part], values[part + 1], within);
  }

  int zenith() {
    return pick(ZENITH);
  }

  int middle() {
    return pick(MIDDLE);
  }

  int horizon() {
    return pick(HORIZON);
  }

  double ambient() {
    return pick(AMBIENT);
  }

  int light() {
    return pick(LIGHT);
  }

  /** 0 by day to 1 in the dark. */
  double night() {
    return 1 - Island.step(0.22, 0.30, time) * Island.step(0.82, 0.745, time);
  }

  /** Where the sun stands, as a direction with its height counted upward; below the horizon at night. */
  double[] sunPlace() {
    return arc((time - 0.25) * 2 * Math.PI);
  }

  /** Where the moon stands. */
  double[] moonPlace() {
    return arc((time + 0.32) * 2 * Math.PI);
  }

  private static double[] arc(double angle) {
    return new double[] {Math.cos(angle), Math.sin(angle) * 0.80, 0.25 - 0.62 * Math.max(0, Math.sin(angle))};
  }

  /** The light that models take: the sun's, or the moon's. */
  Sun sun() {
    double[] place = sunPlace();
    // Low light still comes from above, and night's from the moon; the change happens where both are weak.
    if (place[1] < -0.12) {
      place = moonPlace();
    }
    double up = Math.max(0.24, Math.abs(place[1]));
    return new Sun(
        light() & 0xFFFFFF, (float) pick(FRONT), (float) (0.42 * pick(FRONT)), (float) place[0], (float) -up,
        (float) (place[2] - 0.35));
  }

  /** Time as on a clock. */
  String clock() {
    int minutes = (int) (time * 24 * 60);
    return String.format(java.util.Locale.ROOT, "%02d:%02d", minutes / 60, minutes % 60);
  }
}
