// SPDX-License-Identifier: Apache-2.0
// Stub: stands in for the class of this name where there is no Android, with what the binding, its
// examples and their tests use of it. In no archive.
package android.graphics;

public final class ImageFormat {
    public static final int YUV_420_888 = 35;

    private ImageFormat() {}
}
