// SPDX-License-Identifier: Apache-2.0
// The binding as Java sees it.
package ovrin.resize.test;

import java.nio.ByteBuffer;
import org.junit.Test;
import ovrin.resize.CameraFrame;
import ovrin.resize.BilinearMode;
import ovrin.resize.Native;
import ovrin.resize.PixelFormat;
import ovrin.resize.Placement;
import ovrin.resize.Resizer;
import ovrin.resize.Size;

public final class FromJava {
    private interface Call {
        void run();
    }

    private static void refused(String text, Call call) {
        try {
            call.run();
        } catch (IllegalArgumentException e) {
            if (e.getMessage().contains(text)) return;
            throw new AssertionError(e.getMessage());
        }
        throw new AssertionError("accepted");
    }

    @Test
    public void calls() {
        Size size = new Size(8, 6);
        ByteBuffer src = ByteBuffer.allocateDirect(8 * 6 * 4 + 36);
        ByteBuffer dst = ByteBuffer.allocateDirect(8 * 6 * 4);
        Resizer.rgba(src, size, dst, new Size(4, 3));
        Resizer.rgbaInCanvas(src, size, dst, Placement.fit(new Size(4, 4), size));
        Resizer.bilinear(src, size, dst, size, PixelFormat.RGBA8888);
        Resizer.bilinear(src, size, dst, size, PixelFormat.NV21, BilinearMode.HALVING);
        Resizer.lanczos(src, size, dst, size, 3);
        CameraFrame.fromYuv420(src, src, src, 8, 8, 2, 8, 6).resizeTo(dst, size, PixelFormat.NV21);
        // Kotlin would refuse null itself.
        refused("source is null", () -> Native.rgba(null, 1, 1, dst, 1, 1));
        refused("destination is null", () -> Native.rgba(src, 1, 1, null, 1, 1));
        refused("source V plane is null",
                () -> Native.i420InCanvas(src, src, null, 1, 1, 1, dst, 1, 1, 0, 0, 1, 1));
    }
}
