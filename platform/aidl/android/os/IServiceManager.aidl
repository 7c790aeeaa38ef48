// SPDX-License-Identifier: Apache-2.0
package android.os;

import android.os.IClientCallback;
import android.os.IServiceCallback;
import android.os.ServiceDebugInfo;

/** Where services are registered under a name and found by it: the object every process reaches as
 *  handle 0. Names are 1 to 127 of the characters a-z A-Z 0-9 _ - . / */
interface IServiceManager {
    /** Bits that a service is registered with and lists are asked for. */
    const int DUMP_FLAG_PRIORITY_CRITICAL = 1 << 0;
    const int DUMP_FLAG_PRIORITY_HIGH = 1 << 1;
    const int DUMP_FLAG_PRIORITY_NORMAL = 1 << 2;
    const int DUMP_FLAG_PRIORITY_DEFAULT = 1 << 3;
    const int DUMP_FLAG_PRIORITY_ALL = 15;
    const int DUMP_FLAG_PROTO = 1 << 4;

    /** The service of that name, or null; does not wait. May have one started that is not there. */
    @nullable IBinder getService(@utf8InCpp String name);

    /** The same, without starting anything. */
    @nullable IBinder checkService(@utf8InCpp String name);

    /** Registers a service in place of an earlier one of that name. */
    void addService(@utf8InCpp String name, IBinder service, boolean allowIsolated,
                    int dumpPriority);

    /** The names registered with one of these bits, in byte order. */
    @utf8InCpp String[] listServices(int dumpPriority);

    /** The callback is told of the service of that name, at once when there is one. */
    void registerForNotifications(@utf8InCpp String name, IServiceCallback callback);
    void unregisterForNotifications(@utf8InCpp String name, IServiceCallback callback);

    /** Whether a manifest declares the instance, `package.IType/name`. */
    boolean isDeclared(@utf8InCpp String name);

    /** The names of the declared instances of `package.IType`. */
    @utf8InCpp String[] getDeclaredInstances(@utf8InCpp String iface);

    /** The updatable package a declared instance comes from; null for none. */
    @nullable @utf8InCpp String updatableViaApex(@utf8InCpp String name);

    /** The callback is told when the service, the caller's own, gains or loses its clients. */
    void registerClientCallback(@utf8InCpp String name, IBinder service, IClientCallback callback);

    /** Takes the caller's own service out, unless it has clients. */
    void tryUnregisterService(@utf8InCpp String name, IBinder service);

    /** Every registered service and the process that registered it. */
    ServiceDebugInfo[] getServiceDebugInfo();
}
