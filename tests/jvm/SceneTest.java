import static org.junit.jupiter.api.Assertions.assertArrayEquals;
import static org.junit.jupiter.api.Assertions.assertDoesNotThrow;
import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertFalse;
import static org.junit.jupiter.api.Assertions.assertThrows;
import static org.junit.jupiter.api.Assertions.assertTrue;

import java.util.ArrayList;
import java.util.Arrays;
import java.util.List;
import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;
import velmark5.BlendMode;
import velmark5.Colour;
import velmark5.Matrix;
import velmark5.PointLight;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.Sun;
import velmark5.TextureMetrics;
import velmark5.TextureSource;
import velmark5.ThreadResource;
import velmark5.Tint;
import velmark5.Toolkit;
import velmark5.Water;

/** Camera, textures, triangles and sprites under any map. */
@Tag("headless")
class SceneTest {
  private Toolkit toolkit;

  @AfterEach
  void close() {
    if (toolkit != null) {
      toolkit.close();
    }
  }

  private int[] target(int width, int height) {
    Sprite sprite = toolkit.createSprite(width, height);
    toolkit.drawTo(sprite, null);
    toolkit.clear(0);
    return toolkit.readArea(new Rect(0, 0, width, height));
  }

  private int[] seen() {
    return toolkit.readArea(new Rect(0, 0, toolkit.targetWidth(), toolkit.targetHeight()));
  }

  @Test
  void theCameraSeesTheWorldUprightAndInOrder() {
    Rect view = new Rect(10, 20, 200, 100);
    Matrix camera = Matrix.lookAt(3, -5, 7, 40, 2, -30);
    Matrix screen = camera.then(Matrix.perspective(Math.PI / 2, 2, 1, 100));
    var middle = screen.project(40, 2, -30, view);
    assertEquals(110, middle.x(), 1e-3);
    assertEquals(70, middle.y(), 1e-3);
    assertTrue(middle.visible());
    assertTrue(screen.project(40, 3, -30, view).y() > 70, "down in the world is down on the screen");
    float[] behind = camera.transform(3 - 37, -5 - 7, 7 + 37);
    assertTrue(behind[2] < 0, "behind the camera");
    assertFalse(screen.project(3 - 37, -5 - 7, 7 + 37, view).visible());
    // A right hand to the right: looking along z, x grows to the right.
    Matrix ahead = Matrix.lookAt(0, 0, -5, 0, 0, 0).then(Matrix.perspective(Math.PI / 2, 1, 1, 9));
    assertEquals(60, ahead.project(1, 0, 0, new Rect(0, 0, 100, 100)).x(), 1e-3);
    assertEquals(0, ahead.project(0, 0, -4, view).depth(), 1e-6);
    assertEquals(1, ahead.project(0, 0, 4, view).depth(), 1e-6);

    assertArrayEquals(new float[] {3, 7, 8, 1}, Matrix.scaling(1, 2, 1).then(Matrix.translation(2, 1, 5)).transform(1, 3, 3));
    float[] turned = Matrix.rotationZ(Math.PI / 2).transform(1, 0, 0);
    assertEquals(1, turned[1], 1e-6);
    assertEquals(-1, Matrix.rotationY(Math.PI / 2).transform(1, 0, 0)[2], 1e-6);
    assertEquals(1, Matrix.rotationX(Math.PI / 2).transform(0, 1, 0)[2], 1e-6);
    assertThrows(IllegalArgumentException.class, () -> Matrix.lookAt(0, 0, 0, 0, 9, 0));
    assertThrows(IllegalArgumentException.class, () -> Matrix.perspective(1, 1, 5, 5));
    assertThrows(IllegalArgumentException.class, () -> Matrix.of(1, 2, 3));
  }

  @Test
  void sceneStateIsCheckedBeforeItIsTaken() {
    toolkit = Toolkit.create();
    ja peer = (ja) toolkit;
    assertDoesNotThrow(() -> {
      toolkit.setCamera(Matrix.IDENTITY);
      toolkit.setProjection(Matrix.perspective(1, 1, 1, 100));
      toolkit.setAmbient(1);
      toolkit.setSun(new Sun(0xFFEEDD, 0.7f, 1.2f, 1, -3, 1));
      toolkit.setFog(0x102030, -4);
      toolkit.setPointLights(List.of());
      toolkit.setPointLights(java.util.Collections.nCopies(9, new PointLight(1, 2, 3, 4, 5, 2f)));
      toolkit.enterWater(new Water(10, 0x204060, 500));
      toolkit.changeWater(new Water(11, 0x204060, 400));
      toolkit.leaveWater();
      toolkit.setShadowResolution(12);
    });
    for (float[] wrong : new float[][] {new float[15], new float[17]}) {
      assertThrows(ArrayIndexOutOfBoundsException.class, () -> peer.AA(wrong));
      assertThrows(ArrayIndexOutOfBoundsException.class, () -> peer.wa(wrong));
    }
    assertThrows(NullPointerException.class, () -> peer.AA(null));
    assertThrows(NullPointerException.class, () -> peer.wa(null));
    assertThrows(ArrayIndexOutOfBoundsException.class, () -> peer.Q(2, new int[9], new float[2]));
    assertThrows(ArrayIndexOutOfBoundsException.class, () -> peer.Q(2, new int[10], new float[1]));
    assertThrows(NullPointerException.class, () -> peer.Q(1, null, new float[1]));
    assertThrows(IllegalArgumentException.class, () -> new Sun(0, 1, 1, 1, 0, 1));
    assertThrows(IllegalArgumentException.class, () -> new Water(1, 1, 0));
  }

  /** Answers with what a test wants, and remembers what it was asked. */
  private static final class Source implements TextureSource {
    final List<Integer> asked = new ArrayList<>();
    int[] answer = new int[SIZE * SIZE];
    RuntimeException failure;

    @Override
    public TextureMetrics metrics(int id) {
      asked.add(id);
      if (failure != null) {
        throw failure;
      }
      return TextureMetrics.PLAIN.withScroll(-128, 127).withAverage(65535).withLighting(255);
    }

    @Override
    public int[] pixels(int id) {
      return answer;
    }
  }

  @Test
  void texturesComeFromTheirSource() {
    Source source = new Source();
    toolkit = Toolkit.create(source, 3);
    assertEquals(List.of(0, 1, 2), source.asked);
    ja peer = (ja) toolkit;
    assertTrue(peer.SA((short) 2));
    toolkit.advance(1000);
    source.answer = null;
    assertFalse(peer.SA((short) 2));
    List<Throwable> reported = new ArrayList<>();
    Thread.currentThread().setUncaughtExceptionHandler((thread, e) -> reported.add(e));
    try {
      source.answer = new int[16383];
      assertFalse(peer.SA((short) 2));
      source.answer = new int[16384];
      assertFalse(peer.SA((short) 3));
      assertFalse(peer.SA((short) -1));
    } finally {
      Thread.currentThread().setUncaughtExceptionHandler(null);
    }
    assertEquals(
        List.of(ArrayIndexOutOfBoundsException.class, IllegalArgumentException.class, IllegalArgumentException.class),
        reported.stream().map(Object::getClass).toList());
    toolkit.close();

    source.failure = new ArithmeticException();
    assertThrows(ArithmeticException.class, () -> Toolkit.create(source, 1));
    assertThrows(IllegalArgumentException.class, () -> Toolkit.create(source, 65536));
    assertThrows(NullPointerException.class, () -> Toolkit.create(null, 1));
    toolkit = Toolkit.create();
    assertFalse(((ja) toolkit).SA((short) 0));
    assertThrows(IllegalArgumentException.class, () -> TextureMetrics.PLAIN.withScroll(128, 0));
  }

  @Test
  void trianglesAndThickLines() {
    toolkit = Toolkit.create();
    int[] expected = target(16, 16);
    ThreadResource resource = toolkit.createThreadResource();
    int ink = 0xFF204060;
    resource.fillTriangle(0, 0, ink, 0, 32, ink, 32, 0, ink);
    Arrays.fill(expected, ink);
    int[] flat = seen();
    for (int i = 0; i < flat.length; i++) {
      for (int shift = 0; shift < 24; shift += 8) {
        assertEquals(ink >> shift & 255, flat[i] >> shift & 255, 1, "one colour at every corner, at pixel " + i);
      }
    }
    toolkit.clear(0);
    toolkit.setClip(new Rect(4, 0, 8, 16));
    resource.fillTriangle(0, 0, Colour.BLACK, 0, 32, Colour.BLACK, 32, 0, Colour.WHITE);
    int[] ramp = seen();
    for (int x = 5; x < 12; x++) {
      assertTrue(Colour.red(ramp[x]) > Colour.red(ramp[x - 1]), "brighter to the right");
    }
    assertEquals(0, ramp[3]);
    assertEquals(0, ramp[12]);
    toolkit.resetClip();
    toolkit.clear(0);
    resource.line(2, 8, 13, 8, ink, 4, BlendMode.REPLACE);
    int[] bar = seen();
    int rows = 0;
    for (int y = 0; y < 16; y++) {
      rows += bar[y * 16 + 7] != 0 ? 1 : 0;
    }
    assertEquals(4, rows, 1);
    assertEquals(0, bar[16]);
    resource.close();
    assertThrows(IllegalStateException.class, () -> resource.line(0, 0, 1, 1, ink, 2, BlendMode.REPLACE));
  }

  @Test
  void spritesTurnedAndTiled() {
    toolkit = Toolkit.create();
    int a = 0xFF000001;
    int b = 0xFF000002;
    int c = 0xFF000003;
    int d = 0xFF000004;
    Sprite sprite = toolkit.createSprite(new int[] {a, b, c, d}, 2, 2, 2, false);
    target(4, 4);
    sprite.drawAcross(1, 1, 3, 1, 1, 3, Tint.NONE, BlendMode.REPLACE);
    assertArrayEquals(new int[] {0, 0, 0, 0, 0, a, b, 0, 0, c, d, 0, 0, 0, 0, 0}, seen());
    sprite.drawRotated(2, 2, Math.PI / 2, 1, Tint.NONE, BlendMode.REPLACE);
    assertArrayEquals(new int[] {c, a, d, b}, toolkit.readArea(new Rect(1, 1, 2, 2)));
    sprite.drawAcross(1, 1, 1, 1, 1, 3, Tint.NONE, BlendMode.REPLACE);
    assertArrayEquals(new int[] {c, a, d, b}, toolkit.readArea(new Rect(1, 1, 2, 2)));

    toolkit.clear(0);
    var mask = toolkit.createMask(
        toolkit.createPool(1000), new velmark5.Spans(4, 4, new int[] {0, 2, 0, 0}, new int[] {4, 1, 4, 4}));
    sprite.drawAcross(1, 1, 3, 1, 1, 3, mask, 0, 0, BlendMode.REPLACE);
    assertArrayEquals(new int[] {0, b, c, d}, toolkit.readArea(new Rect(1, 1, 2, 2)));
    assertThrows(
        IllegalArgumentException.class, () -> sprite.drawAcross(0, 0, 1, 0, 0, 1, mask, 0, 0, BlendMode.ADD));

    toolkit.clear(0);
    toolkit.setClip(new Rect(0, 0, 4, 3));
    sprite.drawTiled(new Rect(1, 1, 3, 3), Tint.NONE, BlendMode.REPLACE);
    assertArrayEquals(new int[] {0, 0, 0, 0, 0, a, b, a, 0, c, d, c, 0, 0, 0, 0}, seen());
    assertEquals(new Rect(0, 0, 4, 3), toolkit.clip());
    Sprite empty = toolkit.createSprite(0, 5);
    assertThrows(
        IllegalArgumentException.class, () -> empty.drawTiled(new Rect(0, 0, 4, 4), Tint.NONE, BlendMode.ALPHA));
  }
}
