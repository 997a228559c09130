/** The seam between the readable API and the classes that are tied to the native library. Not for client code. */
package velmark5.spi;
