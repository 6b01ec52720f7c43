#pragma once

/// Name and introspection text of the system daemon's interface; the text is the interface element of
/// com.norix.velk.velkg.xml. Both are macros, because moc takes only literals into the class information of
/// the adaptor and of the proxy.
#define VELKG_INTERFACE_NAME "com.norix.velk.velkg"

#define VELKG_INTROSPECTION                                                                                  \
    "  <interface name=\"com.norix.velk.velkg\">\n"                                                          \
    "    <signal name=\"pushOnlineMsg\"/>\n"                                                                 \
    "    <signal name=\"pushPolicyMsg\">\n"                                                                  \
    "      <arg name=\"appID\" type=\"s\" direction=\"out\"/>\n"                                             \
    "      <arg name=\"payload\" type=\"s\" direction=\"out\"/>\n"                                           \
    "    </signal>\n"                                                                                        \
    "    <signal name=\"requestSendAppOpenState\">\n"                                                        \
    "      <arg name=\"type\" type=\"i\" direction=\"out\"/>\n"                                              \
    "      <arg name=\"appName\" type=\"s\" direction=\"out\"/>\n"                                           \
    "    </signal>\n"                                                                                        \
    "    <signal name=\"requestSetStoragePerm\">\n"                                                          \
    "      <arg name=\"type\" type=\"i\" direction=\"out\"/>\n"                                              \
    "      <arg name=\"mode\" type=\"i\" direction=\"out\"/>\n"                                              \
    "    </signal>\n"                                                                                        \
    "    <method name=\"onDomainConfig\">\n"                                                                 \
    "      <arg type=\"i\" direction=\"out\"/>\n"                                                            \
    "      <arg name=\"type\" type=\"s\" direction=\"in\"/>\n"                                               \
    "    </method>\n"                                                                                        \
    "    <method name=\"onPolicyFinished\">\n"                                                               \
    "      <arg name=\"taskID\" type=\"i\" direction=\"in\"/>\n"                                             \
    "      <arg name=\"jobID\" type=\"i\" direction=\"in\"/>\n"                                              \
    "      <arg name=\"code\" type=\"i\" direction=\"in\"/>\n"                                               \
    "      <arg name=\"ack\" type=\"s\" direction=\"in\"/>\n"                                                \
    "    </method>\n"                                                                                        \
    "    <method name=\"onUploadFinished\">\n"                                                               \
    "      <arg name=\"url\" type=\"s\" direction=\"in\"/>\n"                                                \
    "      <arg name=\"data\" type=\"s\" direction=\"in\"/>\n"                                               \
    "    </method>\n"                                                                                        \
    "    <method name=\"SendUserStatus\">\n"                                                                 \
    "      <arg name=\"type\" type=\"i\" direction=\"in\"/>\n"                                               \
    "      <arg name=\"userName\" type=\"s\" direction=\"in\"/>\n"                                           \
    "    </method>\n"                                                                                        \
    "    <method name=\"UpdateUserInfo\">\n"                                                                 \
    "      <arg name=\"name\" type=\"s\" direction=\"in\"/>\n"                                               \
    "      <arg name=\"id\" type=\"i\" direction=\"in\"/>\n"                                                 \
    "    </method>\n"                                                                                        \
    "    <method name=\"GetDomainStatus\">\n"                                                                \
    "      <arg type=\"i\" direction=\"out\"/>\n"                                                            \
    "    </method>\n"                                                                                        \
    "    <method name=\"GetMachineID\">\n"                                                                   \
    "      <arg type=\"s\" direction=\"out\"/>\n"                                                            \
    "    </method>\n"                                                                                        \
    "    <method name=\"GetNetStatus\">\n"                                                                   \
    "      <arg type=\"i\" direction=\"out\"/>\n"                                                            \
    "    </method>\n"                                                                                        \
    "    <method name=\"GetPolicyPullTime\">\n"                                                              \
    "      <arg type=\"i\" direction=\"out\"/>\n"                                                            \
    "    </method>\n"                                                                                        \
    "    <method name=\"GetServerIP\">\n"                                                                    \
    "      <arg type=\"s\" direction=\"out\"/>\n"                                                            \
    "    </method>\n"                                                                                        \
    "    <method name=\"GetServerPort\">\n"                                                                  \
    "      <arg type=\"s\" direction=\"out\"/>\n"                                                            \
    "    </method>\n"                                                                                        \
    "    <method name=\"sendAppOpenState\">\n"                                                               \
    "      <arg name=\"type\" type=\"i\" direction=\"in\"/>\n"                                               \
    "      <arg name=\"appName\" type=\"s\" direction=\"in\"/>\n"                                            \
    "    </method>\n"                                                                                        \
    "  </interface>\n"
