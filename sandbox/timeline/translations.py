"""English translations of the agent's texts, and the meanings of codes."""

from __future__ import annotations

from sandbox.policies import POLICIES

NOTICES = {
    **{policy.notice: policy.english_notice for policy in POLICIES.values()},
    # The platform's texts in the tour.
    "您的密码将在3天后过期，请及时修改": "your password will expire in 3 days; change it in time",
    "今晚22:00停机，请保存文件": "shutdown tonight at 22:00; save your files",
    '请读 "须知", 周五前回复': 'read the "rules" and answer by Friday',
    "图书馆本周六闭馆": "the library is closed this Saturday",
    "三楼打印机已修好": "the printer on the third floor works again",
}
ACTIONS = {"重启": "reboot", "查看": "view"}
STATUSES = {1: "the session is active", 2: "the session is locked", 3: "the screen saver is running"}
REQUESTS = {
    "list": "are there unread messages? (one at a time)",
    "read": "this message is being shown to the user",
    "tips": "is the user's password about to expire?",
    "software_change": "which software was installed or updated",
    "inventory": "all software of the terminal",
}
PROPERTIES = {
    ("com.norix.ScreenSaver", "isRunning"): "is the screen saver running?",
    ("com.norix.SessionManager", "Locked"): "is the session locked?",
    ("org.freedesktop.login1.User", "Name"): "what is the user's name?",
    ("org.freedesktop.login1.User", "UID"): "what is the user's id?",
    ("com.norix.kpx.daemon.Dock", "Entries"): "which applications are on the dock?",
    ("com.norix.kpx.daemon.Dock.Entry", "Id"): "which application is this?",
    ("com.norix.kpx.daemon.Dock.Entry", "Name"): "what is the application called?",
    ("com.norix.kpx.daemon.Dock.Entry", "IsDocked"): "is it kept on the dock?",
    ("com.norix.kpx.daemon.Dock.Entry", "WindowInfos"): "which windows does it have?",
}
CHANGES = {
    ("isRunning", True): "the screen saver starts",
    ("isRunning", False): "the screen saver ends",
    ("Locked", True): "the user locks the screen",
    ("Locked", False): "the user unlocks the screen",
    ("IsDocked", True): "kept on the dock from now on",
    ("IsDocked", False): "no longer kept on the dock",
}
APPLICATION_STATES = {1: "an application was opened", 2: "an application was closed"}
ITEM_ACTIONS = {
    "created": "an application was installed",
    "update": "an application was updated",
    "deleted": "an application was removed",
}
APPLICATIONS = {
    "编辑器": "text editor",
    "说明 - 编辑器": "notes, text editor",
    "浏览器": "browser",
}
