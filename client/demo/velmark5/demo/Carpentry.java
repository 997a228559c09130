package velmark5.demo;

import velmark5.Hsl;
import velmark5.Material;
import velmark5.Mesh;
import velmark5.TextureMapping;

/** The meshes of the village: trees, rocks, houses and what stands between them. Units are centimetres. */
final class Carpentry {
  private static final Material WOOD = plain(0xE8D8C0, Textures.PLANKS);
  private static final Material BOARDS = WOOD.textured(Textures.PLANKS, new TextureMapping.Cube(100));
  private static final Material STONE = plain(0xC9C6BE, Textures.BLOCKS);
  private static final Material PLASTER = plain(0xFFFFFF, Textures.TIMBER);

  private Carpentry() {}

  static Material plain(int rgb, int texture) {
    return Material.of(Hsl.ofRgb(rgb)).textured(texture, null);
  }

  private static Material wrapped(int rgb, int texture, TextureMapping mapping) {
    return Material.of(Hsl.ofRgb(rgb)).textured(texture, mapping);
  }

  static Mesh conifer(int seed) {
    Sculptor s = new Sculptor();
    double tall = 560 + 260 * Noise.hash(seed + 11);
    double wide = 125 + 45 * Noise.hash(seed + 12);
    var bark = new TextureMapping.Cylinder(TextureMapping.Direction.DOWN, 0, 120, 2048, 0, 0);
    s.lathe(6, wrapped(0x7A5A40, Textures.BARK, bark), 24, -30, 17, tall * 0.3);
    int layers = 5;
    for (int i = 0; i < layers; i++) {
      double low = tall * (0.13 + 0.165 * i);
      double radius = wide * (1 - 0.17 * i);
      int green = new int[] {0x2C5B34, 0x336638, 0x3A723E, 0x437E43, 0x4E8B49}[i];
      var needles = new TextureMapping.Cylinder(TextureMapping.Direction.DOWN, i * 37, 150, 3072, 0, 40 * i);
      s.at(0, 0, 0, 0.7 * i + seed);
      s.lathe(8, 0.16, seed * 7 + i, wrapped(green, Textures.LEAVES, needles),
          0, low + 16, radius, low, radius * 0.55, low + tall * 0.12, 0, low + tall * (i == layers - 1 ? 0.24 : 0.29));
    }
    return s.build();
  }

  static Mesh broadleaf(int seed) {
    Sculptor s = new Sculptor();
    double tall = 330 + 120 * Noise.hash(seed + 21);
    var bark = new TextureMapping.Cylinder(TextureMapping.Direction.DOWN, 0, 120, 2048, 0, 0);
    s.lathe(7, wrapped(0x8A6A4C, Textures.BARK, bark), 36, -30, 24, 40, 19, tall * 0.9);
    int[] greens = seed % 3 == 0
        ? new int[] {0x8A8A30, 0xA39436, 0xB8A03E, 0x9B9034}
        : new int[] {0x4F7F35, 0x5B8E3B, 0x699B41, 0x608F3D};
    for (int i = 0; i < 4; i++) {
      double angle = seed + i * 2.1;
      double out = i == 3 ? 0 : 85;
      double up = tall * (i == 3 ? 1.16 : 0.86 + 0.07 * i);
      var crown = new TextureMapping.Cube(TextureMapping.Direction.DOWN, 30 * i, 190, 0, 60 * i, 90, 30 * i);
      s.at(out * Math.cos(angle), 0, out * Math.sin(angle), angle);
      s.ball(up, 118 + 30 * Noise.hash(seed * 5 + i), 0.82, 0.13, seed * 11 + i, wrapped(greens[i], Textures.LEAVES, crown));
    }
    return s.build();
  }

  static Mesh bush(int seed) {
    Sculptor s = new Sculptor();
    for (int i = 0; i < 2; i++) {
      var crown = new TextureMapping.Cube(110);
      s.at(i * 38 - 15, 0, i * 22 - 10);
      s.ball(22, 42 + 18 * Noise.hash(seed + i), 0.8, 0.16, seed * 3 + i,
          wrapped(i == 0 ? 0x5C8A3A : 0x6E9A44, Textures.LEAVES, crown));
    }
    return s.build();
  }

  static Mesh boulder(int seed) {
    Sculptor s = new Sculptor();
    s.ball(20, 75, 0.72, 0.24, seed, wrapped(0xB9B3AA, Textures.GRAIN, new TextureMapping.Cube(150)));
    return s.build();
  }

  /** How wide a house's walls are. */
  static double width(int seed) {
    return 370 + 70 * Noise.hash(seed + 31);
  }

  /** A house whose door looks towards an angle; its windows are models of their own, for day and night. */
  static Mesh hut(int seed, double angle, boolean windowsOnly, boolean lit) {
    Sculptor s = new Sculptor().at(0, 0, 0, angle);
    double w = width(seed);
    double d = 320;
    double wall = 240;
    if (windowsOnly) {
      Material glass = plain(0xFFFFFF, lit ? Textures.LIT_WINDOW : Textures.DARK_WINDOW);
      for (double x : new double[] {-w / 2 + 85, w / 2 - 85}) {
        pane(s, x, 92, -d / 2 - 5, 82, glass, false);
        pane(s, -x, 92, d / 2 + 5, 82, glass, true);
      }
      return s.build();
    }
    s.box(0, -70, 0, w + 16, 100, d + 16, STONE, 130);
    double l = -w / 2;
    double r = w / 2;
    double n = -d / 2;
    double f = d / 2;
    double walls = 3;
    s.panel(new double[] {l, wall, n, l, 30, n, r, 30, n, r, wall, n}, PLASTER, walls, 1);
    s.panel(new double[] {r, wall, f, r, 30, f, l, 30, f, l, wall, f}, PLASTER, walls, 1);
    s.panel(new double[] {l, wall, f, l, 30, f, l, 30, n, l, wall, n}, PLASTER, 2, 1);
    s.panel(new double[] {r, wall, n, r, 30, n, r, 30, f, r, wall, f}, PLASTER, 2, 1);
    double ridge = 432;
    s.gable(new double[] {l, ridge - 12, 0, l, wall, f, l, wall, n}, PLASTER);
    s.gable(new double[] {r, ridge - 12, 0, r, wall, n, r, wall, f}, PLASTER);
    for (double x : new double[] {l, r}) {
      s.box(x, wall - 8, 0, 10, 16, d, WOOD, 120);
    }
    int[] reds = {0xB5532F, 0xA6482E, 0x8F5A38, 0xC06A3A};
    Material tiles = plain(reds[seed & 3], Textures.SHINGLES);
    double a = l - 50;
    double b = r + 50;
    double eave = 214;
    double out = d / 2 + 42;
    s.panel(new double[] {a, ridge, 0, a, eave, -out, b, eave, -out, b, ridge, 0}, tiles, 3, 2);
    s.panel(new double[] {b, ridge, 0, b, eave, out, a, eave, out, a, ridge, 0}, tiles, 3, 2);
    Material under = plain(0x6A5440, Textures.PLANKS);
    s.panel(new double[] {b, ridge - 6, 0, b, eave - 6, -out, a, eave - 6, -out, a, ridge - 6, 0}, under, 3, 2);
    s.panel(new double[] {a, ridge - 6, 0, a, eave - 6, out, b, eave - 6, out, b, ridge - 6, 0}, under, 3, 2);
    // The roof's thickness, on all four edges.
    Material edge = plain(0xA88860, Textures.PLANKS);
    for (int side = -1; side <= 1; side += 2) {
      double x = side < 0 ? a : b;
      double z0 = side < 0 ? out : -out;
      s.panel(new double[] {x, ridge, 0, x, ridge - 24, 0, x, eave - 20, -z0, x, eave, -z0}, edge, 2, 0.2);
      s.panel(new double[] {x, eave, z0, x, eave - 20, z0, x, ridge - 24, 0, x, ridge, 0}, edge, 2, 0.2);
      s.panel(new double[] {a * -side, eave, out * side, a * -side, eave - 20, out * side, b * -side, eave - 20,
          out * side, b * -side, eave, out * side}, edge, 3, 0.2);
    }
    s.box(w * 0.28, 290, 40, 62, 215, 62, STONE, 90);
    s.box(0, 20, n - 6, 92, 150, 14, plain(0x9A7048, Textures.PLANKS), 90);
    s.box(0, -60, n - 40, 150, 92, 80, STONE, 100);
    return s.build();
  }

  private static void pane(Sculptor s, double x, double up, double z, double size, Material glass, boolean back) {
    double h = back ? -size / 2 : size / 2;
    s.panel(new double[] {x - h, up + size, z, x - h, up, z, x + h, up, z, x + h, up + size, z}, glass, 1, 1);
  }

  static Mesh column(int seed) {
    Sculptor s = new Sculptor();
    double tall = seed % 3 == 2 ? 190 : 330;
    var around = new TextureMapping.Cylinder(TextureMapping.Direction.DOWN, 20 * seed, 190, 2048, 0, 0);
    Material marble = wrapped(0xE6E0D2, Textures.BLOCKS, around);
    s.lathe(10, marble, 58, -40, 58, 16, 40, 26, 34, tall * 0.5, 32, tall, 50, tall + 14, 50, tall + 34, 0, tall + 35);
    return s.build();
  }

  /** Two pillars and a lintel, with carved signs; the veil between them is a model of its own. */
  static Mesh gate(boolean veilOnly) {
    Sculptor s = new Sculptor();
    if (veilOnly) {
      Material veil = plain(0xFFFFFF, Textures.VEIL);
      s.panel(new double[] {-120, 400, 0, -120, 10, 0, 120, 10, 0, 120, 400, 0}, veil, 1, 1.6);
      s.panel(new double[] {120, 400, 0, 120, 10, 0, -120, 10, 0, -120, 400, 0}, veil, 1, 1.6);
      return s.build();
    }
    for (int side = -1; side <= 1; side += 2) {
      s.box(165 * side, -40, 0, 92, 460, 100, plain(0x9AA2AE, Textures.ROCK), 230);
      s.box(165 * side, 60, -52, 40, 300, 6, plain(0xFFFFFF, Textures.SIGNS), 150);
    }
    s.box(0, 412, 0, 500, 88, 120, plain(0x9AA2AE, Textures.ROCK), 230);
    s.box(0, 432, -62, 300, 46, 6, plain(0xFFFFFF, Textures.SIGNS), 184);
    s.box(0, -60, 0, 620, 72, 330, plain(0xB6B2AA, Textures.BLOCKS), 200);
    return s.build();
  }

  /** An arched bridge along x. */
  static Mesh bridge(double length) {
    Sculptor s = new Sculptor();
    int planks = 18;
    for (int i = 0; i < planks; i++) {
      double x = ((i + 0.5) / planks - 0.5) * length;
      s.box(x, arch(x, length) - 14, 0, length / planks - 3, 16, 150, BOARDS, 90);
    }
    int fields = 6;
    for (int side = -1; side <= 1; side += 2) {
      for (int i = 0; i <= fields; i++) {
        double x = (i / (double) fields - 0.5) * (length - 14);
        s.box(x, arch(x, length) - 60, 70 * side, 14, 140, 14, BOARDS, 80);
        double next = x + (length - 14) / fields;
        for (double up : i < fields ? new double[] {30, 68} : new double[0]) {
          s.beam(x, arch(x, length) + up, next, arch(next, length) + up, 70 * side, 10, 8, BOARDS);
        }
      }
    }
    return s.build();
  }

  /** How high a bridge rises at a place between its ends. */
  static double arch(double x, double length) {
    return 62 * Math.cos(Math.PI * x / length);
  }

  static Mesh lampPost() {
    Sculptor s = new Sculptor();
    s.lathe(6, plain(0x5A4634, Textures.BARK).textured(Textures.BARK,
        new TextureMapping.Cylinder(TextureMapping.Direction.DOWN, 0, 90, 1024, 0, 0)), 10, -30, 7, 172);
    s.box(0, 172, 0, 34, 5, 34, WOOD, 60);
    s.lathe(4, Material.of(Hsl.ofRgb(0x3A3028)), 30, 214, 0, 236);
    return s.build();
  }

  static Mesh lampGlass(boolean lit) {
    Sculptor s = new Sculptor();
    s.box(0, 178, 0, 24, 36, 24, plain(0xFFFFFF, lit ? Textures.LIT_WINDOW : Textures.DARK_WINDOW), 36);
    return s.build();
  }

  static Mesh mill() {
    Sculptor s = new Sculptor();
    var around = new TextureMapping.Cylinder(TextureMapping.Direction.DOWN, 0, 200, 4096, 0, 0);
    s.lathe(14, wrapped(0xE9DFCB, Textures.BLOCKS, around), 170, -60, 150, 120, 128, 330, 112, 500);
    var roof = new TextureMapping.Cylinder(TextureMapping.Direction.DOWN, 0, 130, 5120, 0, 0);
    s.lathe(14, wrapped(0x9C4F33, Textures.SHINGLES, roof), 112, 496, 142, 494, 78, 590, 0, 668);
    s.box(0, 520, -125, 34, 34, 110, WOOD, 80);
    s.box(0, -20, -158, 90, 165, 24, plain(0x9A7048, Textures.PLANKS), 90);
    pane(s, 0, 290, -136, 62, plain(0xFFFFFF, Textures.DARK_WINDOW), false);
    return s.build();
  }

  /** Four sails around the origin, in the plane of x and height. */
  static Mesh sails() {
    Sculptor s = new Sculptor();
    Material cloth = plain(0xF2E8D2, Textures.GRAIN);
    for (int i = 0; i < 4; i++) {
      double a = Math.PI / 2 * i;
      double c = Math.cos(a);
      double t = Math.sin(a);
      double[] across = {-t, c};
      for (int side = -1; side <= 1; side += 2) {
        sail(s, c, t, across, side, 14, -8, 20, 400, WOOD);
        sail(s, c, t, across, side, 96, 10, 90, 390, cloth);
      }
    }
    return s.build();
  }

  private static void sail(Sculptor s, double c, double t, double[] across, int side, double wide, double from,
      double near, double far, Material material) {
    double[] near0 = {c * near + across[0] * from, t * near + across[1] * from, 0};
    double[] near1 = {c * near + across[0] * wide, t * near + across[1] * wide, 0};
    double[] far0 = {c * far + across[0] * from, t * far + across[1] * from, 0};
    double[] far1 = {c * far + across[0] * wide, t * far + across[1] * wide, 0};
    double[] q = side < 0
        ? new double[] {far0[0], far0[1], 0, near0[0], near0[1], 0, near1[0], near1[1], 0, far1[0], far1[1], 0}
        : new double[] {far1[0], far1[1], 0, near1[0], near1[1], 0, near0[0], near0[1], 0, far0[0], far0[1], 0};
    s.panel(q, material, 1, 3);
  }

  static Mesh boat() {
    Sculptor s = new Sculptor();
    int parts = 8;
    int[][] rows = new int[4][parts + 1];
    for (int i = 0; i <= parts; i++) {
      double t = i / (double) parts * 2 - 1;
      double wide = 62 * (1 - Math.pow(Math.abs(t), 2.4));
      double rail = 42 + 34 * t * t;
      rows[0][i] = s.corner(-wide, rail, 190 * t);
      rows[1][i] = s.corner(-wide * 0.5, -26 + 20 * t * t, 165 * t);
      rows[2][i] = s.corner(wide * 0.5, -26 + 20 * t * t, 165 * t);
      rows[3][i] = s.corner(wide, rail, 190 * t);
    }
    Material hull = Material.of(Hsl.ofRgb(0x9C6A3E));
    Material inside = Material.of(Hsl.ofRgb(0x6E4A2C));
    for (int row = 0; row < 3; row++) {
      for (int i = 0; i < parts; i++) {
        s.face(rows[row][i], rows[row + 1][i], rows[row + 1][i + 1], 0, 60, 0, hull);
        s.face(rows[row][i], rows[row + 1][i + 1], rows[row][i + 1], 0, 60, 0, hull);
      }
    }
    for (int i = 0; i < parts; i++) {
      s.face(rows[0][i], rows[3][i], rows[3][i + 1], 0, -500, 0, inside);
      s.face(rows[0][i], rows[3][i + 1], rows[0][i + 1], 0, -500, 0, inside);
    }
    s.lathe(6, Material.of(Hsl.ofRgb(0x7A5638)), 7, 0, 5, 360);
    Material cloth = plain(0xF6ECD8, Textures.GRAIN);
    for (int side = -1; side <= 1; side += 2) {
      int tip = s.corner(0, 345, 8);
      int low = s.corner(0, 95, 8);
      int far = s.corner(26, 100, 170);
      s.face(tip, low, far, -300.0 * side, 150, 80, cloth);
    }
    return s.build();
  }

  /** Posts and boards that lead out from the shore, along z. */
  static Mesh pier(double length) {
    Sculptor s = new Sculptor();
    for (double z = 0; z < length; z += 44) {
      s.box(0, 40, -z, 150, 12, 40, BOARDS, 110);
      if ((int) (z / 44) % 4 == 1) {
        s.box(-72, -140, -z, 18, 230, 18, BOARDS, 80);
        s.box(72, -140, -z, 18, 230, 18, BOARDS, 80);
      }
    }
    return s.build();
  }

  static Mesh hearth() {
    Sculptor s = new Sculptor();
    for (int i = 0; i < 9; i++) {
      double a = 2 * Math.PI * i / 9;
      s.at(62 * Math.cos(a), 0, 62 * Math.sin(a));
      s.ball(6, 18, 0.8, 0.2, i, wrapped(0xA8A39A, Textures.GRAIN, new TextureMapping.Cube(60)));
    }
    for (int i = 0; i < 4; i++) {
      s.at(0, 0, 0, 0.4 + i * Math.PI / 4);
      s.box(0, 4, 0, 84, 12, 12, WOOD, 60);
    }
    return s.build();
  }

  static Mesh flames() {
    Sculptor s = new Sculptor();
    Material fire = plain(0xFFFFFF, Textures.FLAMES);
    for (int i = 0; i < 5; i++) {
      s.at(0, 0, 0, i * 2 * Math.PI / 5);
      double lean = 26;
      s.gable(new double[] {8, 105 + 20 * (i % 2), lean, -38, 6, -6, 38, 6, -6}, fire);
      s.gable(new double[] {8, 105 + 20 * (i % 2), lean, 38, 6, -6, -38, 6, -6}, fire);
    }
    return s.build();
  }

  /** A wanderer without legs: robe, head, hat. */
  static Mesh wanderer(int robe) {
    Sculptor s = new Sculptor();
    Material cloth = Material.of(Hsl.ofRgb(robe));
    s.lathe(9, cloth, 40, 34, 36, 60, 24, 110, 27, 138, 10, 150);
    s.ball(164, 15, 1.1, 0, 1, Material.of(Hsl.ofRgb(0xE2B48C)));
    s.lathe(9, Material.of(Hsl.ofRgb(0x6A4E2E)), 0, 170, 36, 172, 15, 180, 3, 208, 0, 210);
    s.box(38, 80, 0, 8, 62, 8, Material.of(Hsl.ofRgb(robe)), 50);
    s.box(50, 0, -12, 6, 190, 6, Material.of(Hsl.ofRgb(0x8A6238)), 50);
    return s.build();
  }

  /** A leg that hangs from the origin. */
  static Mesh leg() {
    Sculptor s = new Sculptor();
    s.lathe(6, Material.of(Hsl.ofRgb(0x4A3626)), 8, -62, 10, 0);
    s.box(0, -70, -6, 18, 12, 34, Material.of(Hsl.ofRgb(0x2E2018)), 50);
    return s.build();
  }

  /** Half a bird, seen from both sides. */
  static Mesh wing() {
    Sculptor s = new Sculptor();
    Material feathers = Material.of(Hsl.ofRgb(0xF4F4F0));
    int a = s.corner(0, 0, 26);
    int b = s.corner(0, 0, -26);
    int tip = s.corner(88, 4, -22);
    int c = s.corner(52, 2, 16);
    for (int side = -1; side <= 1; side += 2) {
      s.face(a, b, tip, 30, side * 900.0, 0, feathers);
      s.face(a, tip, c, 30, side * 900.0, 0, feathers);
    }
    return s.build();
  }

  /** A puff of smoke or spray that is seen from the south. */
  static Mesh puff(int rgb, int thinness) {
    Sculptor s = new Sculptor();
    Material cloud = plain(rgb, Textures.PUFF + thinness);
    s.panel(new double[] {-60, 60, 0, -60, -60, 0, 60, -60, 0, 60, 60, 0}, cloud, 1, 1);
    return s.build();
  }
}
