import static org.junit.jupiter.api.Assertions.assertEquals;
import static org.junit.jupiter.api.Assertions.assertSame;
import static org.junit.jupiter.api.Assertions.assertThrows;
import static org.junit.jupiter.api.Assertions.assertTrue;

import org.junit.jupiter.api.AfterEach;
import org.junit.jupiter.api.BeforeEach;
import org.junit.jupiter.api.Tag;
import org.junit.jupiter.api.Test;
import org.junit.jupiter.api.function.Executable;
import velmark5.Hsl;
import velmark5.Material;
import velmark5.Matrix;
import velmark5.Mesh;
import velmark5.Model;
import velmark5.ModelSettings;
import velmark5.Toolkit;

/** The natives of models called wrongly, past the API: an exception that names the argument, and no memory lost. */
@Tag("headless")
class MeshContractTest {
  private ja toolkit;
  private ba pool;
  private h model;
  private int memory;

  /** The arguments of a build that differ from call to call: a triangle at first. */
  private static final class Build {
    int vertexCount = 3;
    int meshVertexCount = 3;
    int[] x = {0, 10, 0};
    int[] vertexLabels = {0, 1, 255};
    int faceCount = 1;
    short[] a = {0};
    short[] c = {2};
    byte[] alpha;
    byte[] mapping;
    short[] hsl = {77};
    short[] texture;
    int[] faceLabels = {3};
    int[] points;
    int emitters;
    int functions = 0xFFFFF;
    int[] billboards;

    void call(h peer, ba pool) {
      peer.U(
          null, pool, vertexCount, meshVertexCount, x, new int[] {0, 0, 10}, new int[3], vertexLabels, null, faceCount,
          a, new short[] {1}, c, null, null, alpha, mapping, hsl, texture, faceLabels, (byte) 0, null, 0, null, null,
          null, null, null, null, null, null, null, null, null, null, points, emitters, 0, functions, 0, 128, 768,
          billboards);
    }
  }

  private interface Change {
    void apply(Build build);
  }

  @BeforeEach
  void open() {
    toolkit = (ja) Toolkit.create();
    pool = (ba) toolkit.createPool(1 << 14);
    Mesh.Builder mesh = Mesh.builder();
    Material material = Material.of(Hsl.of(0, 0, 0.5));
    mesh.face(mesh.vertex(0, 0, 0), mesh.vertex(10, 0, 0), mesh.vertex(0, 10, 0), material);
    model = (h) toolkit.createModel(pool, mesh.build(), ModelSettings.STANDARD);
    memory = toolkit.allocatedBytes();
  }

  @AfterEach
  void close() {
    assertEquals(memory, toolkit.allocatedBytes());
    toolkit.close();
  }

  private void refused(Class<? extends Throwable> type, String start, Change change) {
    Build build = new Build();
    change.apply(build);
    // The peer that stands for a model already shows that a build that fails leaves it alone.
    long before = model.nativeid;
    Throwable thrown = assertThrows(type, () -> build.call(model, pool));
    assertSame(type, thrown.getClass());
    assertTrue(String.valueOf(thrown.getMessage()).startsWith(start), thrown.getMessage());
    assertEquals(before, model.nativeid);
  }

  @Test
  void aBuildThatIsRefusedNamesTheArgument() {
    Class<IllegalArgumentException> illegal = IllegalArgumentException.class;
    Class<ArrayIndexOutOfBoundsException> tooShort = ArrayIndexOutOfBoundsException.class;
    refused(illegal, "vertexcount", b -> b.vertexCount = -1);
    refused(illegal, "vertexcount", b -> b.vertexCount = 16769);
    refused(illegal, "meshvertexcount", b -> b.meshVertexCount = 4);
    refused(illegal, "inputfacecount", b -> b.faceCount = 16769);
    refused(tooShort, "x", b -> b.x = new int[2]);
    refused(NullPointerException.class, "", b -> b.x = null);
    refused(tooShort, "a", b -> b.a = new short[0]);
    refused(illegal, "c[0]: 3", b -> b.c[0] = 3);
    refused(illegal, "c[0]: -1", b -> b.c[0] = -1);
    refused(tooShort, "falpha", b -> b.alpha = new byte[0]);
    refused(NullPointerException.class, "", b -> b.hsl = null);
    refused(illegal, "ftex[0]: texture 0", b -> b.texture = new short[1]);
    refused(
        illegal,
        "fmapping[0]",
        b -> {
          b.texture = new short[] {-1};
          b.mapping = new byte[1];
        });
    refused(illegal, "vertexlabels[2]", b -> b.vertexLabels[2] = 256);
    refused(illegal, "facelabels[0]", b -> b.faceLabels[0] = 256);
    refused(tooShort, "pslist", b -> b.emitters = 1);
    refused(illegal, "pslist[0]", b -> b.points = new int[] {3});
    refused(illegal, "billboarddata[0]: 1", b -> b.billboards = new int[] {1, 1, 1, -1, 0, 0, 0, 0});
    refused(illegal, "billboarddata[3]", b -> b.billboards = new int[] {0, 1, 1, 7, 0, 0, 0, 0});
    Build sound = new Build();
    assertThrows(NullPointerException.class, () -> sound.call(model, null));
  }

  @Test
  void manyRefusalsCostNoMemory() {
    Build build = new Build();
    build.c[0] = 3;
    h fresh = fresh();
    for (int i = 0; i < 3000; i++) {
      assertThrows(IllegalArgumentException.class, () -> build.call(fresh, pool));
    }
    assertEquals(0, fresh.nativeid);
  }

  /** A second peer, closed: what is built into it past its constructor has to be ended past its close. */
  private h fresh() {
    Mesh.Builder mesh = Mesh.builder();
    mesh.vertex(0, 0, 0);
    Model other = toolkit.createModel(pool, mesh.build(), ModelSettings.STANDARD);
    other.close();
    return (h) other;
  }

  @Test
  void oddMeshesThatAreAllowed() {
    toolkit.drawTo(toolkit.createSprite(8, 8), null);
    a resource = (a) toolkit.createThreadResource();
    memory = toolkit.allocatedBytes();
    h peer = fresh();
    for (Change change :
        new Change[] {
          b -> b.faceCount = 0,
          b -> b.faceCount = -5,
          b -> b.vertexLabels = null,
          b -> b.faceLabels = new int[0],
          b -> b.billboards = new int[] {0, 4, 4, -1, 0, 1, 0, 0},
          b -> b.functions = 0,
          b -> b.x = new int[] {Integer.MAX_VALUE, Integer.MIN_VALUE, 0}
        }) {
      Build build = new Build();
      change.apply(build);
      build.call(peer, pool);
      resource.draw(peer, Matrix.IDENTITY);
      peer.ma();
      peer.ma();
      assertEquals(0, peer.nativeid);
    }
    peer.ba(0);
    resource.draw(peer, Matrix.IDENTITY);
    peer.ma();
  }

  @Test
  void drawsAndStateWithoutAModelOrWithShortArrays() {
    a resource = (a) toolkit.createThreadResource();
    memory = toolkit.allocatedBytes();
    h none = fresh();
    Executable[] calls = {
      none::m, none::i, none::u, none::c, none::Z, none::N, none::ha, () -> none.KA(0), () -> none.Q(1),
      () -> resource.wa(resource.nativeid, none, new float[16], null),
      () -> resource.wa(resource.nativeid, null, new float[16], null),
      () -> resource.wa(resource.nativeid, model, null, null),
      () -> resource.wa(0, model, new float[16], null)
    };
    for (Executable call : calls) {
      assertSame(NullPointerException.class, assertThrows(NullPointerException.class, call).getClass());
    }
    for (int length : new int[] {0, 15, 17}) {
      assertThrows(
          ArrayIndexOutOfBoundsException.class, () -> resource.wa(resource.nativeid, model, new float[length], null));
    }
    assertThrows(
        ArrayIndexOutOfBoundsException.class,
        () -> resource.wa(resource.nativeid, model, new float[16], new int[5]));
  }
}
