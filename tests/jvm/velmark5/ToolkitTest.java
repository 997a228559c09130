package velmark5;

import static org.junit.jupiter.api.Assertions.*;

import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.function.Executable;

/** A toolkit of its own for each test, and what tests say often. */
@Tag("headless")
public abstract class ToolkitTest {
  protected Toolkit toolkit;

  @BeforeEach
  void openToolkit() {
    toolkit = Toolkit.create();
  }

  @AfterEach
  void closeToolkit() {
    toolkit.close();
  }

  /** Each of the calls throws just this. */
  protected static void refuses(Class<? extends Throwable> type, Executable... calls) {
    for (int i = 0; i < calls.length; i++) {
      assertSame(type, assertThrows(type, calls[i], "call " + i).getClass());
    }
  }

  /** The same, with a message. */
  protected static void refuses(Class<? extends Throwable> type, String message, Executable... calls) {
    for (Executable call : calls) {
      Throwable thrown = assertThrows(type, call);
      assertSame(type, thrown.getClass());
      assertEquals(message, thrown.getMessage());
    }
  }

  /** The whole target. */
  protected int[] pixels() {
    return toolkit.readArea(new Rect(0, 0, toolkit.targetWidth(), toolkit.targetHeight()));
  }

  /** Makes the sprite the target, and gives all of it. */
  protected int[] pixels(Sprite sprite) {
    toolkit.drawTo(sprite, null);
    return pixels();
  }

  protected int at(int x, int y) {
    return toolkit.readArea(new Rect(x, y, 1, 1))[0];
  }

  protected Sprite sprite(int width, int height, int... pixels) {
    return toolkit.createSprite(pixels, width, height, width, false);
  }
}
