import java.util.HashMap;
import java.util.List;
import java.util.Map;
import java.util.Set;
import java.util.function.ToIntFunction;
import velmark5.Material;
import velmark5.Mesh;
import velmark5.Model;
import velmark5.ModelBounds;
import velmark5.ModelFunction;
import velmark5.ModelSettings;
import velmark5.TextureMapping;

/** Model. */
final class h extends Peer implements Model {
  private static final int POINT_LIT = 0x10;
  private static final int FLAT_COLOURS = 0x40;
  private static final int DEFAULT_MAPPING = 255;

  long nativeid;

  private final ba pool;

  native void U(
      Object unused, ba pool, int vertexCount, int meshVertexCount, int[] x, int[] y, int[] z, int[] vertexLabels,
      short[] vertexMask, int faceCount, short[] a, short[] b, short[] c, byte[] type, byte[] priorities,
      byte[] alpha, byte[] mapping, short[] hsl, short[] texture, int[] faceLabels, byte priority, short[] faceMask,
      int mappingCount, byte[] mappingType, short[] mappingP, short[] mappingM, short[] mappingN, int[] mappingScaleX,
      int[] mappingScaleY, int[] mappingScaleZ, byte[] mappingRotation, byte[] mappingDirection,
      int[] mappingTranslateX, int[] mappingTranslateY, int[] mappingTranslateZ, int[] points, int emitterCount,
      int effectorCount, int functions, int flags, int ambient, int contrast, int[] billboards);

  native void ba(int unused);

  native void ma();

  native void KA(int mask);

  native int m();

  native boolean i();

  native boolean u();

  native void p(int ambient);

  native void Q(int contrast);

  native int c();

  native int Z();

  native int N();

  native int n();

  native int RA();

  native int ya();

  native int YA();

  native int o();

  native int AA();

  native int ha();

  /** A model of a mesh. */
  h(ja toolkit, ba pool, Mesh mesh, ModelSettings settings) {
    super(toolkit);
    this.pool = pool;
    build(mesh, settings);
    pool.residents++;
  }

  /** The peer of an open model. */
  static h open(Model model) {
    h peer = (h) model;
    peer.handle();
    return peer;
  }

  private void build(Mesh mesh, ModelSettings settings) {
    List<Mesh.Vertex> v = mesh.vertices();
    List<Mesh.Face> f = mesh.faces();
    boolean textured = f.stream().anyMatch(face -> face.material().texture() != Material.NO_TEXTURE);
    boolean translucent = f.stream().anyMatch(face -> face.material().transparency() != 0);
    Mappings mappings = new Mappings(mesh.mappings());
    U(
        null, pool, v.size(), v.size(), ints(v, Mesh.Vertex::x), ints(v, Mesh.Vertex::y), ints(v, Mesh.Vertex::z),
        ints(v, Mesh.Vertex::label), null, f.size(), shorts(f, Mesh.Face::a), shorts(f, Mesh.Face::b),
        shorts(f, Mesh.Face::c), bytes(f, face -> face.material().shading().code()), null,
        translucent ? bytes(f, face -> face.material().transparency()) : null,
        bytes(f, face -> mappings.indexOf(face.material())), shorts(f, face -> face.material().colour()),
        textured ? shorts(f, face -> face.material().texture()) : null, labels(mesh), (byte) 0, null,
        mappings.type.length, mappings.type, mappings.p, mappings.m, mappings.n, mappings.scaleX, mappings.scaleY,
        mappings.scaleZ, mappings.rotation, mappings.direction, mappings.translateX, mappings.translateY,
        mappings.translateZ, null, 0, 0, ModelFunction.mask(settings.functions()),
        (settings.pointLit() ? POINT_LIT : 0) | (settings.flatColours() ? FLAT_COLOURS : 0), settings.ambient(),
        settings.contrast(), billboards(mesh.billboards()));
  }

  private static <T> int[] ints(List<T> items, ToIntFunction<T> attribute) {
    return items.stream().mapToInt(attribute).toArray();
  }

  private static <T> short[] shorts(List<T> items, ToIntFunction<T> attribute) {
    short[] result = new short[items.size()];
    for (int i = 0; i < result.length; i++) {
      result[i] = (short) attribute.applyAsInt(items.get(i));
    }
    return result;
  }

  private static <T> byte[] bytes(List<T> items, ToIntFunction<T> attribute) {
    byte[] result = new byte[items.size()];
    for (int i = 0; i < result.length; i++) {
      result[i] = (byte) attribute.applyAsInt(items.get(i));
    }
    return result;
  }

  /** One label per face, then one per billboard. */
  private static int[] labels(Mesh mesh) {
    int faces = mesh.faces().size();
    int[] labels = new int[faces + mesh.billboards().size()];
    for (int i = 0; i < labels.length; i++) {
      labels[i] = i < faces ? mesh.faces().get(i).label() : mesh.billboards().get(i - faces).label();
    }
    return labels;
  }

  /** Seven integers for each, in an array that has room for eight. */
  private static int[] billboards(List<Mesh.Billboard> billboards) {
    if (billboards.isEmpty()) {
      return null;
    }
    final int alphaBlend = 1;
    final int plainColour = 0;
    int[] data = new int[billboards.size() * 8];
    for (int j = 0; j < billboards.size(); j++) {
      Mesh.Billboard b = billboards.get(j);
      int[] record = {b.face(), b.width(), b.height(), b.texture(), plainColour, alphaBlend, 0};
      System.arraycopy(record, 0, data, j * record.length, record.length);
    }
    return data;
  }

  /** The texture mappings as the arrays of the build. */
  private static final class Mappings {
    final Map<TextureMapping, Integer> numbers = new HashMap<>();
    final byte[] type;
    final short[] p;
    final short[] m;
    final short[] n;
    final int[] scaleX;
    final int[] scaleY;
    final int[] scaleZ;
    final byte[] rotation;
    final byte[] direction;
    final int[] translateX;
    final int[] translateY;
    final int[] translateZ;

    Mappings(List<TextureMapping> mappings) {
      int count = mappings.size();
      type = new byte[count];
      p = new short[count];
      m = new short[count];
      n = new short[count];
      scaleX = new int[count];
      scaleY = new int[count];
      scaleZ = new int[count];
      rotation = new byte[count];
      direction = new byte[count];
      translateX = new int[count];
      translateY = new int[count];
      translateZ = new int[count];
      for (int i = 0; i < count; i++) {
        numbers.put(mappings.get(i), i);
        put(i, mappings.get(i));
      }
    }

    int indexOf(Material material) {
      boolean mapped = material.texture() != Material.NO_TEXTURE && material.mapping() != null;
      return mapped ? numbers.get(material.mapping()) : DEFAULT_MAPPING;
    }

    private void put(int i, TextureMapping mapping) {
      if (mapping instanceof TextureMapping.Plane plane) {
        p[i] = (short) plane.origin();
        m[i] = (short) plane.right();
        n[i] = (short) plane.down();
      } else if (mapping instanceof TextureMapping.Cylinder cylinder) {
        axis(i, 1, cylinder.axis(), cylinder.rotation(), cylinder.quarterTurns());
        scale(i, 1024, 64 * cylinder.height(), cylinder.repeats());
        translateX[i] = cylinder.shift();
      } else if (mapping instanceof TextureMapping.Cube cube) {
        axis(i, 2, cube.axis(), cube.rotation(), cube.quarterTurns());
        scale(i, 64 * cube.size(), 64 * cube.size(), 64 * cube.size());
        translateX[i] = cube.shiftX();
        translateY[i] = cube.shiftY();
        translateZ[i] = cube.shiftZ();
      } else if (mapping instanceof TextureMapping.Sphere sphere) {
        axis(i, 3, sphere.axis(), sphere.rotation(), sphere.quarterTurns());
        scale(i, 1024, 1024, 1024);
        translateX[i] = sphere.shift();
      }
    }

    private void axis(int i, int kind, TextureMapping.Direction axis, int turn, int quarterTurns) {
      type[i] = (byte) kind;
      p[i] = (short) axis.x();
      m[i] = (short) axis.y();
      n[i] = (short) axis.z();
      rotation[i] = (byte) turn;
      direction[i] = (byte) (quarterTurns & 3);
    }

    private void scale(int i, int x, int y, int z) {
      scaleX[i] = x;
      scaleY[i] = y;
      scaleZ[i] = z;
    }
  }

  @Override
  long id() {
    return nativeid;
  }

  @Override
  String name() {
    return "model";
  }

  @Override
  void destroy() {
    ma();
    pool.residents--;
  }

  @Override
  public Set<ModelFunction> functions() {
    handle();
    return ModelFunction.of(m());
  }

  @Override
  public void restrictFunctions(Set<ModelFunction> left) {
    handle();
    KA(ModelFunction.mask(left));
  }

  @Override
  public boolean isTranslucent() {
    handle();
    return i();
  }

  @Override
  public boolean isAnimated() {
    handle();
    return u();
  }

  @Override
  public int ambient() {
    handle();
    return c();
  }

  @Override
  public void setAmbient(int level) {
    handle();
    p(level);
  }

  @Override
  public int contrast() {
    handle();
    return Z();
  }

  @Override
  public void setContrast(int divisor) {
    handle();
    if (divisor == 0) {
      throw new IllegalArgumentException("contrast: 0 is no divisor");
    }
    Q(divisor);
  }

  @Override
  public ModelBounds bounds() {
    handle();
    return new ModelBounds(
        (short) RA(), (short) ya(), (short) YA(), (short) o(), (short) AA(), (short) ha(), (short) N(), (short) n());
  }
}
