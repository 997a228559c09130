package velmark5;

import java.util.ArrayList;
import java.util.Arrays;
import java.util.LinkedHashSet;
import java.util.List;
import java.util.Objects;
import java.util.Set;

/**
 * A decoded mesh, from which models are made: vertices, faces with their materials, groups for animation, billboards.
 * The x axis points to the right, y downward, z away. A face is seen from the side from which its corners run
 * counter-clockwise. Coordinates count from the point about which the model turns; bounds and radii of models are 16
 * bits wide, so vertices stay within 32767 units of it.
 */
public final class Mesh {
  /** The most vertices, and the most faces, of one mesh. */
  public static final int LIMIT = 16768;

  /** The label of what belongs to no group. */
  public static final int NO_LABEL = -1;

  /** The greatest label of a group. */
  public static final int MAX_LABEL = 255;

  private final List<Vertex> vertices;
  private final List<Face> faces;
  private final List<Billboard> billboards;
  private final List<TextureMapping> mappings;

  /**
   * A vertex.
   *
   * @param x right
   * @param y down
   * @param z away
   * @param label group, or {@link #NO_LABEL}
   */
  public record Vertex(int x, int y, int z, int label) {}

  /**
   * A triangle.
   *
   * @param a number of the first vertex
   * @param b number of the second vertex
   * @param c number of the third vertex
   * @param material what it is made of
   * @param label group, or {@link #NO_LABEL}
   */
  public record Face(int a, int b, int c, Material material, int label) {}

  /**
   * A textured rectangle that faces the viewer. Its carrier face shrinks to its middle and is not drawn.
   *
   * @param face number of the carrier
   * @param width along the view's x axis, model units
   * @param height along the view's y axis
   * @param texture texture id
   * @param label group, or {@link #NO_LABEL}
   */
  public record Billboard(int face, int width, int height, int texture, int label) {}

  private Mesh(Builder from) {
    vertices = List.copyOf(from.vertices);
    faces = List.copyOf(from.faces);
    billboards = List.copyOf(from.billboards);
    mappings = List.copyOf(from.mappings);
  }

  /**
   * Starts a mesh.
   *
   * @return an empty builder
   */
  public static Builder builder() {
    return new Builder();
  }

  /**
   * All vertices.
   *
   * @return in the order of their numbers
   */
  public List<Vertex> vertices() {
    return vertices;
  }

  /**
   * All faces.
   *
   * @return in the order of their numbers
   */
  public List<Face> faces() {
    return faces;
  }

  /**
   * All billboards.
   *
   * @return in the order in which they were added
   */
  public List<Billboard> billboards() {
    return billboards;
  }

  /**
   * The texture mappings of the materials, each once.
   *
   * @return at most 255
   */
  public List<TextureMapping> mappings() {
    return mappings;
  }

  /** Collects a mesh. */
  public static final class Builder {
    private static final int MAX_MAPPINGS = 255;

    private final List<Vertex> vertices = new ArrayList<>();
    private final List<Face> faces = new ArrayList<>();
    private final List<Billboard> billboards = new ArrayList<>();
    private final Set<TextureMapping> mappings = new LinkedHashSet<>();

    private Builder() {}

    /**
     * Adds a vertex without a group.
     *
     * @param x right
     * @param y down
     * @param z away
     * @return its number
     */
    public int vertex(int x, int y, int z) {
      return vertex(x, y, z, NO_LABEL);
    }

    /**
     * Adds a vertex.
     *
     * @param x right
     * @param y down
     * @param z away
     * @param label group
     * @return its number
     * @throws IllegalArgumentException if the mesh is full or the label out of range
     */
    public int vertex(int x, int y, int z, int label) {
      return add("vertices", vertices, new Vertex(x, y, z, checked(label)));
    }

    /**
     * Adds a face without a group.
     *
     * @param a first vertex
     * @param b second vertex
     * @param c third vertex
     * @param material what it is made of
     * @return its number
     */
    public int face(int a, int b, int c, Material material) {
      return face(a, b, c, material, NO_LABEL);
    }

    /**
     * Adds a face.
     *
     * @param a first vertex
     * @param b second vertex
     * @param c third vertex
     * @param material what it is made of
     * @param label group
     * @return its number
     * @throws IllegalArgumentException if the mesh is full, has mappings enough, or lacks a vertex of the face or of its
     *     material's plane, or the label is out of range
     */
    public int face(int a, int b, int c, Material material, int label) {
      Objects.requireNonNull(material, "material");
      requireVertices(a, b, c);
      if (material.mapping() instanceof TextureMapping.Plane plane) {
        requireVertices(plane.origin(), plane.right(), plane.down());
      }
      if (material.mapping() != null && material.texture() != Material.NO_TEXTURE) {
        if (mappings.size() == MAX_MAPPINGS && !mappings.contains(material.mapping())) {
          throw new IllegalArgumentException("mappings: more than " + MAX_MAPPINGS);
        }
        mappings.add(material.mapping());
      }
      return add("faces", faces, new Face(a, b, c, material, checked(label)));
    }

    /**
     * Adds a quadrangle as two faces, which meet from the first to the third vertex.
     *
     * @param a first vertex
     * @param b second vertex
     * @param c third vertex
     * @param d fourth vertex
     * @param material what it is made of
     * @return the number of the first face
     */
    public int quad(int a, int b, int c, int d, Material material) {
      int first = face(a, b, c, material);
      face(a, c, d, material);
      return first;
    }

    /**
     * Adds a billboard.
     *
     * @param billboard on a face that was added
     * @return this
     * @throws IllegalArgumentException if there is no such face
     */
    public Builder billboard(Billboard billboard) {
      if (billboard.face() < 0 || billboard.face() >= faces.size()) {
        throw new IllegalArgumentException("face: " + billboard.face() + " of " + faces.size());
      }
      checked(billboard.label());
      billboards.add(billboard);
      return this;
    }

    /**
     * Ends the mesh.
     *
     * @return the mesh; the builder may go on
     */
    public Mesh build() {
      return new Mesh(this);
    }

    private void requireVertices(int... numbers) {
      for (int vertex : numbers) {
        if (vertex < 0 || vertex >= vertices.size()) {
          throw new IllegalArgumentException("vertex: " + vertex + " of " + vertices.size());
        }
      }
    }

    private static <T> int add(String name, List<T> list, T item) {
      if (list.size() == LIMIT) {
        throw new IllegalArgumentException(name + ": more than " + LIMIT);
      }
      list.add(item);
      return list.size() - 1;
    }

    private static int checked(int label) {
      if (label < NO_LABEL || label > MAX_LABEL) {
        throw new IllegalArgumentException("label: " + label + " is not from -1 to " + MAX_LABEL);
      }
      return label;
    }
  }

  @Override
  public String toString() {
    return vertices.size() + " vertices, " + faces.size() + " faces";
  }

  @Override
  public boolean equals(Object other) {
    return other instanceof Mesh mesh
        && vertices.equals(mesh.vertices)
        && faces.equals(mesh.faces)
        && billboards.equals(mesh.billboards);
  }

  @Override
  public int hashCode() {
    return Arrays.hashCode(new Object[] {vertices, faces, billboards});
  }
}
