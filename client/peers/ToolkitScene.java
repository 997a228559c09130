import java.util.List;
import velmark5.Matrix;
import velmark5.PointLight;
import velmark5.Scene;
import velmark5.Sun;
import velmark5.Water;

/** The toolkit's camera, lights and fog. */
interface ToolkitScene extends ToolkitPart, Scene {
  @Override
  default void setCamera(Matrix camera) {
    live().AA(camera.toArray());
  }

  @Override
  default void setProjection(Matrix projection) {
    live().wa(projection.toArray());
  }

  @Override
  default void setAmbient(float level) {
    live().IA(level);
  }

  @Override
  default void setSun(Sun sun) {
    live().m(sun.colour(), sun.front(), sun.back(), sun.x(), sun.y(), sun.z());
  }

  @Override
  default void setFog(int colour, int depth) {
    live().c(colour, depth);
  }

  /** Five numbers and a strength for each lamp. */
  @Override
  default void setPointLights(List<PointLight> lights) {
    ja toolkit = live();
    int[] places = new int[5 * lights.size()];
    float[] strengths = new float[lights.size()];
    for (int i = 0; i < strengths.length; i++) {
      PointLight light = lights.get(i);
      int[] record = {light.x(), light.y(), light.z(), light.range(), light.colour()};
      System.arraycopy(record, 0, places, i * record.length, record.length);
      strengths[i] = light.strength();
    }
    toolkit.Q(strengths.length, places, strengths);
  }

  @Override
  default void enterWater(Water water) {
    live().M(water.height(), water.colour(), water.range(), 0);
  }

  @Override
  default void changeWater(Water water) {
    live().JA(water.height(), water.colour(), water.range(), 0);
  }

  @Override
  default void leaveWater() {
    live().O();
  }

  @Override
  default void setShadowResolution(int perTile) {
    live().J(perTile);
  }
}
