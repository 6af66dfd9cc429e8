// SPDX-License-Identifier: Apache-2.0
import { Resizer } from './resizer.js';

export * from './resizer.js';

export interface LoadOptions {
    /** Whether to use the module with vector instructions. Default: where they run. */
    simd?: boolean;
}

/** Rejects when the module's file cannot be loaded. */
export function load(options?: LoadOptions): Promise<Resizer>;
