package velmark5.demo;

import java.util.ArrayList;
import java.util.HashMap;
import java.util.List;
import java.util.Map;
import velmark5.Hsl;
import velmark5.Material;
import velmark5.Matrix;
import velmark5.MemoryPool;
import velmark5.Mesh;
import velmark5.Model;
import velmark5.ModelSettings;
import velmark5.Rect;
import velmark5.Sun;
import velmark5.TextureMapping;
import velmark5.ThreadResource;
import velmark5.Toolkit;

/**
 * Rocks that circle around the knot: textured models with light and depth. Those behind the knot are drawn by one
 * instance of the scene, those in front of it by another.
 */
final class Stones implements Scene {
  /** How many rocks there are. */
  static final int COUNT = 9;

  /** No rock is farther from the knot than this. */
  static final int REACH = 400;

  private static final int RADIUS = 27;
  private static final double DISTANCE = 900;

  private final Toolkit toolkit;
  private final Knot knot;
  private final boolean inFront;
  private final ThreadResource resource;
  private final List<Model> models = new ArrayList<>();
  private int width;
  private int height;

  Stones(Toolkit toolkit, MemoryPool pool, Knot knot, boolean inFront) {
    this.toolkit = toolkit;
    this.knot = knot;
    this.inFront = inFront;
    resource = toolkit.createThreadResource();
    for (int i = 0; i < COUNT; i++) {
      models.add(toolkit.createModel(pool, rock(i), ModelSettings.STANDARD));
    }
  }

  /** A ball of triangles, pushed in and out by noise; one face in nine bears signs. */
  private static Mesh rock(int seed) {
    List<double[]> corners = new ArrayList<>();
    List<int[]> faces = new ArrayList<>();
    double g = (1 + Math.sqrt(5)) / 2;
    for (int i = 0; i < 12; i++) {
      double a = (i & 1) == 0 ? 1 : -1;
      double b = (i & 2) == 0 ? g : -g;
      corners.add(
          switch (i / 4) {
            case 0 -> new double[] {a, b, 0};
            case 1 -> new double[] {0, a, b};
            default -> new double[] {b, 0, a};
          });
    }
    for (int a = 0; a < 12; a++) {
      for (int b = a + 1; b < 12; b++) {
        for (int c = b + 1; c < 12; c++) {
          if (near(corners, a, b) && near(corners, b, c) && near(corners, a, c)) {
            faces.add(new int[] {a, b, c});
          }
        }
      }
    }
    faces = split(corners, split(corners, faces));
    var box = new TextureMapping.Cube(TextureMapping.Direction.DOWN, 0, RADIUS * 2, 0, 0, 0, 0);
    Material stone = Material.of(Hsl.of(0, 0, 0.62)).textured(Textures.ROCK, box);
    Material signs = Material.of(Hsl.of(0, 0, 0.75)).textured(Textures.SIGNS, box);
    Mesh.Builder mesh = Mesh.builder();
    for (double[] p : corners) {
      double length = Math.sqrt(p[0] * p[0] + p[1] * p[1] + p[2] * p[2]);
      double bump = 0.62 + 0.75 * Noise.creased(seed * 5 + 3, p[0] / length + 9, p[1] / length + p[2] / length * 0.7, 3);
      double scale = RADIUS * bump * (0.75 + 0.5 * Noise.hash(seed + 4)) / length;
      mesh.vertex((int) Math.round(p[0] * scale), (int) Math.round(p[1] * scale * 0.8), (int) Math.round(p[2] * scale));
    }
    for (int i = 0; i < faces.size(); i++) {
      int[] face = outwards(corners, faces.get(i));
      boolean carved = Math.abs(corners.get(face[0])[1]) < 0.75 && seed % 3 == 0;
      mesh.face(face[0], face[1], face[2], carved ? signs : stone);
    }
    return mesh.build();
  }

  private static boolean near(List<double[]> corners, int a, int b) {
    double[] p = corners.get(a);
    double[] q = corners.get(b);
    return Math.abs(Math.hypot(Math.hypot(p[0] - q[0], p[1] - q[1]), p[2] - q[2]) - 2) < 1e-6;
  }

  /** Cuts each face into four and moves the new corners out to the ball. */
  private static List<int[]> split(List<double[]> corners, List<int[]> faces) {
    Map<Long, Integer> middles = new HashMap<>();
    List<int[]> result = new ArrayList<>();
    for (int[] f : faces) {
      int[] m = new int[3];
      for (int i = 0; i < 3; i++) {
        int a = Math.min(f[i], f[(i + 1) % 3]);
        int b = Math.max(f[i], f[(i + 1) % 3]);
        m[i] = middles.computeIfAbsent((long) a << 32 | b, key -> middle(corners, a, b));
      }
      result.add(new int[] {f[0], m[0], m[2]});
      result.add(new int[] {f[1], m[1], m[0]});
      result.add(new int[] {f[2], m[2], m[1]});
      result.add(m);
    }
    return result;
  }

  private static int middle(List<double[]> corners, int a, int b) {
    double[] p = corners.get(a);
    double[] q = corners.get(b);
    double[] m = {p[0] + q[0], p[1] + q[1], p[2] + q[2]};
    double scale = Math.sqrt((p[0] * p[0] + p[1] * p[1] + p[2] * p[2]) / (m[0] * m[0] + m[1] * m[1] + m[2] * m[2]));
    corners.add(new double[] {m[0] * scale, m[1] * scale, m[2] * scale});
    return corners.size() - 1;
  }

  /** Turns a face so that it is seen from outside. */
  private static int[] outwards(List<double[]> corners, int[] face) {
    double[] p = corners.get(face[0]);
    double[] q = corners.get(face[1]);
    double[] r = corners.get(face[2]);
    double volume = p[0] * (q[1] * r[2] - q[2] * r[1]) + p[1] * (q[2] * r[0] - q[0] * r[2])
        + p[2] * (q[0] * r[1] - q[1] * r[0]);
    return volume < 0 ? face : new int[] {face[0], face[2], face[1]};
  }

  @Override
  public void resize(int newWidth, int newHeight) {
    width = newWidth;
    height = newHeight;
  }

  /** Where a rock is at a moment, from the knot's middle: right, down, away, in the world's units. */
  static double[] place(int rock, double seconds) {
    double angle = seconds * 0.32 + rock * 2 * Math.PI / COUNT + 0.3 * Math.sin(rock * 3.0);
    double orbit = 350 + 35 * Math.sin(rock * 2.3);
    return new double[] {
      orbit * Math.cos(angle), 60 * Math.sin(angle + 0.6) + 18 * Math.sin(seconds + rock), -orbit * Math.sin(angle)
    };
  }

  @Override
  public void paint(double seconds) {
    toolkit.resetViewport();
    toolkit.setDepthRange(0, 1);
    toolkit.setProjection(Matrix.perspective(Math.toRadians(38), 1, 100, 3000).then(intoView(knot.viewport())));
    toolkit.setCamera(Matrix.lookAt(0, -60, -DISTANCE, 0, 0, 0));
    toolkit.setFog(0xFF0A1733, 0);
    toolkit.setAmbient(0.75f);
    toolkit.setSun(new Sun(0xFFCFE0FF, 1.1f, 0.4f, 0.6f, -0.7f, -0.5f));
    resource.begin();
    for (int i = 0; i < COUNT; i++) {
      double[] at = place(i, seconds);
      if (at[2] < 0 == inFront) {
        Matrix place =
            Matrix.rotationY(seconds * (0.5 + 0.2 * (i % 3)) + i)
                .then(Matrix.rotationX(0.5 * i + seconds * 0.2))
                .then(Matrix.translation(at[0], at[1], at[2]));
        resource.draw(models.get(i), place);
      }
    }
    resource.end();
  }

  /** Moves what would fill the whole target into a part of it, without cutting off what leaves that part. */
  private Matrix intoView(Rect part) {
    float sx = part.width() / (float) width;
    float sy = part.height() / (float) height;
    float tx = (2f * part.x() + part.width()) / width - 1;
    float ty = (2f * part.y() + part.height()) / height - 1;
    return Matrix.of(sx, 0, 0, 0, 0, sy, 0, 0, 0, 0, 1, 0, tx, ty, 0, 1);
  }
}
