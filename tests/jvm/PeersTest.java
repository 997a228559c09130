import static org.junit.jupiter.api.Assertions.*;

import java.util.function.Consumer;
import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Test;
import org.junit.jupiter.api.function.Executable;
import velmark5.*;

/** The natives called wrongly, past the API: each way in which they refuse, seen by a real runtime; nothing changes. */
class PeersTest extends ToolkitTest {
  private static final int[] FRAME = {1, 2, 3, 4};

  private ja peer;
  private fa sprite;
  private ba pool;
  private a resource;

  @BeforeEach
  void open() {
    peer = (ja) toolkit;
    sprite = (fa) sprite(2, 2, FRAME);
    toolkit.drawTo(sprite, null);
    pool = (ba) toolkit.createPool(1 << 14);
    resource = (a) toolkit.createThreadResource();
  }

  @AfterEach
  void nothingChanged() {
    assertArrayEquals(FRAME, pixels(sprite));
  }

  @Test
  void nullObjectsAndZeroHandles() {
    h none = model(mesh -> mesh.vertex(0, 0, 0));
    none.close();
    long worker = resource.nativeid;
    refuses(NullPointerException.class, "",
        () -> peer.n(null), () -> peer.DA(0, null, 0, 0), () -> peer.BA(0, 0, 1, 1, null, 0, 1), () -> peer.xa(null),
        () -> peer.AA(null), () -> peer.Q(1, null, new float[1]), () -> sprite.da(0),
        () -> sprite.F(sprite.nativeid, null), () -> new fa(peer).EA(0, new int[1], null, null, 0, 1, 1, 1),
        () -> new o().AA(0, sprite.nativeid, 0, 0, 0, 1, 1, 0, 0, true, false), () -> resource.R(0));
    refuses(NullPointerException.class,
        none::m, none::i, none::u, none::c, none::Z, none::N, none::ha, () -> none.KA(0), () -> none.Q(1),
        () -> resource.wa(worker, none, new float[16], null), () -> resource.wa(worker, null, new float[16], null));
    assertEquals(worker, resource.nativeid);
  }

  @Test
  void shortArraysAndBadNumbers() {
    h model = model(mesh -> mesh.vertex(0, 0, 0));
    long worker = resource.nativeid;
    refuses(ArrayIndexOutOfBoundsException.class, "out: length 3, 4 needed", () -> peer.qa(new int[3]));
    refuses(ArrayIndexOutOfBoundsException.class, "matrix: length 15, 16 needed", () -> peer.wa(new float[15]));
    refuses(ArrayIndexOutOfBoundsException.class,
        () -> resource.wa(worker, model, new float[17], null),
        () -> resource.wa(worker, model, new float[16], new int[5]));
    refuses(NullPointerException.class, () -> resource.wa(worker, model, null, null),
        () -> resource.wa(0, model, new float[16], null));
    refuses(IllegalArgumentException.class, "", () -> peer.B(0, 0, 1, 1, 5, 3), () -> peer.YA(90, 90, 95, 95, 5, 3));
    refuses(IllegalArgumentException.class, "area: 2x1 at (1, 0) is not inside 2x2", () -> peer.E(1, 0, 2, 1));
    refuses(IllegalArgumentException.class, "size: -1 is negative", () -> toolkit.createPool(-1));
  }

  @Test
  void errorsReachTheRuntime() throws Exception {
    MemoryPool empty = toolkit.createPool(0);
    var error = assertThrows(OutOfMemoryError.class, () -> toolkit.createMask(empty, Spans.ellipse(30, 30)));
    assertTrue(error.getMessage().matches("native\\(MPR: \\d+\\)"), error.getMessage());
    // The class that the library raises for its own faults.
    NativeLibrary.load();
    var made = Class.forName("tolvi3.graphics2.NativeError").getConstructor(String.class).newInstance("text");
    assertEquals("text", ((Throwable) made).getMessage());
  }

  // --- Meshes ---------------------------------------------------------------------------------------------------

  private h model(Consumer<Mesh.Builder> content) {
    Mesh.Builder mesh = Mesh.builder();
    content.accept(mesh);
    return (h) toolkit.createModel(pool, mesh.build(), ModelSettings.STANDARD);
  }

  private void build(h model, int faces, int thirdCorner, int[] x, int[] labels, int functions, int[] billboards) {
    model.U(
        null, pool, 3, 3, x, new int[] {0, 0, 10}, new int[3], labels, null, faces, new short[1], new short[] {1},
        new short[] {(short) thirdCorner}, null, null, null, null, new short[] {77}, null, null, (byte) 0, null, 0,
        null, null, null, null, null, null, null, null, null, null, null, null, null, 0, 0, functions, 0, 128, 768,
        billboards);
  }

  @Test
  void meshesThatAreRefusedLeaveThePeerAloneAndCostNoMemory() {
    int[] x = {0, 10, 0};
    h model = model(mesh -> mesh.face(mesh.vertex(0, 0, 0), mesh.vertex(10, 0, 0), mesh.vertex(0, 10, 0),
        Material.of(Hsl.of(0, 0, 0.5))));
    long before = model.nativeid;
    int memory = toolkit.allocatedBytes();
    for (int i = 0; i < 3000; i++) {
      assertThrows(IllegalArgumentException.class, () -> build(model, 1, 3, x, null, 0, null));
    }
    refuses(NullPointerException.class, () -> build(model, 1, 2, null, null, 0, null));
    refuses(ArrayIndexOutOfBoundsException.class, () -> build(model, 1, 2, new int[2], null, 0, null));
    refuses(IllegalArgumentException.class, () -> build(model, 1, 2, x, new int[] {0, 0, 256}, 0xFFFFF, null));
    assertEquals(before, model.nativeid);
    assertEquals(memory, toolkit.allocatedBytes());
  }

  @Test
  void oddMeshesThatAreAllowed() {
    h model = model(mesh -> mesh.vertex(0, 0, 0));
    model.close();
    int memory = toolkit.allocatedBytes();
    int[] x = {0, 10, 0};
    int[] far = {Integer.MAX_VALUE, Integer.MIN_VALUE, 0};
    for (Executable build : new Executable[] {
      () -> build(model, 0, 2, x, null, 0xFFFFF, null), () -> build(model, -5, 2, x, null, 0xFFFFF, null),
      () -> build(model, 1, 2, x, new int[] {0, 1, 255}, 0xFFFFF, new int[] {0, 4, 4, -1, 0, 1, 0, 0}),
      () -> build(model, 1, 2, x, null, 0, null), () -> build(model, 1, 2, far, null, 0xFFFFF, null),
      () -> model.ba(0)
    }) {
      assertDoesNotThrow(build);
      resource.draw(model, Matrix.IDENTITY);
      model.ma();
      model.ma();
      assertEquals(0, model.nativeid);
    }
    assertEquals(memory, toolkit.allocatedBytes());
    toolkit.writeArea(new Rect(0, 0, 2, 2), FRAME, 0, 2);
  }
}
