package velmark5;

import static org.junit.jupiter.api.Assertions.*;

import java.util.ArrayList;
import java.util.Arrays;
import java.util.List;
import org.junit.jupiter.api.Test;
import org.junit.jupiter.api.function.Executable;

/** Who owns what, and what happens at the end. */
class LifecycleTest extends ToolkitTest {
  private static void refusesClosed(String name, Executable... calls) {
    refuses(IllegalStateException.class, "This " + name + " is closed", calls);
  }

  @Test
  void oneToolkitAtATimeOwnsWhatItMade() throws Exception {
    Toolkit first = toolkit;
    refuses(IllegalStateException.class, Toolkit::create);
    int before = first.allocatedBytes();
    for (boolean oneByOne : new boolean[] {true, false}) {
      MemoryPool pool = first.createPool(1000);
      first.setPool(pool);
      ClippingMask mask = first.createMask(pool, Spans.ellipse(30, 30));
      assertEquals(before + 240, first.allocatedBytes(), "two arrays of thirty words");
      Sprite sprite = first.createSprite(4, 4);
      DepthBuffer depth = first.createDepthBuffer(4, 4);
      ThreadResource resource = first.createThreadResource();
      first.drawTo(sprite, depth);
      for (AutoCloseable object : oneByOne ? List.of(mask, pool, sprite, depth, resource) : List.of(first)) {
        object.close();
        object.close();
      }
      assertTrue(pool.isClosed());
      refusesClosed("clipping mask", mask::width);
      refusesClosed("sprite", sprite::width);
      refusesClosed("depth buffer", depth::height);
      refusesClosed("thread resource", resource::begin);
      if (oneByOne) {
        refusesClosed("clipping mask", () -> first.fillMask(0, mask, 0, 0));
        refusesClosed("memory pool", () -> first.createMask(pool, Spans.ellipse(1, 1)), () -> first.setPool(pool));
        refusesClosed("sprite", () -> first.drawTo(sprite, null),
            () -> first.copyFromTarget(sprite, null, new Rect(0, 0, 1, 1), 0, 0));
        refusesClosed("depth buffer", () -> first.drawTo(null, depth));
      }
    }
    refusesClosed("toolkit", () -> first.clear(0), first::targetWidth, () -> first.createSprite(1, 1));
    toolkit = Toolkit.create();
    assertEquals(before, toolkit.allocatedBytes());
    refusesClosed("toolkit", first::clip);
  }

  @Test
  void aTargetThatGoesIsDeselected() {
    Sprite sprite = toolkit.createSprite(8, 4);
    DepthBuffer depth = toolkit.createDepthBuffer(8, 4);
    toolkit.drawTo(sprite, depth);
    depth.close();
    assertEquals(0, toolkit.targetWidth());
    toolkit.clearAll(Colour.WHITE);
    toolkit.drawTo(sprite, null);
    assertEquals(8, toolkit.targetWidth());
    sprite.close();
    assertEquals(0, toolkit.targetWidth() + toolkit.targetHeight());
    toolkit.clear(Colour.WHITE);
    toolkit.fillCircle(1, 1, 3, -1, BlendMode.ADD);
    toolkit.scroll(1, 1);
    refuses(IllegalStateException.class, "No colour buffer", () -> at(0, 0));
    refuses(IllegalStateException.class, () -> toolkit.captureSprite(new Rect(0, 0, 1, 1), true), toolkit::snapshot);
  }

  @Test
  void aPoolMayGoBeforeItsObjects() {
    int before = toolkit.allocatedBytes();
    MemoryPool pool = toolkit.createPool(1000);
    ClippingMask mask = toolkit.createMask(pool, Spans.ellipse(30, 30));
    toolkit.drawTo(toolkit.createSprite(40, 40), null);
    toolkit.clear(7);
    pool.close();
    toolkit.fillMask(Colour.WHITE, mask, 0, 0);
    toolkit.line(0, 0, 39, 39, Colour.WHITE, BlendMode.REPLACE, mask, 0, 0);
    assertTrue(Arrays.stream(pixels()).allMatch(pixel -> pixel == 7));
    mask.close();
    assertEquals(before, toolkit.allocatedBytes());
  }

  @Test
  void aFullPoolAsksTheClientAndThenGrows() {
    MemoryPool pool = toolkit.createPool(1024);
    List<ClippingMask> masks = new ArrayList<>();
    int[] calls = {0};
    toolkit.onMemoryPressure(() -> {
      calls[0]++;
      masks.forEach(ClippingMask::close);
      masks.clear();
      refuses(IllegalStateException.class, pool::close, toolkit::close);
    });
    for (int i = 0; i < 100; i++) {
      masks.add(toolkit.createMask(pool, Spans.ellipse(40, 40)));
    }
    assertTrue(calls[0] > 10, "called " + calls[0] + " times");
    assertTrue(masks.size() < 10, masks.size() + " masks of 320 bytes in a pool of 1024 that was not to grow");

    // A listener that fails is reported, and does not disturb the allocation.
    List<Throwable> seen = new ArrayList<>();
    RuntimeException thrown = new RuntimeException("from the listener");
    Thread.currentThread().setUncaughtExceptionHandler((thread, e) -> seen.add(e));
    try {
      toolkit.onMemoryPressure(() -> {
        throw thrown;
      });
      toolkit.createMask(pool, Spans.ellipse(40, 4000));
    } finally {
      Thread.currentThread().setUncaughtExceptionHandler(null);
    }
    assertTrue(seen.contains(thrown));
    assertTrue(toolkit.allocatedBytes() >= 32000, "the pool grew");
  }
}
