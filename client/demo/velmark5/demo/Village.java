package velmark5.demo;

import java.util.ArrayList;
import java.util.Arrays;
import java.util.Comparator;
import java.util.List;
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


  private final Toolkit toolkit;
  private final MemoryPool pool;
  private final ThreadResource resource;
  private final Pilot pilot;
  private final Daylight day;

  private final Settlement here;
  private final List<LitPatch> land = new ArrayList<>();
  private final List<Patch> sea = new ArrayList<>();
  private final List<Patch> river = new ArrayList<>();
  private final Model fall;
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

  /** A patch of land, and the numbers of the lamps that are nearest to it. */
  private record LitPatch(Patch patch, int[] lamps) {}

  private record Puff(Model model, double size, double x, double up, double z) {}

  Village(Toolkit toolkit, MemoryPool pool, Pilot pilot, Daylight day) {
    this.toolkit = toolkit;
    this.pool = pool;
    this.pilot = pilot;
    this.day = day;
    resource = toolkit.createThreadResource();
    Terrain terrain = new Terrain();
    here = new Settlement(this::model, new Decals(terrain));
    for (Patch.Shape shape : terrain.patches()) {
      Patch patch = new Patch(this::model, shape);
      land.add(new LitPatch(patch, here.nearestLamps(patch.middleX(), patch.middleZ())));
    }
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
  }

  private Model model(Mesh mesh) {
    return toolkit.createModel(pool, mesh, ModelSettings.STANDARD);
  }

  /** The matrix that moves a model to a place at a height above the sea. */
  static Matrix standing(double x, double up, double z) {
    return Matrix.translation(x, -up, z);
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
    here.props.sort(Comparator.comparingDouble(prop -> distance(prop.x(), prop.z())));
    here.props.forEach(this::draw);
    (day.night() > 0.35 ? here.litWindows : here.windows).forEach(this::draw);
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
    here.flat.forEach(this::draw);
    toolkit.setPointLights(List.of());
    for (Settlement.Prop shadow : here.shadows) {
      if (distance(shadow.x(), shadow.z()) < SHADOWS_END) {
        resource.draw(shadow.model(), shadow.place());
      }
    }
    if (day.night() > 0.35) {
      here.glows.forEach(glow -> resource.draw(glow.model(), glow.place()));
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
    for (int i = 0; i < here.lamps.size() && night > 0.05; i++) {
      Settlement.Lamp lamp = here.lamps.get(i);
      double waves = Math.sin(seconds * (9 + i) + i * 2) * Math.sin(seconds * 5.3 + i);
      double flicker = 1 - lamp.flicker() * 0.22 * (0.5 + 0.5 * waves);
      lights.add(
          new PointLight(
              (int) lamp.x(), (int) -lamp.up(), (int) lamp.z(), lamp.range(), lamp.colour(), (float) (night * flicker)));
    }
    burning = lights;
  }

  private void draw(Settlement.Prop prop) {
    light(prop.lamps());
    resource.draw(prop.model(), prop.place());
  }

  private void light(int[] numbers) {
    toolkit.setPointLights(
        burning.isEmpty() ? burning : Arrays.stream(numbers).mapToObj(burning::get).toList());
  }

  /** Light for those who walk right under the lamps, which would blind them: from farther up, and weaker. */
  private void lightWalkers() {
    toolkit.setPointLights(
        burning.stream()
            .limit(4)
            .map(l -> new PointLight(l.x(), l.y() - 130, l.z(), l.range(), l.colour(), 0.35f * l.strength()))
            .toList());
  }

  private void drawMill(double seconds) {
    resource.draw(
        sails,
        Matrix.rotationZ(seconds * 0.7)
            .then(standing(Island.MILL_X, Island.height(Island.MILL_X, Island.MILL_Z) + 538, Island.MILL_Z - 190)));
  }

  private void drawWanderers(double seconds) {
    lightWalkers();
    for (int i = 0; i < robes.size(); i++) {
      double pace = seconds / 70 + 0.24 + i * 0.31;
      double[] p = Island.walk(pace - Math.floor(pace));
      double ground = Island.height(p[0], p[1]);
      double across = p[0] - 488;
      if (Math.abs(across) < Settlement.BRIDGE / 2 && Math.abs(p[1] - Island.BRIDGE_Z) < 60) {
        ground = Math.max(ground, 88 + Carpentry.arch(across, Settlement.BRIDGE));
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
      double up = 780 + 60 * (i % 3) + 14 * Math.sin(seconds + i);
      Matrix place =
          Matrix.scaling(0.75, 0.75, 0.75)
              .then(Matrix.rotationY(-t))
              .then(standing(100 + far * Math.cos(t), up, 200 + far * Math.sin(t)));
      resource.draw(wing, Matrix.rotationZ(-flap).then(place));
      Matrix other = Matrix.scaling(1, 1, -1).then(Matrix.rotationY(Math.PI)).then(place);
      resource.draw(wing, Matrix.rotationZ(-flap).then(other));
    }
  }

  /** Puffs turn to the camera and cover what is drawn after them, so the farthest comes first. */
  private void drawPuffs(double seconds) {
    List<Puff> puffs = new ArrayList<>();
    for (double[] chimney : here.chimneys) {
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
}
