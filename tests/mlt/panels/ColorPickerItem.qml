// Stands in for the screen colour picker Shotcut's program registers for its colour controls.
import QtQuick 2.12

Item {
    signal colorPicked(color color)
    signal cancelled()
    function pickColor() {}
}
