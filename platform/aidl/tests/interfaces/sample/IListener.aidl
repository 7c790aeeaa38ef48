// SPDX-License-Identifier: Apache-2.0
package sample;

oneway interface IListener {
    void onDone(int result);
}
