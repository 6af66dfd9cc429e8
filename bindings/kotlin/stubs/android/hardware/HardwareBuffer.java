// SPDX-License-Identifier: Apache-2.0
// Stub: stands in for the class of this name where there is no Android, with what the binding, its
// examples and their tests use of it. In no archive.
package android.hardware;

public abstract class HardwareBuffer implements AutoCloseable {
    public static final int RGBA_8888 = 1;

    public abstract int getFormat();

    public abstract int getWidth();

    public abstract int getHeight();

    @Override
    public abstract void close();
}
