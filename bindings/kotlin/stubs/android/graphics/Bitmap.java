// SPDX-License-Identifier: Apache-2.0
// Stub: stands in for the class of this name where there is no Android, with what the binding, its
// examples and their tests use of it. In no archive.
package android.graphics;

import java.nio.ByteBuffer;

public final class Bitmap {
    public enum Config { ALPHA_8, RGB_565, ARGB_4444, ARGB_8888, RGBA_F16, HARDWARE }

    private static final int SUCCESS = 0;
    private static final int BAD_PARAMETER = -1;
    private static final int RGBA_8888 = 1;
    private static final int RGB_565 = 4;

    private final int width;
    private final int height;
    private final int rowBytes;
    private final Config config;
    private final boolean mutable;
    private final ByteBuffer pixels;
    private boolean recycled;

    /** What the native functions answer, and how many locks are held. */
    public int infoResult = SUCCESS;
    public int lockResult = SUCCESS;
    public int locks;

    /** Of the stub only. */
    public Bitmap(int width, int height, Config config, boolean mutable, int rowBytes) {
        this.width = width;
        this.height = height;
        this.config = config;
        this.mutable = mutable;
        this.rowBytes = rowBytes;
        pixels = ByteBuffer.allocateDirect((height - 1) * rowBytes + 4 * width);
    }

    public static Bitmap createBitmap(int width, int height, Config config) {
        return new Bitmap(width, height, config, true, 4 * width);
    }

    public int getWidth() { return width; }

    public int getHeight() { return height; }

    public int getRowBytes() { return rowBytes; }

    public Config getConfig() { return recycled ? null : config; }

    public boolean isMutable() { return mutable; }

    public boolean isRecycled() { return recycled; }

    public void recycle() { recycled = true; }

    public Bitmap copy(Config as, boolean asMutable) {
        Bitmap result = new Bitmap(width, height, as, asMutable, rowBytes);
        result.pixels.duplicate().put(pixels.duplicate());
        return result;
    }

    // What the stub of libjnigraphics calls.

    public int infoResult() { return recycled ? BAD_PARAMETER : infoResult; }

    public int format() { return config == Config.RGB_565 ? RGB_565 : RGBA_8888; }

    public ByteBuffer pixels() { return pixels; }

    public synchronized int lock() {
        if (lockResult != SUCCESS || config == Config.HARDWARE) {
            return lockResult != SUCCESS ? lockResult : BAD_PARAMETER;
        }
        locks++;
        return SUCCESS;
    }

    public synchronized int unlock() {
        locks--;
        return SUCCESS;
    }
}
