package velmark5;

import static org.junit.jupiter.api.Assertions.assertArrayEquals;
import static org.junit.jupiter.api.Assertions.assertDoesNotThrow;
import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertFalse;
import static org.junit.jupiter.api.Assertions.assertThrows;
import static org.junit.jupiter.api.Assertions.assertTrue;

import java.util.ArrayList;
import java.util.List;
import java.util.concurrent.Callable;
import java.util.concurrent.Executors;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;
import org.junit.jupiter.api.function.Executable;

/** Who owns what, and what happens at the end. */
@Tag("headless")
class LifecycleTest {
  private static final Rect PIXEL = new Rect(0, 0, 1, 1);

  private static void assertClosed(String name, Executable call) {
    assertEquals("This " + name + " is closed", assertThrows(IllegalStateException.class, call).getMessage());
  }

  @Test
  void oneToolkitAtATime() {
    Toolkit first = Toolkit.create();
    assertThrows(IllegalStateException.class, Toolkit::create);
    first.close();
    first.close();
    assertClosed("toolkit", () -> first.clear(0));
    assertClosed("toolkit", first::targetWidth);
    assertClosed("toolkit", () -> first.createSprite(1, 1));
    try (Toolkit second = Toolkit.create()) {
      assertDoesNotThrow(second::clip);
      assertClosed("toolkit", first::clip);
    }
  }

  @Test
  void closedObjectsAreRefusedByName() {
    try (Toolkit toolkit = Toolkit.create()) {
      MemoryPool pool = toolkit.createPool(1000);
      ClippingMask mask = toolkit.createMask(pool, Spans.ellipse(4, 4));
      Sprite sprite = toolkit.createSprite(4, 4);
      DepthBuffer depth = toolkit.createDepthBuffer(4, 4);
      ThreadResource resource = toolkit.createThreadResource();
      for (AutoCloseable object : List.of(mask, pool, sprite, depth, resource)) {
        assertDoesNotThrow(object::close);
        assertDoesNotThrow(object::close);
      }
      assertTrue(pool.isClosed());
      assertClosed("clipping mask", () -> toolkit.fillMask(0, mask, 0, 0));
      assertClosed("memory pool", () -> toolkit.createMask(pool, Spans.ellipse(1, 1)));
      assertClosed("memory pool", () -> toolkit.setPool(pool));
      assertClosed("sprite", () -> toolkit.drawTo(sprite, null));
      assertClosed("sprite", () -> toolkit.copyFromTarget(sprite, null, PIXEL, 0, 0));
      assertClosed("sprite", sprite::width);
      assertClosed("depth buffer", () -> toolkit.drawTo(null, depth));
      assertClosed("depth buffer", depth::height);
      assertClosed("thread resource", resource::begin);
    }
  }

  @Test
  void closingTheToolkitClosesWhatItMade() {
    Toolkit toolkit = Toolkit.create();
    int before = toolkit.allocatedBytes();
    MemoryPool pool = toolkit.createPool(1000);
    toolkit.setPool(pool);
    ClippingMask mask = toolkit.createMask(pool, Spans.ellipse(30, 30));
    assertTrue(toolkit.allocatedBytes() >= before + 240, "two arrays of thirty words");
    Sprite sprite = toolkit.createSprite(4, 4);
    toolkit.createThreadResource();
    toolkit.drawTo(sprite, null);
    toolkit.close();
    assertClosed("clipping mask", mask::width);
    assertClosed("sprite", sprite::width);
    assertTrue(pool.isClosed());
    try (Toolkit next = Toolkit.create()) {
      assertEquals(before, next.allocatedBytes());
      assertThrows(IllegalStateException.class, () -> next.drawTo(sprite, null));
    }
  }

  @Test
  void aTargetThatGoesIsDeselected() {
    try (Toolkit toolkit = Toolkit.create()) {
      Sprite sprite = toolkit.createSprite(8, 4);
      DepthBuffer depth = toolkit.createDepthBuffer(8, 4);
      toolkit.drawTo(sprite, depth);
      assertEquals(8, toolkit.targetWidth());
      depth.close();
      assertEquals(0, toolkit.targetWidth());
      toolkit.clearAll(Colour.WHITE);
      toolkit.drawTo(sprite, null);
      sprite.close();
      assertEquals(new Rect(0, 0, 0, 0), new Rect(0, 0, toolkit.targetWidth(), toolkit.targetHeight()));
      toolkit.clear(Colour.WHITE);
      toolkit.fillCircle(1, 1, 3, -1, BlendMode.ADD);
      toolkit.scroll(1, 1);
      Exception failure = assertThrows(IllegalStateException.class, () -> toolkit.readArea(PIXEL));
      assertEquals("No colour buffer", failure.getMessage());
      assertThrows(IllegalStateException.class, () -> toolkit.captureSprite(PIXEL, true));
      assertThrows(IllegalStateException.class, toolkit::snapshot);
    }
  }

  @Test
  void aPoolMayGoBeforeItsObjects() {
    try (Toolkit toolkit = Toolkit.create();
        Sprite target = toolkit.createSprite(40, 40)) {
      int before = toolkit.allocatedBytes();
      MemoryPool pool = toolkit.createPool(1000);
      ClippingMask mask = toolkit.createMask(pool, Spans.ellipse(30, 30));
      toolkit.drawTo(target, null);
      toolkit.clear(7);
      pool.close();
      toolkit.fillMask(Colour.WHITE, mask, 0, 0);
      toolkit.line(0, 0, 39, 39, Colour.WHITE, BlendMode.REPLACE, mask, 0, 0);
      int[] expected = new int[1600];
      java.util.Arrays.fill(expected, 7);
      assertArrayEquals(expected, toolkit.readArea(new Rect(0, 0, 40, 40)));
      mask.close();
      assertEquals(before, toolkit.allocatedBytes());
    }
  }

  @Test
  void aFullPoolAsksTheClientAndThenGrows() {
    try (Toolkit toolkit = Toolkit.create();
        MemoryPool pool = toolkit.createPool(1024)) {
      List<ClippingMask> masks = new ArrayList<>();
      int[] calls = {0};
      toolkit.onMemoryPressure(
          () -> {
            calls[0]++;
            masks.forEach(ClippingMask::close);
            masks.clear();
            assertThrows(IllegalStateException.class, pool::close);
            assertThrows(IllegalStateException.class, toolkit::close);
          });
      for (int i = 0; i < 100; i++) {
        masks.add(toolkit.createMask(pool, Spans.ellipse(40, 40)));
      }
      assertTrue(calls[0] > 10, "called " + calls[0] + " times");
      assertTrue(masks.size() < 10, masks.size() + " masks of 320 bytes in a pool of 1024 that was not to grow");

      toolkit.onMemoryPressure(null);
      for (int i = 0; i < 100; i++) {
        masks.add(toolkit.createMask(pool, Spans.ellipse(40, 40)));
      }
      assertTrue(toolkit.allocatedBytes() >= 100 * 320, "the pool grew");
    }
  }

  @Test
  void aFailingListenerDoesNotDisturbTheAllocation() {
    try (Toolkit toolkit = Toolkit.create();
        MemoryPool pool = toolkit.createPool(100)) {
      List<Throwable> seen = new ArrayList<>();
      RuntimeException thrown = new RuntimeException("from the listener");
      Thread.currentThread().setUncaughtExceptionHandler((thread, e) -> seen.add(e));
      try {
        toolkit.onMemoryPressure(
            () -> {
              throw thrown;
            });
        assertEquals(40, toolkit.createMask(pool, Spans.ellipse(40, 40)).height());
      } finally {
        Thread.currentThread().setUncaughtExceptionHandler(null);
      }
      assertFalse(seen.isEmpty());
      assertEquals(thrown, seen.get(0));
    }
  }

  @Test
  void eachWorkerHasItsOwnResource() throws Exception {
    try (Toolkit toolkit = Toolkit.create()) {
      List<Callable<Boolean>> work = new ArrayList<>();
      for (int i = 0; i < 4; i++) {
        ThreadResource resource = toolkit.createThreadResource();
        work.add(
            () -> {
              for (int k = 0; k < 1000; k++) {
                resource.begin();
                resource.end();
              }
              return true;
            });
      }
      var workers = Executors.newFixedThreadPool(4);
      try {
        for (var done : workers.invokeAll(work)) {
          assertTrue(done.get());
        }
      } finally {
        workers.shutdown();
      }
    }
  }
}
