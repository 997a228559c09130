package velmark5.demo;

import java.util.IntSummaryStatistics;
import java.util.function.Consumer;
import java.util.function.Function;
import java.util.function.ToIntFunction;
import java.util.stream.Stream;
import velmark5.Matrix;
import velmark5.Mesh;
import velmark5.Model;
import velmark5.ThreadResource;

/**
 * A wide piece of ground or water. Whether a model gets fog follows from the ends of its axis, so each piece is four
 * models, with the axis at one corner of its box each; the one whose axis is farthest away is drawn, and fog begins
 * where it should.
 */
final class Patch {
  /** Builds a piece, in the world's coordinates. */
  interface Shape extends Consumer<Sculptor> {}

  private final Model[] models = new Model[4];
  private final Matrix[] places = new Matrix[4];
  private final double middleX;
  private final double middleZ;

  Patch(Function<Mesh, Model> maker, Shape shape) {
    Mesh whole = build(shape, 0, 0);
    int[] x = edges(whole, Mesh.Vertex::x);
    int[] z = edges(whole, Mesh.Vertex::z);
    middleX = (x[0] + x[1]) / 2.0;
    middleZ = (z[0] + z[1]) / 2.0;
    for (int corner = 0; corner < models.length; corner++) {
      int cornerX = x[corner & 1];
      int cornerZ = z[corner >> 1];
      models[corner] = maker.apply(build(shape, cornerX, cornerZ));
      places[corner] = Matrix.translation(cornerX, 0, cornerZ);
    }
  }

  private static Mesh build(Shape shape, int x, int z) {
    Sculptor s = new Sculptor().at(-x, 0, -z);
    shape.accept(s);
    return s.build();
  }

  /** The least and the greatest coordinate of what the faces stand on. */
  private static int[] edges(Mesh mesh, ToIntFunction<Mesh.Vertex> coordinate) {
    IntSummaryStatistics all =
        mesh.faces().stream()
            .flatMap(face -> Stream.of(face.a(), face.b(), face.c()))
            .map(mesh.vertices()::get)
            .mapToInt(coordinate)
            .summaryStatistics();
    return new int[] {all.getMin(), all.getMax()};
  }

  double middleX() {
    return middleX;
  }

  double middleZ() {
    return middleZ;
  }

  /** Draws it for a camera that looks in a direction, raised or lowered against its place. */
  void draw(ThreadResource resource, double heading, double rise) {
    int farthest = (Math.sin(heading) > 0 ? 1 : 0) | (Math.cos(heading) > 0 ? 2 : 0);
    Matrix place = rise == 0 ? places[farthest] : places[farthest].then(Matrix.translation(0, -rise, 0));
    resource.draw(models[farthest], place);
  }
}
