package velmark5;

import static org.junit.jupiter.api.Assertions.assertArrayEquals;
import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertFalse;
import static org.junit.jupiter.api.Assertions.assertThrows;
import static org.junit.jupiter.api.Assertions.assertTrue;

import java.util.ArrayList;
import java.util.Arrays;
import java.util.EnumSet;
import java.util.List;
import java.util.Set;
import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;

/** Models: where they appear, what hides what, light and textures, what is refused, and how they end. */
@Tag("headless")
class ModelTest {
  private static final int SIDE = 64;
  private static final Rect ALL = new Rect(0, 0, SIDE, SIDE);
  private static final Material WHITE = Material.of(Hsl.of(0, 0, 0.9));
  private static final Material BLUE = Material.of(Hsl.of(2 / 3.0, 1, 0.4));

  private static final int SCROLLING = 1;

  private final List<Integer> asked = new ArrayList<>();
  private int[] texels = new int[128 * 128];
  private Toolkit toolkit;
  private MemoryPool pool;
  private ThreadResource resource;

  @BeforeEach
  void open() {
    Arrays.fill(texels, 0xFF00FF00);
    toolkit = Toolkit.create(new TextureSource() {
      @Override
      public TextureMetrics metrics(int id) {
        return id == SCROLLING ? TextureMetrics.PLAIN.withScroll(0, 32) : TextureMetrics.PLAIN;
      }

      @Override
      public int[] pixels(int id) {
        asked.add(id);
        return texels;
      }
    }, 4);
    pool = toolkit.createPool(1 << 16);
    resource = toolkit.createThreadResource();
    toolkit.drawTo(toolkit.createSprite(SIDE, SIDE), toolkit.createDepthBuffer(SIDE, SIDE));
    toolkit.setDepthRange(0, 1);
    toolkit.setProjection(Matrix.perspective(Math.PI / 2, 1, 10, 1000));
    toolkit.setCamera(Matrix.lookAt(0, 0, -100, 0, 0, 0));
    toolkit.setFog(0, 0);
    toolkit.setAmbient(1.2f);
    toolkit.setSun(new Sun(0xFFFFFF, 0.7f, 0.7f, 0, -1, -1));
    toolkit.clearAll(0);
  }

  @AfterEach
  void close() {
    toolkit.close();
  }

  /** A square of 100 units that faces the camera at the start, so it covers the middle half of the view. */
  private Model square(Material material) {
    Mesh.Builder mesh = Mesh.builder();
    int a = mesh.vertex(-50, -50, 0);
    int b = mesh.vertex(-50, 50, 0);
    int c = mesh.vertex(50, 50, 0);
    int d = mesh.vertex(50, -50, 0);
    mesh.quad(a, b, c, d, material);
    return toolkit.createModel(pool, mesh.build(), ModelSettings.STANDARD);
  }

  private int at(int x, int y) {
    return toolkit.readArea(new Rect(x, y, 1, 1))[0];
  }

  @Test
  void aModelAppearsWhereTheCameraPutsIt() {
    resource.draw(square(WHITE), Matrix.IDENTITY);
    int[] pixels = toolkit.readArea(ALL);
    for (int y = 0; y < SIDE; y++) {
      for (int x = 0; x < SIDE; x++) {
        boolean edge = x == 15 || x == 16 || x == 47 || x == 48 || y == 15 || y == 16 || y == 47 || y == 48;
        boolean inside = x > 15 && x < 48 && y > 15 && y < 48;
        if (!edge) {
          assertEquals(inside, pixels[y * SIDE + x] != 0, "at " + x + ", " + y);
        }
      }
    }
    toolkit.clearAll(0);
    resource.draw(square(WHITE), Matrix.translation(0, -80, 0));
    assertTrue(at(32, 8) != 0 && at(32, 32) == 0, "up is negative");
    toolkit.clearAll(0);
    // From behind a face is not seen, nor behind the camera.
    resource.draw(square(WHITE), Matrix.rotationY(Math.PI));
    resource.draw(square(WHITE), Matrix.translation(0, 0, -300));
    assertArrayEquals(new int[SIDE * SIDE], toolkit.readArea(ALL));
  }

  @Test
  void theNearerModelHidesTheFarther() {
    Model white = square(WHITE);
    Model blue = square(BLUE);
    Matrix far = Matrix.translation(0, 0, 100);
    resource.draw(white, Matrix.IDENTITY);
    int near = at(32, 32);
    resource.draw(blue, far);
    assertEquals(near, at(32, 32));
    toolkit.clearAll(0);
    resource.draw(blue, far);
    int behind = at(32, 32);
    resource.draw(white, Matrix.IDENTITY);
    assertEquals(near, at(32, 32));
    assertTrue(Colour.blue(behind) > Colour.red(behind) + 40 && Colour.red(near) > 150, "blue behind white");
  }

  @Test
  void texturesAreAskedForWhenTheyAreSeen() {
    Model model = square(WHITE.textured(2, null));
    assertEquals(List.of(), asked);
    resource.draw(model, Matrix.translation(0, 0, -500));
    assertEquals(List.of(), asked, "nothing of it is in view");
    resource.draw(model, Matrix.IDENTITY);
    resource.draw(model, Matrix.translation(10, 0, 0));
    assertEquals(List.of(2), asked, "once, and then it is kept");
    int green = at(32, 32);
    assertTrue(Colour.green(green) > 100 && Colour.red(green) < 20, Integer.toHexString(green));

    texels = null;
    toolkit.clearAll(0);
    Model missing = square(WHITE.textured(3, null));
    resource.draw(missing, Matrix.IDENTITY);
    assertTrue(asked.contains(3));
    int plain = at(32, 32);
    assertTrue(Colour.green(plain) > 100 && Colour.red(plain) > 100, "white without its texture");
    texels = new int[128 * 128];
    Arrays.fill(texels, 0xFFFF0000);
    resource.draw(missing, Matrix.IDENTITY);
    int red = at(32, 32);
    assertTrue(Colour.red(red) > 100 && Colour.green(red) < 20, "it is asked for again");
  }

  @Test
  void distanceFogFadesToItsColour() {
    toolkit.setFog(0xFF00FF, 950);
    resource.draw(square(WHITE), Matrix.scaling(8, 8, 1).then(Matrix.translation(0, 0, 800)));
    int faded = at(32, 32);
    assertTrue(Colour.red(faded) > Colour.green(faded) + 60, Integer.toHexString(faded));
  }

  /** A pillar of 20 by 100 by 20 units that stands on its origin. */
  private static Mesh.Builder pillar(Material material) {
    Mesh.Builder mesh = Mesh.builder();
    int[][] rings = new int[2][];
    for (int i = 0; i < 2; i++) {
      int y = i == 0 ? 0 : -100;
      rings[i] = new int[] {
        mesh.vertex(-10, y, -10, i), mesh.vertex(10, y, -10, i), mesh.vertex(10, y, 10, i), mesh.vertex(-10, y, 10, i)
      };
    }
    for (int i = 0; i < 4; i++) {
      int next = (i + 1) % 4;
      mesh.quad(rings[0][i], rings[0][next], rings[1][next], rings[1][i], material);
    }
    return mesh;
  }

  @Test
  void whereAModelStands() {
    Model model = toolkit.createModel(pool, pillar(WHITE).build(), ModelSettings.STANDARD);
    // At a distance of 100, a unit is 0.32 pixels.
    ScreenPlacement place = resource.drawPlaced(model, Matrix.translation(50, 0, 0)).orElseThrow();
    assertEquals(48, place.topX(), 1);
    assertEquals(0, place.topY(), 1);
    assertEquals(48, place.bottomX(), 1);
    assertEquals(32, place.bottomY(), 1);
    assertEquals(15 * 0.32, place.radius(), 1);
    assertTrue(resource.drawPlaced(model, Matrix.translation(0, 0, -500)).isEmpty());
    assertTrue(resource.drawPlaced(model, Matrix.translation(500, 0, 0)).isEmpty());
    resource.draw(model, Matrix.IDENTITY);
    assertEquals(2, toolkit.takeModelCount(), "of this toolkit only");
    assertEquals(0, toolkit.takeModelCount());
    assertEquals(new ModelBounds(-10, 10, -100, 0, -10, 10, 15, 101), model.bounds());
    toolkit.drawToNothing();
    assertTrue(resource.drawPlaced(model, Matrix.IDENTITY).isEmpty(), "without a target nothing is drawn");
  }

  @Test
  void functionsOnlyShrink() {
    var all = EnumSet.allOf(ModelFunction.class);
    Mesh.Builder mesh = pillar(WHITE);
    mesh.face(0, 1, 5, BLUE.shaded(Shading.HIDDEN), Mesh.MAX_LABEL);
    Model model = toolkit.createModel(pool, mesh.build(), ModelSettings.STANDARD.allowing(all));
    assertEquals(all, model.functions());
    resource.draw(model, Matrix.IDENTITY);
    var few = EnumSet.of(ModelFunction.MOVE_Y, ModelFunction.ANIMATE_VERTICES);
    model.restrictFunctions(few);
    assertEquals(few, model.functions());
    String message = assertThrows(IllegalArgumentException.class, () -> model.restrictFunctions(all)).getMessage();
    assertEquals("Can't re-enable previously disabled functions", message);
    assertEquals(few, model.functions());
    model.restrictFunctions(EnumSet.noneOf(ModelFunction.class));
    assertEquals(Set.of(), model.functions());
    int before = toolkit.readArea(ALL)[32 * SIDE + 32];
    toolkit.clearAll(0);
    resource.draw(model, Matrix.IDENTITY);
    assertEquals(before, at(32, 32), "it still can be drawn");
  }

  @Test
  void lightFollowsTheSettings() {
    Model model = square(WHITE);
    assertEquals(128, model.ambient());
    assertEquals(768, model.contrast());
    toolkit.setAmbient(0.4f);
    resource.draw(model, Matrix.IDENTITY);
    int soft = Colour.green(at(32, 32));
    model.setContrast(400);
    toolkit.clearAll(0);
    resource.draw(model, Matrix.IDENTITY);
    assertTrue(Colour.green(at(32, 32)) > soft + 20, "a smaller contrast, a stronger sun");
    assertEquals(400, model.contrast());
    assertThrows(IllegalArgumentException.class, () -> model.setContrast(0));
    model.setAmbient(30);
    assertEquals(30, model.ambient());

    Model dim = toolkit.createModel(pool, pillar(WHITE).build(), ModelSettings.STANDARD.lit(40, 768));
    Model full = toolkit.createModel(pool, pillar(WHITE).build(), ModelSettings.STANDARD);
    resource.draw(dim, Matrix.translation(0, 40, -50));
    int dark = Colour.green(at(32, 32));
    toolkit.clearAll(0);
    resource.draw(full, Matrix.translation(0, 40, -50));
    int unlit = Colour.green(at(32, 32));
    assertTrue(unlit > dark + 20, "ambient level " + dark + " and " + unlit);
    toolkit.setPointLights(List.of(new PointLight(0, 0, -90, 60, 0xFF0000, 1)));
    resource.draw(full, Matrix.translation(0, 40, -60));
    int lamp = at(32, 32);
    assertTrue(Colour.red(lamp) > unlit + 20 && Math.abs(Colour.green(lamp) - unlit) < 4, "a red lamp");
  }

  @Test
  void translucencyAndScrolling() {
    Model plain = square(WHITE.textured(0, null));
    assertFalse(plain.isTranslucent() || plain.isAnimated());
    Model glass = square(WHITE.transparent(128));
    assertTrue(glass.isTranslucent());
    resource.draw(square(BLUE), Matrix.translation(0, 0, 50));
    int behind = at(32, 32);
    resource.draw(glass, Matrix.IDENTITY);
    int through = at(32, 32);
    assertTrue(Colour.red(through) > Colour.red(behind) + 30, "some of the glass");
    assertTrue(Colour.blue(through) > Colour.red(through) + 10, "some of what is behind it");
    resource.draw(square(WHITE.transparent(255)), Matrix.translation(0, 0, -20));
    assertEquals(through, at(32, 32), "invisible");

    // Green above red, one texture high, moves by half of its height each second.
    Arrays.fill(texels, 0, 64 * 128, 0xFF00FF00);
    Arrays.fill(texels, 64 * 128, 128 * 128, 0xFFFF0000);
    Model flowing = square(WHITE.textured(SCROLLING, new TextureMapping.Plane(0, 3, 1)));
    assertTrue(flowing.isAnimated());
    resource.draw(flowing, Matrix.IDENTITY);
    int first = at(32, 24);
    assertTrue(Colour.green(first) > 100 && Colour.red(at(32, 40)) > 100, "upright");
    toolkit.advance(1000);
    resource.draw(flowing, Matrix.translation(0, 0, -1));
    assertTrue(Colour.red(at(32, 24)) > 100 && Colour.green(at(32, 40)) > 100, "it has moved");
  }

  @Test
  void buildersRefuseWhatCannotBeBuilt() {
    Class<IllegalArgumentException> illegal = IllegalArgumentException.class;
    Mesh.Builder mesh = pillar(WHITE);
    assertThrows(illegal, () -> mesh.face(0, 1, 8, WHITE));
    assertThrows(illegal, () -> mesh.face(-1, 1, 2, WHITE));
    assertThrows(illegal, () -> mesh.face(0, 1, 2, WHITE, 256));
    assertThrows(illegal, () -> mesh.vertex(0, 0, 0, -2));
    assertThrows(illegal, () -> mesh.face(0, 1, 2, WHITE.textured(0, new TextureMapping.Plane(0, 1, 8))));
    assertThrows(illegal, () -> mesh.billboard(new Mesh.Billboard(8, 1, 1, 0, Mesh.NO_LABEL)));
    for (int i = 0; i < 255; i++) {
      mesh.face(0, 1, 2, WHITE.textured(0, new TextureMapping.Cube(i + 1)));
    }
    assertThrows(illegal, () -> mesh.face(0, 1, 2, WHITE.textured(0, new TextureMapping.Cube(256))));
    mesh.face(0, 1, 2, WHITE.textured(0, new TextureMapping.Cube(7)));
    Mesh built = mesh.build();
    assertEquals(255, built.mappings().size());
    assertEquals(8 + 255 + 1, built.faces().size());
    assertFalse(toolkit.createModel(pool, built, ModelSettings.STANDARD).isClosed());
    Mesh.Builder full = Mesh.builder();
    for (int i = 0; i < Mesh.LIMIT; i++) {
      full.vertex(i, 0, 0);
    }
    assertThrows(illegal, () -> full.vertex(0, 0, 0));
    assertThrows(illegal, () -> Material.of(65536));
    assertThrows(illegal, () -> WHITE.transparent(256));
    assertThrows(illegal, () -> new TextureMapping.Cube(0));
    assertThrows(illegal, () -> TextureMapping.Direction.towards(0, 0, 0));
    assertThrows(illegal, () -> ModelSettings.STANDARD.lit(128, 0));
    assertEquals(new TextureMapping.Direction(0, 32767, 0), TextureMapping.Direction.towards(0, 5, 0));
  }

  @Test
  void modelsEndInAnyOrder() {
    int empty = toolkit.allocatedBytes();
    Model model = square(WHITE);
    assertThrows(
        IllegalArgumentException.class, () -> square(WHITE.textured(9, null)), "a texture without metrics");
    resource.draw(model, Matrix.IDENTITY);
    assertTrue(toolkit.allocatedBytes() > empty);
    model.close();
    model.close();
    assertEquals(empty, toolkit.allocatedBytes());
    assertThrows(IllegalStateException.class, () -> resource.draw(model, Matrix.IDENTITY));
    assertThrows(IllegalStateException.class, model::bounds);

    Model orphan = square(WHITE);
    pool.close();
    assertThrows(IllegalStateException.class, () -> resource.draw(orphan, Matrix.IDENTITY));
    assertThrows(IllegalStateException.class, orphan::bounds);
    assertThrows(IllegalStateException.class, () -> square(WHITE));
    orphan.close();
    Model last = toolkit.createModel(toolkit.createPool(1 << 16), pillar(BLUE).build(), ModelSettings.STANDARD);
    resource.close();
    assertThrows(IllegalStateException.class, () -> resource.draw(last, Matrix.IDENTITY));
    toolkit.close();
    assertTrue(last.isClosed());
    assertThrows(IllegalStateException.class, last::functions);
  }

  /** Workers draw models of their own into parts of one target that do not touch. */
  @Test
  void workersDrawSideBySide() throws Exception {
    List<Thread> workers = new ArrayList<>();
    List<Throwable> failures = java.util.Collections.synchronizedList(new ArrayList<>());
    resource.draw(square(BLUE), Matrix.IDENTITY);
    int blue = at(32, 32);
    toolkit.clearAll(0);
    for (int i = 0; i < 4; i++) {
      Model model = square(BLUE);
      ThreadResource own = toolkit.createThreadResource();
      Matrix place = Matrix.scaling(0.4, 0.4, 1).then(Matrix.translation(i % 2 == 0 ? -50 : 50, i < 2 ? -50 : 50, 0));
      Thread worker = new Thread(() -> {
        own.begin();
        for (int k = 0; k < 200; k++) {
          own.draw(model, place);
        }
        own.end();
      });
      worker.setUncaughtExceptionHandler((thread, e) -> failures.add(e));
      workers.add(worker);
    }
    workers.forEach(Thread::start);
    for (Thread worker : workers) {
      worker.join();
    }
    assertEquals(List.of(), failures);
    for (int corner : new int[] {at(16, 16), at(48, 16), at(16, 48), at(48, 48)}) {
      assertEquals(blue, corner);
    }
    assertEquals(0, at(32, 32));
  }
}
