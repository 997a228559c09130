import static org.junit.jupiter.api.Assertions.assertArrayEquals;
import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertNotEquals;
import static org.junit.jupiter.api.Assertions.assertSame;
import static org.junit.jupiter.api.Assertions.assertThrows;
import static org.junit.jupiter.api.Assertions.assertTrue;

import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;
import org.junit.jupiter.api.function.Executable;
import velmark5.MemoryPool;
import velmark5.NativeLibrary;
import velmark5.Rect;
import velmark5.Spans;
import velmark5.Toolkit;

/** The natives called wrongly, past the API: a clear exception, and nothing has changed. */
@Tag("headless")
class PeersTest {
  private ja toolkit;
  private fa sprite;

  @BeforeEach
  void open() {
    toolkit = (ja) Toolkit.create();
    sprite = (fa) toolkit.createSprite(new int[] {1, 2, 3, 4}, 2, 2, 2, false);
    toolkit.drawTo(sprite, null);
  }

  @AfterEach
  void nothingChanged() {
    assertArrayEquals(new int[] {1, 2, 3, 4}, toolkit.readArea(new Rect(0, 0, 2, 2)));
    toolkit.close();
  }

  private static void fails(Class<? extends Throwable> type, String message, Executable call) {
    Throwable thrown = assertThrows(type, call);
    assertSame(type, thrown.getClass());
    assertEquals(message, thrown.getMessage());
  }

  @Test
  void nullObjectsAndZeroHandles() {
    Class<NullPointerException> npe = NullPointerException.class;
    fails(npe, "", () -> toolkit.n(null));
    fails(npe, "", () -> toolkit.DA(0, null, 0, 0));
    fails(npe, "", () -> toolkit.R(0, 0, 1, 1, 0, 0, null, 0, 0));
    fails(npe, "", () -> toolkit.BA(0, 0, 1, 1, null, 0, 1));
    fails(npe, "", () -> toolkit.qa(null));
    fails(npe, "", () -> toolkit.xa(null));
    fails(npe, "", () -> sprite.da(0));
    fails(npe, "", () -> sprite.GA(0));
    fails(npe, "", () -> sprite.WA(0));
    fails(npe, "", () -> sprite.ba(0));
    fails(npe, "", () -> sprite.U(0, 1, 1, 1, 1));
    fails(npe, "", () -> sprite.F(0, new int[4]));
    fails(npe, "", () -> sprite.F(sprite.nativeid, null));
    fails(npe, "", () -> sprite.na(0, 0, 0, 1, 1, new int[1], 0, 1));
    fails(npe, "", () -> sprite.na(sprite.nativeid, 0, 0, 1, 1, null, 0, 1));
    fails(npe, "", () -> sprite.ea(0, 0, 0, 1, 1, 0, 0));
    fails(npe, "", () -> sprite.j(0, 0, 0, 3));
    fails(npe, "", () -> new fa(toolkit).RA(0, null, 0, 1, 1, 1, true));
    fails(npe, "", () -> new fa(toolkit).EA(0, null, new byte[1], null, 0, 1, 1, 1));
    fails(npe, "", () -> new fa(toolkit).EA(0, new int[1], null, null, 0, 1, 1, 1));
    fails(npe, "", () -> new o().AA(0, sprite.nativeid, 0, 0, 0, 1, 1, 0, 0, true, false));
    fails(npe, "", () -> new o().BA(toolkit.nativeid, 0, 0, 0, 0, 1, 1, 0, 0, true, false));
    a resource = (a) toolkit.createThreadResource();
    fails(npe, "", () -> resource.R(0));
    fails(npe, "", () -> resource.JA(0));
    fails(npe, "", () -> resource.UA(0));
    assertNotEquals(0, resource.nativeid);
  }

  @Test
  void shortArraysAndBadModes() {
    Class<ArrayIndexOutOfBoundsException> tooShort = ArrayIndexOutOfBoundsException.class;
    fails(tooShort, "out: length 3, 4 needed", () -> toolkit.qa(new int[3]));
    fails(tooShort, "out: length 0, 4 needed", () -> toolkit.xa(new int[0]));
    fails(tooShort, "result: length 3, 4 needed", () -> sprite.F(sprite.nativeid, new int[3]));
    Class<IllegalArgumentException> illegal = IllegalArgumentException.class;
    fails(illegal, "", () -> toolkit.B(0, 0, 1, 1, 5, 3));
    fails(illegal, "", () -> toolkit.B(50, 50, 1, 1, 5, -1));
    fails(illegal, "", () -> toolkit.XA(0, 0, 1, 5, 3));
    fails(illegal, "", () -> toolkit.G(0, 0, 1, 5, 3));
    fails(illegal, "", () -> toolkit.YA(90, 90, 95, 95, 5, 3));
    fails(illegal, "", () -> toolkit.CA(0, 0, 1, 5, 3));
    fails(illegal, "channel: 4 is not 0 to 3", () -> sprite.j(sprite.nativeid, 0, 0, 4));
    fails(illegal, "area: 2x1 at (1, 0) is not inside 2x2", () -> toolkit.E(1, 0, 2, 1));
    fails(illegal, "size: -1 is negative", () -> toolkit.createPool(-1));
  }

  @Test
  void withoutAFrame() {
    toolkit.drawToNothing();
    fails(Exception.class, "No colour buffer", () -> toolkit.E(0, 0, 1, 1));
    fails(Exception.class, "No colour buffer", () -> sprite.ea(sprite.nativeid, 0, 0, 1, 1, 0, 0));
    fails(Exception.class, "No colour buffer", () -> sprite.j(sprite.nativeid, 0, 0, 3));
    fa none = new fa(toolkit);
    fails(Exception.class, "No colour buffer", () -> none.K(0, 0, 0, 1, 1, true));
    assertEquals(0, none.nativeid);
    toolkit.drawTo(sprite, null);
  }

  @Test
  void destroyingTwiceOnlyClearsTheField() {
    ba pool = (ba) toolkit.createPool(1000);
    wa mask = (wa) toolkit.createMask(pool, Spans.ellipse(3, 3));
    mask.ma();
    mask.ma();
    assertEquals(0, mask.nativeid);
    fails(NullPointerException.class, "", () -> toolkit.DA(0, mask, 0, 0));
    pool.ma();
    pool.ma();
    assertEquals(0, pool.nativeid);
    oa depth = (oa) toolkit.createDepthBuffer(1, 1);
    depth.za(depth.nativeid);
    depth.za(0);
    assertEquals(0, depth.nativeid);
  }

  /** Calls that are kept for their callers and change nothing that can be seen. */
  @Test
  void callsWithoutEffect() {
    toolkit.N();
    toolkit.da();
    toolkit.RA(true);
    toolkit.b(1, 1, 1, -1, 9);
    toolkit.advance(5);
    ((ba) toolkit.createPool(10)).u();
    assertEquals(0, toolkit.j());
    assertEquals(0, toolkit.takeModelCount());
  }

  @Test
  void aPoolThatCannotGrowIsOutOfMemory() {
    MemoryPool pool = toolkit.createPool(0);
    OutOfMemoryError error =
        assertThrows(OutOfMemoryError.class, () -> toolkit.createMask(pool, Spans.ellipse(30, 30)));
    assertTrue(error.getMessage().matches("native\\(MPR: \\d+\\)"), error.getMessage());
  }

  @Test
  void theErrorClassThatTheLibraryRaisesExists() throws Exception {
    NativeLibrary.load();
    Object error =
        Class.forName("tolvi3.graphics2.NativeError").getConstructor(String.class).newInstance("text");
    assertEquals("text", ((Throwable) error).getMessage());
  }
}
