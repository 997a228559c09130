package velmark5.demo;

import java.util.Arrays;
import velmark5.Colour;
import velmark5.Matrix;
import velmark5.Rect;
import velmark5.ThreadResource;
import velmark5.Toolkit;

/**
 * A polished knot that turns above the lake: triangles with a colour per corner, taken from what the corner mirrors of
 * the night around it. Farther triangles are drawn first.
 */
final class Knot implements Scene {
  private static final int AROUND = 240;
  private static final int SIDES = 20;
  private static final double TUBE = 0.40;

  private final ThreadResource resource;
  private final double[] places = new double[AROUND * SIDES * 3];
  private final double[] normals = new double[AROUND * SIDES * 3];
  private final float[] columns = new float[AROUND * SIDES];
  private final float[] rows = new float[AROUND * SIDES];
  private final float[] depths = new float[AROUND * SIDES];
  private final int[] colours = new int[AROUND * SIDES];
  private final long[] order = new long[AROUND * SIDES * 2];
  private Rect viewport = new Rect(0, 0, 1, 1);

  Knot(Toolkit toolkit) {
    resource = toolkit.createThreadResource();
    for (int i = 0; i < AROUND; i++) {
      buildRing(i, 2 * Math.PI * i / AROUND);
    }
  }

  private static double[] centre(double t) {
    double r = 1.6 + 0.62 * Math.cos(3 * t);
    return new double[] {r * Math.cos(2 * t), r * Math.sin(2 * t), 0.75 * Math.sin(3 * t)};
  }

  /** One ring of corners around the curve, in a frame that follows it. */
  private void buildRing(int ring, double t) {
    double[] here = centre(t);
    double[] next = centre(t + 1e-3);
    double[] along = unit(new double[] {next[0] - here[0], next[1] - here[1], next[2] - here[2]});
    double[] side = unit(cross(along, new double[] {here[0], here[1], here[2] + 0.4}));
    double[] out = cross(side, along);
    for (int i = 0; i < SIDES; i++) {
      double angle = 2 * Math.PI * i / SIDES;
      for (int k = 0; k < 3; k++) {
        double normal = Math.cos(angle) * side[k] + Math.sin(angle) * out[k];
        normals[(ring * SIDES + i) * 3 + k] = normal;
        places[(ring * SIDES + i) * 3 + k] = here[k] + TUBE * normal;
      }
    }
  }

  private static double[] cross(double[] a, double[] b) {
    return new double[] {a[1] * b[2] - a[2] * b[1], a[2] * b[0] - a[0] * b[2], a[0] * b[1] - a[1] * b[0]};
  }

  private static double dot(double[] a, double[] b) {
    return a[0] * b[0] + a[1] * b[1] + a[2] * b[2];
  }

  private static double[] unit(double[] v) {
    double length = Math.sqrt(dot(v, v));
    return new double[] {v[0] / length, v[1] / length, v[2] / length};
  }

  /** The part of the frame that the knot turns in. */
  Rect viewport() {
    return viewport;
  }

  @Override
  public void resize(int width, int height) {
    int side = Math.max(1, Math.min(width, height * 16 / 9) * 44 / 100);
    viewport = new Rect(width / 2 - side / 2, height * 31 / 100 - side / 2, side, side);
  }

  @Override
  public void paint(double seconds) {
    Matrix model =
        Matrix.rotationX(1.15 + 0.25 * Math.sin(seconds * 0.4))
            .then(Matrix.rotationY(seconds * 0.55))
            .then(Matrix.translation(0, 0.12 * Math.sin(seconds * 0.9), 0));
    Matrix screen =
        model.then(Matrix.lookAt(0, -0.6, -9, 0, 0, 0)).then(Matrix.perspective(Math.toRadians(38), 1, 1, 30));
    for (int i = 0; i < columns.length; i++) {
      placeCorner(i, model, screen);
    }
    int count = sortFaces();
    resource.begin();
    for (int i = count - 1; i >= 0; i--) {
      drawFace((int) order[i]);
    }
    resource.end();
  }

  private void placeCorner(int i, Matrix model, Matrix screen) {
    double x = places[i * 3];
    double y = places[i * 3 + 1];
    double z = places[i * 3 + 2];
    Matrix.ScreenPoint point = screen.project(x, y, z, viewport);
    columns[i] = (float) point.x();
    rows[i] = (float) point.y();
    depths[i] = (float) point.depth();
    float[] moved = model.transform(x, y, z);
    float[] tip = model.transform(x + normals[i * 3], y + normals[i * 3 + 1], z + normals[i * 3 + 2]);
    double[] normal = {tip[0] - moved[0], tip[1] - moved[1], tip[2] - moved[2]};
    double[] view = unit(new double[] {moved[0], moved[1] + 0.6, moved[2] + 9});
    double facing = dot(view, normal);
    if (facing > 0.3) {
      return; // on no face that is seen
    }
    double[] mirrored = {
      view[0] - 2 * facing * normal[0], view[1] - 2 * facing * normal[1], view[2] - 2 * facing * normal[2]
    };
    colours[i] = surroundings(mirrored, Math.pow(1 - Math.min(1, Math.abs(facing)), 3));
  }

  /** What lies in a direction: sky, a green curtain, the glow of the horizon, dark water; the moon and the lanterns. */
  private static int surroundings(double[] direction, double rim) {
    double up = -direction[1];
    int colour =
        up > 0
            ? Colour.mix(0xFF51607F, 0xFF070D22, Math.min(1, up * 1.6))
            : Colour.mix(0xFF1A2742, 0xFF02050C, Math.min(1, -up * 1.4));
    double band = Math.exp(-Math.pow((up - 0.42 - 0.12 * Math.sin(direction[0] * 5 + direction[2] * 3)) / 0.17, 2));
    colour = plus(colour, 0xFF2FD58C, 0.75 * band);
    colour = plus(colour, 0xFFD89A78, 0.55 * Math.exp(-Math.pow((up - 0.03) / 0.07, 2)));
    double moon = direction[0] * 0.55 + up * 0.68 - direction[2] * 0.48;
    colour = plus(colour, 0xFFE8F0FF, Math.pow(Math.max(0, moon), 26) + 0.25 * Math.pow(Math.max(0, moon), 5));
    double lanterns = -direction[0] * 0.75 - up * 0.25 - direction[2] * 0.6;
    colour = plus(colour, 0xFFFF8A2E, 0.6 * Math.pow(Math.max(0, lanterns), 6));
    return plus(colour, 0xFF6F8FCF, 0.5 * rim);
  }

  private static int plus(int colour, int light, double strength) {
    return Colour.rgb(
        Math.min(255, Colour.red(colour) + (int) (Colour.red(light) * strength)),
        Math.min(255, Colour.green(colour) + (int) (Colour.green(light) * strength)),
        Math.min(255, Colour.blue(colour) + (int) (Colour.blue(light) * strength)));
  }

  private static int corner(int face, int which) {
    int ring = face / 2 / SIDES;
    int side = face / 2 % SIDES;
    int nextRing = (ring + 1) % AROUND;
    int nextSide = (side + 1) % SIDES;
    boolean second = (face & 1) == 1;
    return switch (which) {
      case 0 -> ring * SIDES + side;
      case 1 -> second ? nextRing * SIDES + nextSide : nextRing * SIDES + side;
      default -> second ? ring * SIDES + nextSide : nextRing * SIDES + nextSide;
    };
  }

  /** Keeps the faces that turn to the viewer, sorted by depth, nearest first. */
  private int sortFaces() {
    int count = 0;
    for (int face = 0; face < order.length; face++) {
      int a = corner(face, 0);
      int b = corner(face, 1);
      int c = corner(face, 2);
      float area = (columns[b] - columns[a]) * (rows[c] - rows[a]) - (columns[c] - columns[a]) * (rows[b] - rows[a]);
      if (area < 0) {
        float depth = depths[a] + depths[b] + depths[c];
        order[count++] = (long) Float.floatToIntBits(depth) << 32 | face;
      }
    }
    Arrays.sort(order, 0, count);
    return count;
  }

  private void drawFace(int face) {
    int a = corner(face, 0);
    int b = corner(face, 1);
    int c = corner(face, 2);
    resource.fillTriangle(
        columns[a], rows[a], colours[a], columns[b], rows[b], colours[b], columns[c], rows[c], colours[c]);
  }
}
