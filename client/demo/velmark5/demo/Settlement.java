package velmark5.demo;

import java.util.ArrayList;
import java.util.Comparator;
import java.util.List;
import java.util.function.Function;
import java.util.stream.IntStream;
import velmark5.Matrix;
import velmark5.Mesh;
import velmark5.Model;

/** What stands and lies on the island, and where: placed once, with the lamps whose light reaches it. */
final class Settlement {
  /** Length of the bridge. */
  static final double BRIDGE = 440;

  private static final int FLAME = 0xFF9A3C;
  private static final int WARM = 0xFFC070;
  private static final int UNEARTHLY = 0x50C8FF;

  /** A light of the night. */
  record Lamp(double x, double up, double z, int range, int colour, double flicker) {
    /** How far a place lies outside of the light, negative inside. */
    double beyondLight(double placeX, double placeZ) {
      return Math.hypot(x - placeX, z - placeZ) - range;
    }
  }

  /** What stands still, and the numbers of the lamps that are nearest to it. */
  record Prop(Model model, Matrix place, double x, double z, int[] lamps) {}

  final List<Lamp> lamps = new ArrayList<>();
  final List<Prop> props = new ArrayList<>();
  final List<Prop> windows = new ArrayList<>();
  final List<Prop> litWindows = new ArrayList<>();

  /** Paths and the river's bed, shadows, the light of lamps: to be drawn over the land in this order. */
  final List<Prop> flat = new ArrayList<>();

  final List<Prop> shadows = new ArrayList<>();
  final List<Prop> glows = new ArrayList<>();

  /** The mouths of the chimneys: x, height, z. */
  final List<double[]> chimneys = new ArrayList<>();

  private final Function<Mesh, Model> maker;
  private final Decals decals;

  Settlement(Function<Mesh, Model> maker, Decals decals) {
    this.maker = maker;
    this.decals = decals;
    placeLamps();
    placeHouses();
    placeGate();
    placeWaterside();
    placeTrees();
    decals.riverBed().forEach(decal -> lay(flat, decal));
    lay(flat, decals.square(Island.VILLAGE_X, Island.VILLAGE_Z, 330));
    for (double[][] path : Island.PATHS) {
      decals.path(path).forEach(decal -> lay(flat, decal));
    }
  }

  private void put(List<Prop> list, Model model, double x, double up, double z, double scale) {
    Matrix place = Matrix.scaling(scale, scale, scale).then(Village.standing(x, up, z));
    list.add(new Prop(model, place, x, z, nearestLamps(x, z)));
  }

  /** Puts something on the ground. */
  private void stand(List<Prop> list, Model model, double x, double z, double scale) {
    put(list, model, x, Island.height(x, z), z, scale);
  }

  private void lay(List<Prop> list, Decals.Decal decal) {
    put(list, maker.apply(decal.mesh()), decal.x(), 0, decal.z(), 1);
  }

  /** The numbers of the lamps whose light is nearest to a place, at most four. */
  int[] nearestLamps(double x, double z) {
    return IntStream.range(0, lamps.size())
        .boxed()
        .sorted(Comparator.comparingDouble(i -> lamps.get(i).beyondLight(x, z)))
        .limit(4)
        .mapToInt(i -> i)
        .toArray();
  }

  private void placeLamps() {
    double x = Island.VILLAGE_X;
    double z = Island.VILLAGE_Z;
    lamps.add(new Lamp(x, Island.height(x, z) + 90, z, 720, FLAME, 1));
    double mound = Island.height(Island.MOUND_X, Island.MOUND_Z);
    lamps.add(new Lamp(Island.MOUND_X, mound + 210, Island.MOUND_Z - 60, 620, UNEARTHLY, 0.4));
    glow(x, z, 620, FLAME);
    glow(Island.MOUND_X, Island.MOUND_Z, 560, UNEARTHLY);
    double[][] posts = {
      {300, -190}, {690, -360}, {-490, -800}, {-350, -1420}, {-1010, 60}, {-20, -330}, {1010, -215}, {-340, -2010}
    };
    Model post = maker.apply(Carpentry.lampPost());
    Model dark = maker.apply(Carpentry.lampGlass(false));
    Model lit = maker.apply(Carpentry.lampGlass(true));
    for (double[] p : posts) {
      double ground = Island.height(p[0], p[1]);
      lamps.add(new Lamp(p[0], ground + 196, p[1], 360, WARM, 0.15));
      glow(p[0], p[1], 330, WARM);
    }
    for (double[] p : posts) {
      double ground = Island.height(p[0], p[1]);
      put(props, post, p[0], ground, p[1], 1);
      put(windows, dark, p[0], ground, p[1], 1);
      put(litWindows, lit, p[0], ground, p[1], 1);
    }
  }

  private void glow(double x, double z, double radius, int rgb) {
    lay(glows, decals.glow(x, z, radius, rgb));
  }

  private void placeHouses() {
    double[] turns = {30, 84, 138, 196, 250, 318};
    for (int i = 0; i < turns.length; i++) {
      double angle = Math.toRadians(turns[i]);
      double far = 690 + 60 * Noise.hash(i + 401);
      double x = Island.VILLAGE_X + far * Math.cos(angle);
      double z = Island.VILLAGE_Z + far * Math.sin(angle);
      double up = Island.height(x, z);
      // The door looks along minus z of the mesh, here towards the fire.
      double facing = Math.atan2(x - Island.VILLAGE_X, z - Island.VILLAGE_Z);
      put(props, maker.apply(Carpentry.hut(i, facing, false, false)), x, up, z, 1);
      put(windows, maker.apply(Carpentry.hut(i, facing, true, false)), x, up, z, 1);
      put(litWindows, maker.apply(Carpentry.hut(i, facing, true, true)), x, up, z, 1);
      lay(shadows, decals.shadow(x, z, 330));
      double cx = Carpentry.width(i) * 0.28;
      double cz = 40;
      chimneys.add(new double[] {
        x + cx * Math.cos(facing) + cz * Math.sin(facing), up + 515, z - cx * Math.sin(facing) + cz * Math.cos(facing)
      });
    }
    double x = Island.VILLAGE_X;
    double z = Island.VILLAGE_Z;
    stand(props, maker.apply(Carpentry.hearth()), x, z, 1);
    stand(props, maker.apply(Carpentry.mill()), Island.MILL_X, Island.MILL_Z, 1);
    lay(shadows, decals.shadow(Island.MILL_X, Island.MILL_Z, 260));
  }

  private void placeGate() {
    double x = Island.MOUND_X;
    double z = Island.MOUND_Z;
    double up = Island.height(x, z);
    put(props, maker.apply(Carpentry.gate(false)), x, up, z, 1);
    for (int i = 0; i < 9; i++) {
      double angle = 2 * Math.PI * (i + 0.5) / 9 + 0.5;
      double px = x + 330 * Math.cos(angle);
      double pz = z + 330 * Math.sin(angle);
      if (Island.pathDistance(px, pz) > 70) {
        stand(props, maker.apply(Carpentry.column(i)), px, pz, 1);
        lay(shadows, decals.shadow(px, pz, 80));
      }
    }
  }

  private void placeWaterside() {
    put(props, maker.apply(Carpentry.bridge(BRIDGE)), 488, 88, Island.BRIDGE_Z, 1);
    double pierZ = -1750;
    while (Island.height(-330, pierZ) > 44 && pierZ > -3000) {
      pierZ -= 20;
    }
    put(props, maker.apply(Carpentry.pier(560)), -330, 0, pierZ + 60, 1);
    // Rocks around the spring of the fall.
    for (int i = 0; i < 5; i++) {
      double x = Island.FALL_X - 96 + 48 * i;
      double z = 1600 - 10 * Math.abs(i - 2);
      put(props, maker.apply(Carpentry.boulder(i + 70)), x, Island.height(x, z) + 14, z, 0.8 + 0.5 * Noise.hash(i + 570));
    }
    for (int i = 0; i < 26; i++) {
      double angle = 2 * Math.PI * Noise.hash(i + 500);
      double far = 1700 + 1200 * Noise.hash(i + 530);
      double x = far * Math.cos(angle);
      double z = far * Math.sin(angle);
      double shore = Island.inland(x, z);
      if (shore > -260 && shore < 420 && Island.riverDistance(x, z) > 150 && Math.abs(x + 330) > 200) {
        stand(props, maker.apply(Carpentry.boulder(i)), x, z, 0.8 + 1.1 * Noise.hash(i + 560));
      }
    }
    for (int i = 0; i < 16; i++) {
      double[] p = Island.RIVER.get(1 + i * 3 % (Island.RIVER.size() - 24));
      double side = (i % 2 == 0 ? 1 : -1) * (118 + 40 * Noise.hash(i + 580));
      double x = p[0] + side;
      stand(props, maker.apply(Carpentry.boulder(i + 40)), x, p[1], 0.45 + 0.5 * Noise.hash(i + 590));
    }
  }

  private void placeTrees() {
    List<Model> conifers = new ArrayList<>();
    List<Model> broadleaves = new ArrayList<>();
    List<Model> bushes = new ArrayList<>();
    for (int i = 0; i < 5; i++) {
      conifers.add(maker.apply(Carpentry.conifer(i)));
      broadleaves.add(maker.apply(Carpentry.broadleaf(i)));
      bushes.add(maker.apply(Carpentry.bush(i)));
    }
    List<double[]> taken = new ArrayList<>();
    for (int i = 0; i < 2600 && taken.size() < 190; i++) {
      double x = -2700 + 5400 * Noise.hash(i * 2 + 2000);
      double z = -2500 + 5000 * Noise.hash(i * 2 + 2001);
      double up = Island.height(x, z);
      double wood = Noise.smooth(97, x / 520 + 60, z / 520 + 60);
      boolean free =
          up > 46 && up < 800 && Island.slope(x, z) < 0.62 && Island.pathDistance(x, z) > 130
              && Island.riverDistance(x, z) > 190 && Math.hypot(x - Island.VILLAGE_X, z - Island.VILLAGE_Z) > 960
              && Math.hypot(x - Island.MOUND_X, z - Island.MOUND_Z) > (z < Island.MOUND_Z ? 820 : 480)
              && Math.hypot(x - Island.MILL_X, z - Island.MILL_Z) > 300
              && wood > (z < -900 ? 0.50 : 0.36)
              && Pilot.wayDistance(x, z) > 230
              && (z > -1150 || Math.abs(x + 50) > 950)
              && taken.stream().noneMatch(p -> Math.hypot(p[0] - x, p[1] - z) < 135);
      if (!free) {
        continue;
      }
      taken.add(new double[] {x, z});
      double scale = 0.62 + 0.38 * Noise.hash(i + 9000);
      boolean conifer = up > 230 || wood > 0.60 || x < -900 && Noise.hash(i + 9100) > 0.4;
      put(props, (conifer ? conifers : broadleaves).get(i % 5), x, up, z, scale);
      lay(shadows, decals.shadow(x, z, (conifer ? 135 : 165) * scale));
    }
    for (int i = 0; i < 60; i++) {
      double x = -1900 + 3800 * Noise.hash(i * 2 + 6000);
      double z = -2100 + 3300 * Noise.hash(i * 2 + 6001);
      double up = Island.height(x, z);
      if (up > 40 && Island.slope(x, z) < 0.7 && Island.pathDistance(x, z) > 60 && Island.riverDistance(x, z) > 120
          && Math.hypot(x - Island.VILLAGE_X, z - Island.VILLAGE_Z) > 330) {
        put(props, bushes.get(i % 5), x, up, z, 0.7 + 0.3 * Noise.hash(i + 6500));
      }
    }
  }
}
