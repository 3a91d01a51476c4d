/// What org.clipsa.Clipsa offers on the session bus, in the words of D-Bus introspection; this layer's own business.
#pragma once

namespace dbus {

inline constexpr const char* kServiceIntrospection = R"XML(
  <interface name="org.clipsa.Recorder1">
    <method name="Edit">
      <arg direction="in" type="h" name="movie"/><arg direction="in" type="a{sv}" name="options"/>
      <arg direction="out" type="o" name="session"/>
    </method>
  </interface>
  <interface name="org.freedesktop.Application">
    <method name="Activate"><arg direction="in" type="a{sv}" name="platform_data"/></method>
    <method name="Open">
      <arg direction="in" type="as" name="uris"/><arg direction="in" type="a{sv}" name="platform_data"/>
    </method>
    <method name="ActivateAction">
      <arg direction="in" type="s" name="action_name"/><arg direction="in" type="av" name="parameter"/>
      <arg direction="in" type="a{sv}" name="platform_data"/>
    </method>
  </interface>
)XML";

inline constexpr const char* kSessionIntrospection = R"XML(
  <interface name="org.clipsa.RecorderSession1">
    <method name="Close"/>
    <signal name="Saved"><arg type="s" name="path"/></signal>
    <signal name="SaveFailed"><arg type="s" name="path"/><arg type="s" name="message"/></signal>
    <signal name="Result"><arg type="a{sv}" name="result"/></signal>
    <signal name="Completed"><arg type="as" name="activityTypes"/></signal>
    <signal name="Failed"><arg type="s" name="message"/></signal>
    <signal name="Ended"/>
  </interface>
)XML";

} // namespace dbus
