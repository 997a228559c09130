package velmark5;

import static org.junit.jupiter.api.Assertions.*;

import java.util.ArrayList;
import java.util.Arrays;
import java.util.EnumSet;
import java.util.List;
import java.util.Set;
import java.util.concurrent.CompletableFuture;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Test;

/** Models: where they appear, what hides what, light and textures, what is refused, and how they end. */
class ModelTest extends ToolkitTest {
  private static final int SIDE = 64;
  private static final Material WHITE = Material.of(Hsl.of(0, 0, 0.9));
  private static final Material BLUE = Material.of(Hsl.of(2 / 3.0, 1, 0.4));
  private static final int SCROLLING = 1;
  private static final Matrix HERE = Matrix.IDENTITY;

  private final List<Integer> asked = new ArrayList<>();
  private int[] texels = new int[128 * 128];
  private MemoryPool pool;
  private ThreadResource resource;

  @BeforeEach
  void open() {
    Arrays.fill(texels, 0xFF00FF00);
    toolkit.close();
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

  private Model model(Mesh.Builder mesh) {
    return toolkit.createModel(pool, mesh.build(), ModelSettings.STANDARD);
  }

  /** A square of 100 units that faces the camera at the start, so it covers the middle half of the view. */
  private Model square(Material material) {
    Mesh.Builder mesh = Mesh.builder();
    int a = mesh.vertex(-50, -50, 0);
    int b = mesh.vertex(-50, 50, 0);
    int c = mesh.vertex(50, 50, 0);
    int d = mesh.vertex(50, -50, 0);
    mesh.quad(a, b, c, d, material);
    return model(mesh);
  }

  /** A pillar of 20 by 100 by 20 units that stands on its origin. */
  private static Mesh.Builder pillar(Material material) {
    Mesh.Builder mesh = Mesh.builder();
    for (int i = 0; i < 2; i++) {
      for (int[] corner : new int[][] {{-10, -10}, {10, -10}, {10, 10}, {-10, 10}}) {
        mesh.vertex(corner[0], -100 * i, corner[1], i);
      }
    }
    for (int i = 0; i < 4; i++) {
      int next = (i + 1) % 4;
      mesh.quad(i, next, 4 + next, 4 + i, material);
    }
    return mesh;
  }

  private int middle() {
    return at(32, 32);
  }

  /** The middle pixel of a new frame of one model. */
  private int drawn(Model model, Matrix place) {
    toolkit.clearAll(0);
    resource.draw(model, place);
    return middle();
  }

  @Test
  void aModelAppearsWhereTheCameraPutsIt() {
    resource.draw(square(WHITE), HERE);
    int[] pixels = pixels();
    for (int i = 0; i < pixels.length; i++) {
      int far = Math.max(Math.abs(2 * (i % SIDE) - 63), Math.abs(2 * (i / SIDE) - 63));
      if (far < 31 || far > 33) { // on the edge, either will do
        assertEquals(far < 31, pixels[i] != 0, "at " + i % SIDE + ", " + i / SIDE);
      }
    }
    assertEquals(0, drawn(square(WHITE), Matrix.translation(0, -80, 0)));
    assertTrue(at(32, 8) != 0, "up is negative");
    assertEquals(0, drawn(square(WHITE), Matrix.rotationY(Math.PI)), "from behind");
    assertEquals(0, drawn(square(WHITE), Matrix.translation(0, 0, -300)), "behind the camera");
  }

  @Test
  void theNearerModelHidesTheFarther() {
    Model white = square(WHITE);
    Model blue = square(BLUE);
    Matrix far = Matrix.translation(0, 0, 100);
    int near = drawn(white, HERE);
    resource.draw(blue, far);
    assertEquals(near, middle());
    int behind = drawn(blue, far);
    resource.draw(white, HERE);
    assertEquals(near, middle());
    assertTrue(Colour.blue(behind) > Colour.red(behind) + 40 && Colour.red(near) > 150, "blue behind white");

    toolkit.setFog(0xFF00FF, 950);
    int faded = drawn(white, Matrix.scaling(8, 8, 1).then(Matrix.translation(0, 0, 800)));
    assertTrue(Colour.red(faded) > Colour.green(faded) + 60, "fog: " + Integer.toHexString(faded));
  }

  @Test
  void texturesAreAskedForWhenTheyAreSeen() {
    Model model = square(WHITE.textured(2, null));
    drawn(model, Matrix.translation(0, 0, -500));
    assertEquals(List.of(), asked, "nothing of it is in view");
    int green = drawn(model, HERE);
    drawn(model, Matrix.translation(10, 0, 0));
    assertEquals(List.of(2), asked, "once, and then it is kept");
    assertTrue(Colour.green(green) > 100 && Colour.red(green) < 20, Integer.toHexString(green));

    texels = null;
    Model missing = square(WHITE.textured(3, null));
    int plain = drawn(missing, HERE);
    assertTrue(Colour.green(plain) > 100 && Colour.red(plain) > 100, "white without its texture");
    texels = new int[128 * 128];
    Arrays.fill(texels, 0xFFFF0000);
    int red = drawn(missing, HERE);
    assertTrue(Colour.red(red) > 100 && Colour.green(red) < 20, "it is asked for again");
  }

  @Test
  void whereAModelStands() {
    Model model = model(pillar(WHITE));
    // At a distance of 100, a unit is 0.32 pixels.
    ScreenPlacement place = resource.drawPlaced(model, Matrix.translation(50, 0, 0)).orElseThrow();
    assertArrayEquals(new float[] {48, 0, 48, 32, 4.8f},
        new float[] {place.topX(), place.topY(), place.bottomX(), place.bottomY(), place.radius()}, 1);
    assertTrue(resource.drawPlaced(model, Matrix.translation(0, 0, -500)).isEmpty());
    assertTrue(resource.drawPlaced(model, Matrix.translation(500, 0, 0)).isEmpty());
    resource.draw(model, HERE);
    assertEquals(2, toolkit.takeModelCount(), "of this toolkit only");
    assertEquals(0, toolkit.takeModelCount());
    assertEquals(new ModelBounds(-10, 10, -100, 0, -10, 10, 15, 101), model.bounds());
    toolkit.drawToNothing();
    assertTrue(resource.drawPlaced(model, HERE).isEmpty(), "without a target nothing is drawn");
  }

  @Test
  void functionsOnlyShrink() {
    var all = EnumSet.allOf(ModelFunction.class);
    Mesh.Builder mesh = pillar(WHITE);
    mesh.face(0, 1, 5, BLUE.shaded(Shading.HIDDEN), Mesh.MAX_LABEL);
    Model model = toolkit.createModel(pool, mesh.build(), ModelSettings.STANDARD.allowing(all));
    assertEquals(all, model.functions());
    int before = drawn(model, HERE);
    var few = EnumSet.of(ModelFunction.MOVE_Y, ModelFunction.ANIMATE_VERTICES);
    model.restrictFunctions(few);
    refuses(IllegalArgumentException.class, "Can't re-enable previously disabled functions",
        () -> model.restrictFunctions(all));
    assertEquals(few, model.functions());
    model.restrictFunctions(EnumSet.noneOf(ModelFunction.class));
    assertEquals(Set.of(), model.functions());
    assertEquals(before, drawn(model, HERE), "it still can be drawn");
  }

  @Test
  void lightFollowsTheSettings() {
    Model model = square(WHITE);
    assertEquals(128 + 768, model.ambient() + model.contrast());
    toolkit.setAmbient(0.4f);
    int soft = Colour.green(drawn(model, HERE));
    model.setContrast(400);
    assertTrue(Colour.green(drawn(model, HERE)) > soft + 20, "a smaller contrast, a stronger sun");
    model.setAmbient(30);
    assertEquals(30 + 400, model.ambient() + model.contrast());
    refuses(IllegalArgumentException.class, () -> model.setContrast(0));

    Model dim = toolkit.createModel(pool, pillar(WHITE).build(), ModelSettings.STANDARD.lit(40, 768));
    Model full = model(pillar(WHITE));
    Matrix close = Matrix.translation(0, 40, -50);
    int unlit = Colour.green(drawn(full, close));
    assertTrue(unlit > Colour.green(drawn(dim, close)) + 20, "ambient level");
    toolkit.setPointLights(List.of(new PointLight(0, 0, -90, 60, 0xFF0000, 1)));
    int lamp = drawn(full, Matrix.translation(0, 40, -60));
    assertTrue(Colour.red(lamp) > unlit + 20 && Math.abs(Colour.green(lamp) - unlit) < 4, "a red lamp");
  }

  @Test
  void translucencyAndScrolling() {
    Model plain = square(WHITE.textured(0, null));
    assertFalse(plain.isTranslucent() || plain.isAnimated());
    Model glass = square(WHITE.transparent(128));
    assertTrue(glass.isTranslucent());
    int behind = drawn(square(BLUE), Matrix.translation(0, 0, 50));
    resource.draw(glass, HERE);
    int through = middle();
    assertTrue(Colour.red(through) > Colour.red(behind) + 30, "some of the glass");
    assertTrue(Colour.blue(through) > Colour.red(through) + 10, "some of what is behind it");
    resource.draw(square(WHITE.transparent(255)), Matrix.translation(0, 0, -20));
    assertEquals(through, middle(), "invisible");

    // Green above red, one texture high, moves by half of its height each second.
    Arrays.fill(texels, 64 * 128, 128 * 128, 0xFFFF0000);
    Model flowing = square(WHITE.textured(SCROLLING, new TextureMapping.Plane(0, 3, 1)));
    assertTrue(flowing.isAnimated());
    drawn(flowing, HERE);
    assertTrue(Colour.green(at(32, 24)) > 100 && Colour.red(at(32, 40)) > 100, "upright");
    toolkit.advance(1000);
    drawn(flowing, HERE);
    assertTrue(Colour.red(at(32, 24)) > 100 && Colour.green(at(32, 40)) > 100, "it has moved");
  }

  @Test
  void buildersRefuseWhatCannotBeBuilt() {
    Mesh.Builder mesh = pillar(WHITE);
    for (int i = 0; i < 255; i++) {
      mesh.face(0, 1, 2, WHITE.textured(0, new TextureMapping.Cube(i + 1)));
    }
    Mesh.Builder full = Mesh.builder();
    for (int i = 0; i < Mesh.LIMIT; i++) {
      full.vertex(i, 0, 0);
    }
    refuses(IllegalArgumentException.class, () -> mesh.face(0, 1, 8, WHITE), () -> mesh.face(-1, 1, 2, WHITE),
        () -> mesh.face(0, 1, 2, WHITE, 256), () -> mesh.vertex(0, 0, 0, -2),
        () -> mesh.face(0, 1, 2, WHITE.textured(0, new TextureMapping.Plane(0, 1, 8))),
        () -> mesh.billboard(new Mesh.Billboard(300, 1, 1, 0, Mesh.NO_LABEL)),
        () -> mesh.face(0, 1, 2, WHITE.textured(0, new TextureMapping.Cube(256))), () -> full.vertex(0, 0, 0),
        () -> Material.of(65536), () -> WHITE.transparent(256), () -> new TextureMapping.Cube(0),
        () -> TextureMapping.Direction.towards(0, 0, 0), () -> ModelSettings.STANDARD.lit(128, 0),
        () -> square(WHITE.textured(9, null)));
    mesh.face(0, 1, 2, WHITE.textured(0, new TextureMapping.Cube(7)));
    assertEquals(255, mesh.build().mappings().size());
    assertEquals(8 + 255 + 1, mesh.build().faces().size());
    assertFalse(model(mesh).isClosed());
    assertEquals(new TextureMapping.Direction(0, 32767, 0), TextureMapping.Direction.towards(0, 5, 0));
  }

  @Test
  void modelsEndInAnyOrder() {
    int empty = toolkit.allocatedBytes();
    Model model = square(WHITE);
    drawn(model, HERE);
    assertTrue(toolkit.allocatedBytes() > empty);
    model.close();
    model.close();
    assertEquals(empty, toolkit.allocatedBytes());
    refuses(IllegalStateException.class, () -> resource.draw(model, HERE), model::bounds);

    Model orphan = square(WHITE);
    pool.close();
    refuses(IllegalStateException.class, () -> resource.draw(orphan, HERE), orphan::bounds, () -> square(WHITE));
    orphan.close();
    pool = toolkit.createPool(1 << 16);
    Model last = square(BLUE);
    resource.close();
    refuses(IllegalStateException.class, () -> resource.draw(last, HERE));
    toolkit.close();
    assertTrue(last.isClosed());
    refuses(IllegalStateException.class, last::functions);
  }

  /** Workers draw models of their own into parts of one target that do not touch. */
  @Test
  void workersDrawSideBySide() {
    int blue = drawn(square(BLUE), HERE);
    toolkit.clearAll(0);
    List<CompletableFuture<Void>> workers = new ArrayList<>();
    for (int i = 0; i < 4; i++) {
      Model model = square(BLUE);
      ThreadResource own = toolkit.createThreadResource();
      Matrix place = Matrix.scaling(0.4, 0.4, 1).then(Matrix.translation(i % 2 == 0 ? -50 : 50, i < 2 ? -50 : 50, 0));
      workers.add(CompletableFuture.runAsync(() -> {
        own.begin();
        for (int k = 0; k < 200; k++) {
          own.draw(model, place);
        }
        own.end();
      }, task -> new Thread(task).start()));
    }
    workers.forEach(CompletableFuture::join);
    assertArrayEquals(new int[] {blue, blue, blue, blue, 0},
        new int[] {at(16, 16), at(48, 16), at(16, 48), at(48, 48), middle()});
  }
}
