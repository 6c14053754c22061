// Shotcut's panel for the split-screen filter: the layout's main settings. Every other
// parameter is an MLT property of the same id and keeps its value from the project.
import QtQuick 2.12
import QtQuick.Controls 2.12
import QtQuick.Layouts 1.12
import Shotcut.Controls 1.0 as Shotcut

Item {
    property bool blockUpdate: true

    function setControls() {
        blockUpdate = true;
        cutTypeCombo.currentIndex = filter.get('cutType') === 'Radial' || filter.get('cutType') === '1' ? 1 : 0;
        cutsSlider.value = filter.getDouble('numberOfCuts');
        directionSlider.value = filter.getDouble('cutDirection_0');
        shiftSlider.value = filter.getDouble('inputFrameShift1');
        borderSlider.value = filter.getDouble('borderWidth');
        blockUpdate = false;
    }

    function update(name, value) {
        if (!blockUpdate)
            filter.set(name, value);
    }

    width: 350
    height: 180
    Component.onCompleted: {
        if (filter.isNew) {
            filter.set('numberOfCuts', 1);
            filter.set('cutDirection_0', 225);
            filter.set('borderWidth', 2);
        }
        setControls();
    }

    GridLayout {
        columns: 3
        anchors.fill: parent
        anchors.margins: 8

        Label {
            text: qsTr('Cut type')
            Layout.alignment: Qt.AlignRight
        }
        ComboBox {
            id: cutTypeCombo
            model: [qsTr('Local'), qsTr('Radial')]
            onActivated: update('cutType', currentIndex === 1 ? 'Radial' : 'Local')
        }
        Shotcut.UndoButton {
            onClicked: filter.set('cutType', 'Local')
        }

        Label {
            text: qsTr('Number of cuts')
            Layout.alignment: Qt.AlignRight
        }
        Shotcut.SliderSpinner {
            id: cutsSlider
            minimumValue: 1
            maximumValue: 8
            onValueChanged: update('numberOfCuts', Math.round(value))
        }
        Shotcut.UndoButton {
            onClicked: cutsSlider.value = 1
        }

        Label {
            text: qsTr('Cut 1 direction')
            Layout.alignment: Qt.AlignRight
        }
        Shotcut.SliderSpinner {
            id: directionSlider
            minimumValue: -360
            maximumValue: 360
            decimals: 1
            suffix: ' °'
            onValueChanged: update('cutDirection_0', value)
        }
        Shotcut.UndoButton {
            onClicked: directionSlider.value = 225
        }

        Label {
            text: qsTr('Input 1 time shift')
            Layout.alignment: Qt.AlignRight
        }
        Shotcut.SliderSpinner {
            id: shiftSlider
            minimumValue: -250
            maximumValue: 250
            suffix: qsTr(' frames')
            onValueChanged: update('inputFrameShift1', Math.round(value))
        }
        Shotcut.UndoButton {
            onClicked: shiftSlider.value = 0
        }

        Label {
            text: qsTr('Border width')
            Layout.alignment: Qt.AlignRight
        }
        Shotcut.SliderSpinner {
            id: borderSlider
            minimumValue: 0
            maximumValue: 200
            decimals: 1
            suffix: ' px'
            onValueChanged: update('borderWidth', value)
        }
        Shotcut.UndoButton {
            onClicked: borderSlider.value = 2
        }

        Item {
            Layout.fillHeight: true
        }
    }

    Connections {
        target: filter
        function onChanged() {
            setControls();
        }
    }
}
