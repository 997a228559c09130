import static org.junit.jupiter.api.Assertions.*;

import java.util.ArrayList;
import java.util.Collections;
import java.util.List;
import org.junit.jupiter.api.Test;
import velmark5.*;

/** Camera, scene state, textures. */
class SceneTest extends ToolkitTest {
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
    assertTrue(camera.transform(3 - 37, -5 - 7, 7 + 37)[2] < 0, "behind the camera");
    assertFalse(screen.project(3 - 37, -5 - 7, 7 + 37, view).visible());
    // A right hand to the right: looking along z, x grows to the right.
    Matrix ahead = Matrix.lookAt(0, 0, -5, 0, 0, 0).then(Matrix.perspective(Math.PI / 2, 1, 1, 9));
    assertEquals(60, ahead.project(1, 0, 0, new Rect(0, 0, 100, 100)).x(), 1e-3);
    assertEquals(0, ahead.project(0, 0, -4, view).depth(), 1e-6);
    assertEquals(1, ahead.project(0, 0, 4, view).depth(), 1e-6);

    Matrix both = Matrix.scaling(1, 2, 1).then(Matrix.translation(2, 1, 5));
    assertArrayEquals(new float[] {3, 7, 8, 1}, both.transform(1, 3, 3));
    assertEquals(1, Matrix.rotationZ(Math.PI / 2).transform(1, 0, 0)[1], 1e-6);
    assertEquals(-1, Matrix.rotationY(Math.PI / 2).transform(1, 0, 0)[2], 1e-6);
    assertEquals(1, Matrix.rotationX(Math.PI / 2).transform(0, 1, 0)[2], 1e-6);
    refuses(IllegalArgumentException.class, () -> Matrix.lookAt(0, 0, 0, 0, 9, 0),
        () -> Matrix.perspective(1, 1, 5, 5), () -> Matrix.of(1, 2, 3));
  }

  @Test
  void sceneStateIsTaken() {
    toolkit.setCamera(Matrix.IDENTITY);
    toolkit.setProjection(Matrix.perspective(1, 1, 1, 100));
    toolkit.setAmbient(1);
    toolkit.setSun(new Sun(0xFFEEDD, 0.7f, 1.2f, 1, -3, 1));
    toolkit.setFog(0x102030, -4);
    toolkit.setPointLights(List.of());
    toolkit.setPointLights(Collections.nCopies(9, new PointLight(1, 2, 3, 4, 5, 2f)));
    toolkit.enterWater(new Water(10, 0x204060, 500));
    toolkit.changeWater(new Water(11, 0x204060, 400));
    toolkit.leaveWater();
    toolkit.setShadowResolution(12);
    refuses(IllegalArgumentException.class, () -> new Sun(0, 1, 1, 1, 0, 1), () -> new Water(1, 1, 0),
        () -> TextureMetrics.PLAIN.withScroll(128, 0));
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
    assertFalse(((ja) toolkit).SA((short) 0), "there is none");
    toolkit.close();
    Source source = new Source();
    toolkit = Toolkit.create(source, 3);
    assertEquals(List.of(0, 1, 2), source.asked);
    ja peer = (ja) toolkit;
    assertTrue(peer.SA((short) 2));
    toolkit.advance(1000);
    source.answer = null;
    assertFalse(peer.SA((short) 2));
    List<Class<?>> reported = new ArrayList<>();
    Thread.currentThread().setUncaughtExceptionHandler((thread, e) -> reported.add(e.getClass()));
    try {
      source.answer = new int[16383];
      assertFalse(peer.SA((short) 2));
      source.answer = new int[16384];
      assertFalse(peer.SA((short) 3));
    } finally {
      Thread.currentThread().setUncaughtExceptionHandler(null);
    }
    assertEquals(List.of(ArrayIndexOutOfBoundsException.class, IllegalArgumentException.class), reported);
    toolkit.close();

    source.failure = new ArithmeticException();
    refuses(ArithmeticException.class, () -> Toolkit.create(source, 1));
    refuses(IllegalArgumentException.class, () -> Toolkit.create(source, 65536));
    refuses(NullPointerException.class, () -> Toolkit.create(null, 1));
  }
}
