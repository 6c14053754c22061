// Stands in for the edit menu Shotcut's program registers for its text fields: the panel test
// runs Shotcut's controls without Shotcut.
import QtQuick 2.12

Item {
    property bool readOnly: false
    signal undoTriggered()
    signal redoTriggered()
    signal cutTriggered()
    signal copyTriggered()
    signal pasteTriggered()
    signal deleteTriggered()
    signal clearTriggered()
    signal selectAllTriggered()
    function popup() {}
}
