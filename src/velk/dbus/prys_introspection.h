#pragma once

/// Name and introspection text of the session policy service's interface; the text is the interface element
/// of com.norix.velk.prys.xml. Both are macros, because moc takes only literals into the class information of
/// the adaptor and of the proxy.
#define PRYS_INTERFACE_NAME "com.norix.velk.prys"

#define PRYS_INTROSPECTION                                                                                   \
    "  <interface name=\"com.norix.velk.prys\">\n"                                                           \
    "    <method name=\"onPolicyMsg\">\n"                                                                    \
    "      <arg name=\"payload\" type=\"s\" direction=\"in\"/>\n"                                            \
    "    </method>\n"                                                                                        \
    "  </interface>\n"
