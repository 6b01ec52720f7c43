#pragma once

/// Name and introspection text of the device-control policy service's interface; the text is the interface
/// element of com.norix.velk.pryg.xml. Both are macros, because moc takes only literals into the class
/// information of the adaptor and of the proxy.
#define PRYG_INTERFACE_NAME "com.norix.velk.pryg"

#define PRYG_INTROSPECTION                                                                                   \
    "  <interface name=\"com.norix.velk.pryg\">\n"                                                           \
    "    <signal name=\"RequestShowUsbCtrlAuthorSysNotify\">\n"                                              \
    "      <arg name=\"isAdd\" type=\"b\" direction=\"out\"/>\n"                                             \
    "      <arg name=\"devName\" type=\"s\" direction=\"out\"/>\n"                                           \
    "    </signal>\n"                                                                                        \
    "    <signal name=\"RequestShowNormalSysNotify\">\n"                                                     \
    "      <arg name=\"msg\" type=\"s\" direction=\"out\"/>\n"                                               \
    "    </signal>\n"                                                                                        \
    "    <signal name=\"notifyMsg\">\n"                                                                      \
    "      <arg name=\"msg\" type=\"s\" direction=\"out\"/>\n"                                               \
    "      <arg name=\"type\" type=\"i\" direction=\"out\"/>\n"                                              \
    "    </signal>\n"                                                                                        \
    "    <signal name=\"NotifyReportConnInfo\">\n"                                                           \
    "      <arg name=\"usbName\" type=\"s\" direction=\"out\"/>\n"                                           \
    "      <arg name=\"vendorID\" type=\"s\" direction=\"out\"/>\n"                                          \
    "      <arg name=\"productID\" type=\"s\" direction=\"out\"/>\n"                                         \
    "      <arg name=\"serial\" type=\"s\" direction=\"out\"/>\n"                                            \
    "      <arg name=\"status\" type=\"s\" direction=\"out\"/>\n"                                            \
    "    </signal>\n"                                                                                        \
    "    <method name=\"onPolicyMsg\">\n"                                                                    \
    "      <arg name=\"payload\" type=\"s\" direction=\"in\"/>\n"                                            \
    "    </method>\n"                                                                                        \
    "    <method name=\"PullAndExeSysPolicy\"/>\n"                                                           \
    "  </interface>\n"
