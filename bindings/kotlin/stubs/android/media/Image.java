// SPDX-License-Identifier: Apache-2.0
// Stub: stands in for the class of this name where there is no Android, with what the binding, its
// examples and their tests use of it. In no archive.
package android.media;

import android.hardware.HardwareBuffer;
import java.nio.ByteBuffer;

public abstract class Image implements AutoCloseable {
    public abstract static class Plane {
        public abstract ByteBuffer getBuffer();

        public abstract int getRowStride();

        public abstract int getPixelStride();
    }

    public abstract int getFormat();

    public abstract int getWidth();

    public abstract int getHeight();

    public abstract Plane[] getPlanes();

    public abstract HardwareBuffer getHardwareBuffer();

    @Override
    public abstract void close();
}
