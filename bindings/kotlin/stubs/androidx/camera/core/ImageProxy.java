// SPDX-License-Identifier: Apache-2.0
// Stub: stands in for the class of this name where there is no Android, with what the binding, its
// examples and their tests use of it. In no archive.
package androidx.camera.core;

import java.nio.ByteBuffer;

public interface ImageProxy extends AutoCloseable {
    interface PlaneProxy {
        ByteBuffer getBuffer();

        int getRowStride();

        int getPixelStride();
    }

    int getWidth();

    int getHeight();

    PlaneProxy[] getPlanes();

    @Override
    void close();
}
