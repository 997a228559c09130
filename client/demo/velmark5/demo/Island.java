package velmark5.demo;

import java.util.ArrayList;
import java.util.List;

/** The shape of the land: heights above the sea, the river's course, paths, and what grows where. Pure functions. */
final class Island {
  static final double VILLAGE_X = -350;
  static final double VILLAGE_Z = -250;
  static final double MOUND_X = 1330;
  static final double MOUND_Z = -330;
  static final double MILL_X = -1560;
  static final double MILL_Z = 380;
  static final double FALL_X = 520;
  static final double FALL_Z = 1130;
  static final double BRIDGE_Z = -290;

  /** Half the width of the river's flat bed. */
  static final double RIVER_BED = 46;

  /** How far from the river's middle its water meets the bank. */
  static final double RIVER_EDGE = 122;

  private static final double[][] COURSE = {
    {530, 1330, 88}, {FALL_X, FALL_Z, 86}, {430, 720, 78}, {600, 250, 66}, {480, -280, 54}, {640, -800, 36},
    {560, -1400, 14}, {760, -2000, 0}, {820, -2700, -6}, {860, -3300, -10}
  };

  /** The river from the pool to the sea: x, z and level of its surface. */
  static final List<double[]> RIVER = course();

  static final double[][][] PATHS = {
    {{-350, -250}, {60, -250}, {480, BRIDGE_Z}, {900, -300}, {MOUND_X, MOUND_Z}},
    {{-350, -250}, {-420, -800}, {-250, -1400}, {-330, -2300}},
    {{-350, -250}, {-800, -120}, {-1200, 200}, {-1560, 260}}
  };

  private Island() {}

  private static List<double[]> course() {
    List<double[]> points = new ArrayList<>();
    for (int i = 1; i + 2 < COURSE.length; i++) {
      for (int k = 0; k < 9; k++) {
        double t = k / 9.0;
        double[] p = new double[3];
        for (int axis = 0; axis < 3; axis++) {
          double a = COURSE[i - 1][axis];
          double b = COURSE[i][axis];
          double c = COURSE[i + 1][axis];
          double d = COURSE[i + 2][axis];
          p[axis] = b + 0.5 * t * (c - a + t * (2 * a - 5 * b + 4 * c - d + t * (3 * (b - c) + d - a)));
        }
        points.add(p);
      }
    }
    return List.copyOf(points);
  }

  static double step(double from, double to, double x) {
    double t = Math.max(0, Math.min(1, (x - from) / (to - from)));
    return t * t * (3 - 2 * t);
  }

  static double mix(double a, double b, double t) {
    return a + (b - a) * t;
  }

  /** How far inland a place is; negative at sea. */
  static double inland(double x, double z) {
    double angle = Math.atan2(z, x);
    double coast = 2450 + 800 * Noise.smooth(71, 9 + 1.7 * Math.cos(angle), 9 + 1.7 * Math.sin(angle));
    double bay = 620 * Math.exp(-Math.pow((x + 500) / 620, 2)) * step(-1000, -1900, z);
    return coast - bay - Math.hypot(x, z);
  }

  /** How far from the island's middle, in the direction of an angle, the sea is so far out from the shore. */
  static double shore(double angle, double out) {
    double low = 0;
    double high = 4000 + Math.max(0, out);
    for (int i = 0; i < 24; i++) {
      double far = (low + high) / 2;
      if (inland(far * Math.cos(angle), far * Math.sin(angle)) > -out) {
        low = far;
      } else {
        high = far;
      }
    }
    return low;
  }

  static double riverDistance(double x, double z) {
    return nearest(x, z)[0];
  }

  /** How far the middle of the river is from a place, and the river's level there. */
  private static double[] nearest(double x, double z) {
    int at = 0;
    double least = Double.MAX_VALUE;
    for (int i = 0; i < RIVER.size(); i++) {
      double[] p = RIVER.get(i);
      double d = (p[0] - x) * (p[0] - x) + (p[1] - z) * (p[1] - z);
      if (d < least) {
        least = d;
        at = i;
      }
    }
    double[] best = {Double.MAX_VALUE, 0};
    for (int i = Math.max(0, at - 1); i <= Math.min(at, RIVER.size() - 2); i++) {
      double[] a = RIVER.get(i);
      double[] b = RIVER.get(i + 1);
      double t = along(a, b, x, z);
      double far = Math.hypot(mix(a[0], b[0], t) - x, mix(a[1], b[1], t) - z);
      if (far < best[0]) {
        best = new double[] {far, mix(a[2], b[2], t)};
      }
    }
    return best;
  }

  /** Which part of the way from a to b lies behind the foot point of a place, 0 to 1. */
  private static double along(double[] a, double[] b, double x, double z) {
    double dx = b[0] - a[0];
    double dz = b[1] - a[1];
    return Math.max(0, Math.min(1, ((x - a[0]) * dx + (z - a[1]) * dz) / (dx * dx + dz * dz)));
  }

  static double pathDistance(double x, double z) {
    double least = Double.MAX_VALUE;
    for (double[][] path : PATHS) {
      for (int i = 0; i + 1 < path.length; i++) {
        double t = along(path[i], path[i + 1], x, z);
        least = Math.min(
            least, Math.hypot(mix(path[i][0], path[i + 1][0], t) - x, mix(path[i][1], path[i + 1][1], t) - z));
      }
    }
    return least;
  }

  /** A place on the way from the village to the mound and back, for 0 to 1. */
  static double[] walk(double t) {
    double[][] path = PATHS[0];
    double along = (1 - Math.abs(2 * t - 1)) * (path.length - 1.02);
    int i = (int) along;
    double part = along - i;
    double sign = t < 0.5 ? 1 : -1;
    return new double[] {
      mix(path[i][0], path[i + 1][0], part),
      mix(path[i][1], path[i + 1][1], part),
      Math.atan2(sign * (path[i + 1][0] - path[i][0]), sign * (path[i + 1][1] - path[i][1]))
    };
  }

  /** The ground's height above the sea. */
  static double height(double x, double z) {
    double shore = inland(x, z);
    double h = shore < 0 ? Math.max(-170, shore * 0.20) : 105 * (1 - Math.exp(-shore / 520));
    double within = step(0, 700, shore);
    h += within * (90 * Noise.smooth(11, x / 560 + 40, z / 560 + 40) - 35 + 22 * Noise.smooth(12, x / 170 + 40, z / 170 + 40));
    h = mix(h, 84, step(1150, 800, Math.hypot(x - VILLAGE_X, z - VILLAGE_Z)));
    h += 280 * Math.exp(-Math.pow(Math.hypot(x - MILL_X, z - MILL_Z) / 430, 2));
    h = mix(h, 150, step(560, 300, Math.hypot(x - MOUND_X, z - MOUND_Z)));

    // Cliffs in the north, with a mountain upon them.
    double edge = 1230 + 240 * (Noise.smooth(21, x / 330 + 30) - 0.5) + Math.pow(Math.abs(x - 400) / 1500, 2) * 500;
    double top = 400 + 130 * Noise.smooth(22, x / 300 + 30, z / 300 + 30);
    h += step(0, 150, z - edge) * top * step(0, 260, shore) * step(2300, 1500, Math.abs(x - 300));
    double peak = Math.max(0, 1 - Math.hypot((x + 250) * 0.85, z - 1980) / 1050);
    double folds = 0.62 + 0.62 * Noise.creased(33, x / 620 + 20, z / 620 + 20, 3);
    h += Math.pow(peak, 1.25) * 1350 * folds * step(0, 300, shore);

    // A crown of rocks around the place where the fall springs up, open to the south.
    double round = Math.hypot(x - FALL_X, z - 1560);
    h += 230 * Math.exp(-Math.pow((round - 190) / 85, 2)) * step(1340, 1450, z);

    if (Math.abs(x - 600) > 900) {
      return h; // far from the river
    }
    double[] river = nearest(x, z);
    double d = river[0];
    // Gentle banks, but for the gorge that the fall has cut.
    double gorge = step(850, 1050, z);
    double bank = mix(0.006 * Math.pow(Math.max(0, d - 150), 2), 3.8 * Math.max(0, d - 165), gorge);
    return Math.min(h, river[1] - 42 + Math.max(0, d - RIVER_BED) * 0.55 + bank);
  }

  /** How steep the ground is: 0 level, 1 at 45 degrees. */
  static double slope(double x, double z) {
    double reach = 30;
    return Math.hypot(height(x + reach, z) - height(x - reach, z), height(x, z + reach) - height(x, z - reach)) / (2 * reach);
  }
}
