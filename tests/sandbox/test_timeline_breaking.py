"""Long values go on in the next line between their parts."""

from __future__ import annotations

import pytest

from sandbox.timeline.breaking import breakable


@pytest.mark.parametrize(
    ("text", "shown"),
    [
        ("short words stay", "short words stay"),
        ("EntryAdded /com/norix/Dock/entries/e1", "EntryAdded /com/norix/Dock/\nentries/e1"),
        ("com.norix.kpx.Notification", "com.norix.kpx.\nNotification"),
        ("withoutanypartsatall", "withoutanypartsatall"),
        ("关机/重启/注销/锁屏/解锁", "关机/重启/注销/\n锁屏/解锁"),
    ],
)
def test_a_word_that_is_too_wide_is_broken_between_its_parts(text: str, shown: str) -> None:
    assert breakable(text, 16) == shown
