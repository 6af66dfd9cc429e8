// SPDX-License-Identifier: Apache-2.0
// Stub: stands in for the class of this name where there is no Android, with what the binding, its
// examples and their tests use of it. In no archive.
package androidx.camera.core;

public final class ImageAnalysis {
    public interface Analyzer {
        void analyze(ImageProxy image);
    }

    private ImageAnalysis() {}
}
