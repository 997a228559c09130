package velmark5;

import java.util.List;

/** What three-dimensional drawing of a frame reads: camera, lights, fog. Set on the control thread, between passes. */
public interface Scene {
  /**
   * Sets the camera.
   *
   * @param camera from the world to the view, for instance {@link Matrix#lookAt}
   */
  void setCamera(Matrix camera);

  /**
   * Sets the projection. Set it after the viewport, for the depth at which fog begins follows from both.
   *
   * @param projection from the view to the screen's space, for instance {@link Matrix#perspective}
   */
  void setProjection(Matrix projection);

  /**
   * Sets the light that is everywhere.
   *
   * @param level its strength: 0 dark, 1 the colours as they are
   */
  void setAmbient(float level);

  /**
   * Sets the sun.
   *
   * @param sun its light and direction
   */
  void setSun(Sun sun);

  /**
   * Sets the fog of the distance. Fog grows from where it begins to the far plane, where nothing else is seen. Before
   * the first call it is black and begins 255 units before the far plane. A model is in it as a whole or not at all,
   * see {@link ThreadResource#draw}.
   *
   * @param colour what far things fade to, 0xRRGGBB
   * @param depth how far before the far plane fog begins, in units of the world; 0 or less for no fog
   */
  void setFog(int colour, int depth);

  /**
   * Sets the lamps that light the models drawn from now on, those that were built to take their light.
   *
   * @param lights the lamps; only the first four count, none is allowed
   */
  void setPointLights(List<PointLight> lights);

  /**
   * Goes under water: the fog takes its colour until {@link #leaveWater()}.
   *
   * @param water the water
   */
  void enterWater(Water water);

  /**
   * Changes the water while under it.
   *
   * @param water the water
   */
  void changeWater(Water water);

  /** Comes out of the water: the fog has its old colour again. */
  void leaveWater();

  /**
   * Sets how finely shadows are drawn on the ground.
   *
   * @param perTile points per side of a tile, rounded down to a power of two
   */
  void setShadowResolution(int perTile);
}
