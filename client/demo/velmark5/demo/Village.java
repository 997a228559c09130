package velmark5.demo;

import java.util.ArrayList;
import java.util.Comparator;
import java.util.List;
import java.util.stream.IntStream;
import velmark5.Colour;
import velmark5.Matrix;
import velmark5.MemoryPool;
import velmark5.Mesh;
import velmark5.Model;
import velmark5.ModelSettings;
import velmark5.PointLight;
import velmark5.ThreadResource;
import velmark5.Toolkit;

/** The island and all that stands, flows and moves on it. */
final class Village implements Scene {
  static final double FIELD_OF_VIEW = Math.toRadians(48);

  private static final double NEAR = 40;
  private static final double FAR = 9500;
  private static final int FOG_BEGINS = 2900;

  /** Shadows farther away are too small to be missed. */
  private static final double SHADOWS_END = 3000;

  private static final double BRIDGE = 440;
  private static final int FLAME = 0xFF9A3C;
  private static final int WARM = 0xFFC070;
  private static final int UNEARTHLY = 0x50C8FF;

  private final Toolkit toolkit;
  private final MemoryPool pool;
  private final ThreadResource resource;
  private final Pilot pilot;
  private final Daylight day;

  private final List<Lamp> lamps = new ArrayList<>();
  private final List<Prop> props = new ArrayList<>();
  private final List<Prop> windows = new ArrayList<>();
  private final List<Prop> litWindows = new ArrayList<>();
  private final List<Prop> flat = new ArrayList<>();
  private final List<Prop> shadows = new ArrayList<>();
  private final List<Prop> glows = new ArrayList<>();
  private final List<double[]> chimneys = new ArrayList<>();
  private final List<LitPatch> land = new ArrayList<>();
  private final List<Patch> sea = new ArrayList<>();
  private final List<Patch> river = new ArrayList<>();
  private final Model fall;
  private final Decals decals;
  private final Model sails;
  private final Model boat;
  private final Model flames;
  private final Model veil;
  private final Model wing;
  private final Model leg;
  private final List<Model> robes = new ArrayList<>();
  private final List<Model> smoke = new ArrayList<>();
  private final List<Model> spray = new ArrayList<>();
  private int width;
  private int height;
  private List<PointLight> burning = List.of();

  /** A light of the night. */
  private record Lamp(double x, double up, double z, int range, int colour, double flicker) {}

  /** What stands still, and the numbers of the lamps that are nearest to it. */
  private record Prop(Model model, Matrix place, double x, double z, int[] lamps) {}

  private record LitPatch(Patch patch, int[] lamps) {}

  private record Puff(Model model, double size, double x, double up, double z) {}

  Village(Toolkit toolkit, MemoryPool pool, Pilot pilot, Daylight day) {
    this.toolkit = toolkit;
    this.pool = pool;
    this.pilot = pilot;
    this.day = day;
    resource = toolkit.createThreadResource();
    Terrain terrain = new Terrain();
    decals = new Decals(terrain);
    Waters.sea().forEach(shape -> sea.add(new Patch(this::model, shape)));
    Waters.river().forEach(shape -> river.add(new Patch(this::model, shape)));
    fall = model(Waters.fall());
    sails = model(Carpentry.sails());
    boat = model(Carpentry.boat());
    flames = model(Carpentry.flames());
    veil = model(Carpentry.gate(true));
    wing = model(Carpentry.wing());
    leg = model(Carpentry.leg());
    for (int robe : new int[] {0x8A3A34, 0x34548A, 0x5A7A3A}) {
      robes.add(model(Carpentry.wanderer(robe)));
    }
    for (int thinness = 0; thinness < 3; thinness++) {
      smoke.add(model(Carpentry.puff(0xE4E0DC, thinness)));
      spray.add(model(Carpentry.puff(0xFFFFFF, thinness)));
    }
    placeLamps();
    placeHouses();
    placeGate();
    placeWaterside();
    placeTrees();
    for (Patch.Shape shape : terrain.patches()) {
      Patch patch = new Patch(this::model, shape);
      land.add(new LitPatch(patch, nearestLamps(patch.middleX(), patch.middleZ())));
    }
    decals.riverBed().forEach(decal -> lay(flat, decal));
    lay(flat, decals.square(Island.VILLAGE_X, Island.VILLAGE_Z, 330));
    for (double[][] path : Island.PATHS) {
      decals.path(path).forEach(decal -> lay(flat, decal));
    }
  }

  private Model model(Mesh mesh) {
    return toolkit.createModel(pool, mesh, ModelSettings.STANDARD);
  }

  private static Matrix standing(double x, double up, double z) {
    return Matrix.translation(x, -up, z);
  }

  private void put(List<Prop> list, Model model, double x, double up, double z, double scale) {
    Matrix place = Matrix.scaling(scale, scale, scale).then(standing(x, up, z));
    list.add(new Prop(model, place, x, z, nearestLamps(x, z)));
  }

  private void lay(List<Prop> list, Decals.Decal decal) {
    put(list, model(decal.mesh()), decal.x(), 0, decal.z(), 1);
  }

  private int[] nearestLamps(double x, double z) {
    return IntStream.range(0, lamps.size())
        .boxed()
        .sorted(Comparator.comparingDouble(i -> Math.hypot(lamps.get(i).x - x, lamps.get(i).z - z) - lamps.get(i).range))
        .limit(4)
        .mapToInt(i -> i)
        .toArray();
  }

  private void placeLamps() {
    double x = Island.VILLAGE_X;
    double z = Island.VILLAGE_Z;
    lamps.add(new Lamp(x, Island.height(x, z) + 90, z, 720, FLAME, 1));
    lamps.add(new Lamp(Island.MOUND_X, Island.height(Island.MOUND_X, Island.MOUND_Z) + 210, Island.MOUND_Z - 60, 620, UNEARTHLY, 0.4));
    glow(x, z, 620, FLAME);
    glow(Island.MOUND_X, Island.MOUND_Z, 560, UNEARTHLY);
    double[][] posts = {{300, -190}, {690, -360}, {-490, -800}, {-350, -1420}, {-1010, 60}, {-20, -330}, {1010, -215}, {-340, -2010}};
    Model post = model(Carpentry.lampPost());
    Model dark = model(Carpentry.lampGlass(false));
    Model lit = model(Carpentry.lampGlass(true));
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
      put(props, model(Carpentry.hut(i, facing, false, false)), x, up, z, 1);
      put(windows, model(Carpentry.hut(i, facing, true, false)), x, up, z, 1);
      put(litWindows, model(Carpentry.hut(i, facing, true, true)), x, up, z, 1);
      lay(shadows, decals.shadow(x, z, 330));
      double cx = Carpentry.width(i) * 0.28;
      double cz = 40;
      chimneys.add(new double[] {
        x + cx * Math.cos(facing) + cz * Math.sin(facing), up + 515, z - cx * Math.sin(facing) + cz * Math.cos(facing)
      });
    }
    double x = Island.VILLAGE_X;
    double z = Island.VILLAGE_Z;
    put(props, model(Carpentry.hearth()), x, Island.height(x, z), z, 1);
    put(props, model(Carpentry.mill()), Island.MILL_X, Island.height(Island.MILL_X, Island.MILL_Z), Island.MILL_Z, 1);
    lay(shadows, decals.shadow(Island.MILL_X, Island.MILL_Z, 260));
  }

  private void placeGate() {
    double x = Island.MOUND_X;
    double z = Island.MOUND_Z;
    double up = Island.height(x, z);
    put(props, model(Carpentry.gate(false)), x, up, z, 1);
    for (int i = 0; i < 9; i++) {
      double angle = 2 * Math.PI * (i + 0.5) / 9 + 0.5;
      double px = x + 330 * Math.cos(angle);
      double pz = z + 330 * Math.sin(angle);
      if (Island.pathDistance(px, pz) > 70) {
        put(props, model(Carpentry.column(i)), px, Island.height(px, pz), pz, 1);
        lay(shadows, decals.shadow(px, pz, 80));
      }
    }
  }

  private void placeWaterside() {
    put(props, model(Carpentry.bridge(BRIDGE)), 488, 88, Island.BRIDGE_Z, 1);
    double pierZ = -1750;
    while (Island.height(-330, pierZ) > 44 && pierZ > -3000) {
      pierZ -= 20;
    }
    put(props, model(Carpentry.pier(560)), -330, 0, pierZ + 60, 1);
    // Rocks around the spring of the fall.
    for (int i = 0; i < 5; i++) {
      double x = Island.FALL_X - 96 + 48 * i;
      double z = 1600 - 10 * Math.abs(i - 2);
      put(props, model(Carpentry.boulder(i + 70)), x, Island.height(x, z) + 14, z, 0.8 + 0.5 * Noise.hash(i + 570));
    }
    for (int i = 0; i < 26; i++) {
      double angle = 2 * Math.PI * Noise.hash(i + 500);
      double far = 1700 + 1200 * Noise.hash(i + 530);
      double x = far * Math.cos(angle);
      double z = far * Math.sin(angle);
      double shore = Island.inland(x, z);
      if (shore > -260 && shore < 420 && Island.riverDistance(x, z) > 150 && Math.abs(x + 330) > 200) {
        put(props, model(Carpentry.boulder(i)), x, Island.height(x, z), z, 0.8 + 1.1 * Noise.hash(i + 560));
      }
    }
    for (int i = 0; i < 16; i++) {
      double[] p = Island.RIVER.get(1 + i * 3 % (Island.RIVER.size() - 24));
      double side = (i % 2 == 0 ? 1 : -1) * (118 + 40 * Noise.hash(i + 580));
      double x = p[0] + side;
      put(props, model(Carpentry.boulder(i + 40)), x, Island.height(x, p[1]), p[1], 0.45 + 0.5 * Noise.hash(i + 590));
    }
  }

  private void placeTrees() {
    List<Model> conifers = new ArrayList<>();
    List<Model> broadleaves = new ArrayList<>();
    List<Model> bushes = new ArrayList<>();
    for (int i = 0; i < 5; i++) {
      conifers.add(model(Carpentry.conifer(i)));
      broadleaves.add(model(Carpentry.broadleaf(i)));
      bushes.add(model(Carpentry.bush(i)));
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

  static Matrix projection(int width, int height) {
    return Matrix.perspective(FIELD_OF_VIEW, width / (double) height, NEAR, FAR);
  }

  @Override
  public void resize(int newWidth, int newHeight) {
    width = newWidth;
    height = newHeight;
  }

  @Override
  public void paint(double seconds) {
    toolkit.clearDepth();
    toolkit.resetViewport();
    toolkit.setDepthRange(0, 1);
    toolkit.setProjection(projection(width, height));
    toolkit.setCamera(pilot.camera());
    toolkit.setFog(day.horizon() & 0xFFFFFF, (int) FAR - FOG_BEGINS);
    toolkit.setAmbient((float) day.ambient());
    toolkit.setSun(day.sun());
    burn(seconds);
    resource.begin();
    // The nearest first: what they hide costs little.
    props.sort(Comparator.comparingDouble(prop -> distance(prop.x, prop.z)));
    props.forEach(this::draw);
    (day.night() > 0.35 ? litWindows : windows).forEach(this::draw);
    drawMill(seconds);
    drawWanderers(seconds);
    drawBoats(seconds);
    if (day.night() < 0.6) {
      drawBirds(seconds);
    }
    land.sort(Comparator.comparingDouble(part -> distance(part.patch.middleX(), part.patch.middleZ())));
    for (LitPatch part : land) {
      light(part.lamps);
      part.patch.draw(resource, pilot.heading(), 0);
    }
    flat.forEach(this::draw);
    toolkit.setPointLights(List.of());
    for (Prop shadow : shadows) {
      if (distance(shadow.x, shadow.z) < SHADOWS_END) {
        resource.draw(shadow.model, shadow.place);
      }
    }
    if (day.night() > 0.35) {
      glows.forEach(glow -> resource.draw(glow.model, glow.place));
    }
    sea.forEach(part -> part.draw(resource, pilot.heading(), 3 * Math.sin(seconds * 0.8)));
    river.forEach(part -> part.draw(resource, pilot.heading(), 0));
    resource.draw(fall, Matrix.IDENTITY);
    double up = Island.height(Island.MOUND_X, Island.MOUND_Z);
    resource.draw(veil, standing(Island.MOUND_X, up, Island.MOUND_Z));
    double fire = 1 + 0.12 * Math.sin(seconds * 11);
    resource.draw(
        flames,
        Matrix.scaling(1, fire, 1)
            .then(Matrix.rotationY(seconds * 0.7))
            .then(standing(Island.VILLAGE_X, Island.height(Island.VILLAGE_X, Island.VILLAGE_Z), Island.VILLAGE_Z)));
    drawPuffs(seconds);
    resource.end();
  }

  private double distance(double x, double z) {
    return Math.hypot(x - pilot.x(), z - pilot.z());
  }

  /** The lamps as they burn now; none by day. */
  private void burn(double seconds) {
    double night = day.night();
    List<PointLight> lights = new ArrayList<>();
    for (int i = 0; i < lamps.size() && night > 0.05; i++) {
      Lamp lamp = lamps.get(i);
      double flicker = 1 - lamp.flicker * 0.22 * (0.5 + 0.5 * Math.sin(seconds * (9 + i) + i * 2) * Math.sin(seconds * 5.3 + i));
      lights.add(
          new PointLight(
              (int) lamp.x, (int) -lamp.up, (int) lamp.z, lamp.range, lamp.colour, (float) (night * flicker)));
    }
    burning = lights;
  }

  private void draw(Prop prop) {
    light(prop.lamps);
    resource.draw(prop.model, prop.place);
  }

  private void light(int[] numbers) {
    if (!burning.isEmpty()) {
      List<PointLight> near = new ArrayList<>(numbers.length);
      for (int number : numbers) {
        near.add(burning.get(number));
      }
      toolkit.setPointLights(near);
    } else {
      toolkit.setPointLights(List.of());
    }
  }

  private void drawMill(double seconds) {
    resource.draw(
        sails,
        Matrix.rotationZ(seconds * 0.7)
            .then(standing(Island.MILL_X, Island.height(Island.MILL_X, Island.MILL_Z) + 538, Island.MILL_Z - 190)));
  }

  private void drawWanderers(double seconds) {
    light(new int[] {0, 1, 2, 3});
    for (int i = 0; i < robes.size(); i++) {
      double pace = seconds / 70 + 0.24 + i * 0.31;
      double[] p = Island.walk(pace - Math.floor(pace));
      double ground = Island.height(p[0], p[1]);
      double across = p[0] - 488;
      if (Math.abs(across) < BRIDGE / 2 && Math.abs(p[1] - Island.BRIDGE_Z) < 60) {
        ground = Math.max(ground, 88 + Carpentry.arch(across, BRIDGE));
      }
      double stride = Math.sin(seconds * 6 + i);
      Matrix place =
          Matrix.scaling(0.84, 0.84, 0.84)
              .then(Matrix.rotationY(p[2]))
              .then(standing(p[0], ground + 2 * Math.abs(stride), p[1]));
      resource.draw(robes.get(i), place);
      for (int side = -1; side <= 1; side += 2) {
        resource.draw(leg, Matrix.rotationX(0.5 * stride * side).then(Matrix.translation(13 * side, -72, 0)).then(place));
      }
    }
  }

  private void drawBoats(double seconds) {
    double sway = Math.sin(seconds * 1.1);
    for (int i = 0; i < 4; i++) {
      double angle = -1.75 + i * 0.62 + seconds * 0.006 * (i % 2 == 0 ? 1 : -1);
      double far = i == 0 ? 2350 : 3150 + 130 * Math.sin(i * 4.0);
      double x = i == 0 ? -560 : far * Math.cos(angle);
      double z = i == 0 ? -2560 : far * Math.sin(angle);
      resource.draw(
          boat,
          Matrix.rotationZ(0.05 * sway)
              .then(Matrix.rotationY(i * 1.9 + 0.1 * sway))
              .then(standing(x, 6 + 5 * Math.sin(seconds * 1.3 + i), z)));
    }
  }

  private void drawBirds(double seconds) {
    for (int i = 0; i < 9; i++) {
      double t = seconds * 0.13 + i * 0.09 + (i % 3) * 1.9;
      double far = 480 + 130 * (i % 3) + 25 * i;
      double flap = 0.55 * Math.sin(seconds * 7 + i * 1.3) + 0.12;
      Matrix place =
          Matrix.scaling(0.75, 0.75, 0.75)
              .then(Matrix.rotationY(-t))
              .then(standing(100 + far * Math.cos(t), 780 + 60 * (i % 3) + 14 * Math.sin(seconds + i), 200 + far * Math.sin(t)));
      resource.draw(wing, Matrix.rotationZ(-flap).then(place));
      resource.draw(wing, Matrix.rotationZ(-flap).then(Matrix.scaling(1, 1, -1)).then(Matrix.rotationY(Math.PI)).then(place));
    }
  }

  /** Puffs turn to the camera and cover what is drawn after them, so the farthest comes first. */
  private void drawPuffs(double seconds) {
    List<Puff> puffs = new ArrayList<>();
    for (double[] chimney : chimneys) {
      for (int k = 0; k < 7; k++) {
        double life = seconds * 0.10 + k / 7.0 + chimney[0] * 0.013;
        life -= Math.floor(life);
        puffs.add(
            new Puff(
                smoke.get(Math.min(2, (int) (life * 3))), 0.35 + 1.3 * life, chimney[0] + 150 * life * life,
                chimney[1] + 15 + 250 * life, chimney[2] + 30 * life));
      }
    }
    for (int k = 0; k < 16; k++) {
      double life = seconds * 0.3 + Noise.hash(k + 800);
      life -= Math.floor(life);
      puffs.add(
          new Puff(
              spray.get(Math.min(2, (int) (life * 3))), 0.7 + 1.3 * life,
              Island.FALL_X + 220 * (Noise.hash(k + 820) - 0.5), 100 + 80 * life,
              1215 - 60 * Noise.hash(k + 840) - 60 * life));
    }
    puffs.sort(Comparator.comparingDouble(puff -> -distance(puff.x, puff.z)));
    Matrix facing = Matrix.rotationY(pilot.heading());
    for (Puff puff : puffs) {
      resource.draw(
          puff.model, Matrix.scaling(puff.size, puff.size, puff.size).then(facing).then(standing(puff.x, puff.up, puff.z)));
    }
  }

  /** A colour for a place on the map, 0xAARRGGBB. */
  static int mapColour(double x, double z) {
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
