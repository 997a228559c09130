package velmark5;

import static org.junit.jupiter.api.Assertions.assertArrayEquals;
import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertFalse;
import static org.junit.jupiter.api.Assertions.assertThrows;
import static org.junit.jupiter.api.Assertions.assertTrue;

import java.util.ArrayList;
import java.util.Arrays;
import java.util.List;
import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;

/** Models seen by a camera: where they appear, what hides what, and their textures. */
@Tag("headless")
class ModelTest {
  private static final int SIDE = 64;
  private static final Rect ALL = new Rect(0, 0, SIDE, SIDE);
  private static final Material WHITE = Material.of(Hsl.of(0, 0, 0.9));
  private static final Material BLUE = Material.of(Hsl.of(2 / 3.0, 1, 0.4));

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
        return TextureMetrics.PLAIN;
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

  @Test
  void placeBoundsAndLife() {
    Model model = square(WHITE);
    ScreenPlacement place = resource.drawPlaced(model, Matrix.IDENTITY).orElseThrow();
    assertTrue(place.toString().contains("ScreenPlacement"));
    assertTrue(resource.drawPlaced(model, Matrix.translation(0, 0, -500)).isEmpty());
    assertTrue(toolkit.takeModelCount() > 0);
    assertEquals(0, toolkit.takeModelCount());
    assertThrows(
        IllegalArgumentException.class, () -> square(WHITE.textured(4, null)), "a texture without metrics");
    int full = toolkit.allocatedBytes();
    model.close();
    model.close();
    assertTrue(toolkit.allocatedBytes() < full);
    assertThrows(IllegalStateException.class, () -> resource.draw(model, Matrix.IDENTITY));
    Model orphan = square(WHITE);
    pool.close();
    orphan.close();
    assertFalse(toolkit.allocatedBytes() < 0);
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
