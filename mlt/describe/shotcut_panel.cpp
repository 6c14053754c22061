// Shotcut's filter: its metadata (with every animated setting listed for the Keyframes panel)
// and its panel, a control for every setting, written as QML.
#include <sstream>

#include "descriptions.h"

namespace veltrane_describe {
namespace {

using Kind = Setting::Kind;

const char* kindName(Kind kind) {
  switch (kind) {
    case Kind::Number:
    case Kind::WholeNumber:
    case Kind::Angle:
      return "number";
    case Kind::Point:
      return "point";
    case Kind::Color:
      return "color";
    case Kind::Bool:
      return "bool";
    case Kind::List:
      return "list";
  }
  return "number";
}

// Shotcut keeps no keyframes for a colour.
bool keyframed(const Setting& setting) { return setting.animated && setting.kind != Kind::Color; }

std::string settingObject(const Setting& setting) {
  std::ostringstream out;
  out << "{name: " << scriptQuoted(setting.property) << ", label: " << scriptQuoted(setting.label())
      << ", kind: '" << kindName(setting.kind) << "', minimum: " << number(setting.minimum)
      << ", maximum: " << number(setting.maximum) << ", decimals: " << setting.decimals
      << ", suffix: " << scriptQuoted(setting.unit.empty() ? "" : " " + setting.unit)
      << ", fallback: " << scriptQuoted(setting.editorDefault)
      << ", keyframes: " << (keyframed(setting) ? "true" : "false") << ", choices: [";
  std::string separator;
  for (const auto& [value, shown] : setting.choices) {
    out << separator << "{value: " << scriptQuoted(value) << ", text: " << scriptQuoted(shown)
        << "}";
    separator = ", ";
  }
  out << "]}";
  return out.str();
}

// The panel: the settings as data, one row per setting made by a component for its kind. Every
// control writes through the panel's own function, named so that no control's member hides it.
constexpr char kPanelBody[] = R"QML(
    id: panel

    property bool blockUpdate: true
    // Told when the filter or the play head moved: every control reads its value again.
    signal refresh()

    // The play head within the filter, whose keyframes count from its own start.
    function playhead() {
        var offset = (filter['in'] || 0) - (producer['in'] || 0);
        return Math.max(producer.position - offset, 0);
    }
    function hasKeyframes(name) {
        return filter.keyframeCount(name) > 0;
    }
    // Writes one setting: at the play head when it has keyframes, else for the whole filter.
    function writeSetting(setting, value, atPlayhead) {
        if (blockUpdate)
            return;
        if (setting.kind === 'point') {
            if (atPlayhead)
                filter.set(setting.name, value, 1.0, playhead());
            else
                filter.set(setting.name, value);
        } else if (atPlayhead) {
            filter.set(setting.name, value, playhead());
        } else {
            filter.set(setting.name, value);
        }
    }
    // Keyframes switched on keep the value at the play head; switched off, one value stays.
    function switchKeyframes(setting, value, on) {
        blockUpdate = true;
        filter.resetProperty(setting.name);
        blockUpdate = false;
        writeSetting(setting, value, on);
    }

    width: 480
    implicitHeight: rows.implicitHeight + 16
    Component.onCompleted: {
        if (filter.isNew) {
            for (var i = 0; i < settings.length; ++i)
                filter.set(settings[i].name, settings[i].fallback);
        }
        blockUpdate = false;
        refresh();
    }

    Connections {
        target: filter
        function onChanged() {
            panel.refresh();
        }
    }
    Connections {
        target: producer
        function onPositionChanged() {
            panel.refresh();
        }
    }

    Component {
        id: numberControl
        RowLayout {
            property var setting
            Shotcut.SliderSpinner {
                id: slider
                objectName: setting ? 'control:' + setting.name : ''
                minimumValue: setting ? setting.minimum : 0
                maximumValue: setting ? setting.maximum : 1
                decimals: setting ? setting.decimals : 0
                suffix: setting ? setting.suffix : ''
                Layout.fillWidth: true
                onValueChanged: panel.writeSetting(setting, value, keys.checked)
            }
            Shotcut.UndoButton {
                onClicked: slider.value = Number(setting.fallback)
            }
            Shotcut.KeyframesButton {
                id: keys
                objectName: setting ? 'keyframes:' + setting.name : ''
                visible: setting ? setting.keyframes : false
                onToggled: panel.switchKeyframes(setting, slider.value, checked)
            }
            Connections {
                target: panel
                function onRefresh() {
                    panel.blockUpdate = true;
                    slider.value = filter.getDouble(setting.name, panel.playhead());
                    keys.checked = panel.hasKeyframes(setting.name);
                    panel.blockUpdate = false;
                }
            }
        }
    }

    Component {
        id: pointControl
        RowLayout {
            property var setting
            function point() {
                return Qt.rect(x.value, y.value, 0, 0);
            }
            Label { text: 'x' }
            Shotcut.SliderSpinner {
                id: x
                objectName: setting ? 'control:' + setting.name : ''
                minimumValue: -profile.width
                maximumValue: profile.width
                decimals: 1
                suffix: ' px'
                Layout.fillWidth: true
                onValueChanged: panel.writeSetting(setting, point(), keys.checked)
            }
            Label { text: 'y' }
            Shotcut.SliderSpinner {
                id: y
                objectName: setting ? 'control-y:' + setting.name : ''
                minimumValue: -profile.height
                maximumValue: profile.height
                decimals: 1
                suffix: ' px'
                Layout.fillWidth: true
                onValueChanged: panel.writeSetting(setting, point(), keys.checked)
            }
            Shotcut.KeyframesButton {
                id: keys
                objectName: setting ? 'keyframes:' + setting.name : ''
                onToggled: panel.switchKeyframes(setting, point(), checked)
            }
            Connections {
                target: panel
                function onRefresh() {
                    var at = filter.getRect(setting.name, panel.playhead());
                    panel.blockUpdate = true;
                    x.value = at.x;
                    y.value = at.y;
                    keys.checked = panel.hasKeyframes(setting.name);
                    panel.blockUpdate = false;
                }
            }
        }
    }

    Component {
        id: colorControl
        Shotcut.ColorPicker {
            property var setting
            objectName: setting ? 'control:' + setting.name : ''
            onValueChanged: panel.writeSetting(setting, '' + value, false)
            Connections {
                target: panel
                function onRefresh() {
                    panel.blockUpdate = true;
                    value = filter.get(setting.name);
                    panel.blockUpdate = false;
                }
            }
        }
    }

    Component {
        id: boolControl
        CheckBox {
            property var setting
            objectName: setting ? 'control:' + setting.name : ''
            onClicked: panel.writeSetting(setting, checked ? 1 : 0, false)
            Connections {
                target: panel
                function onRefresh() {
                    checked = filter.getDouble(setting.name) !== 0;
                }
            }
        }
    }

    Component {
        id: listControl
        Shotcut.ComboBox {
            property var setting
            objectName: setting ? 'control:' + setting.name : ''
            textRole: 'text'
            model: setting ? setting.choices : []
            implicitWidth: 260
            onActivated: panel.writeSetting(setting, setting.choices[index].value, false)
            Connections {
                target: panel
                function onRefresh() {
                    var value = ('' + filter.get(setting.name)).toLowerCase();
                    for (var i = 0; i < setting.choices.length; ++i) {
                        if (setting.choices[i].value.toLowerCase() === value)
                            currentIndex = i;
                    }
                }
            }
        }
    }

    GridLayout {
        id: rows
        columns: 2
        anchors.left: parent.left
        anchors.right: parent.right
        anchors.top: parent.top
        anchors.margins: 8

        Repeater {
            model: panel.settings
            delegate: Label {
                Layout.row: index
                Layout.column: 0
                Layout.alignment: Qt.AlignRight
                text: modelData.label
            }
        }
        Repeater {
            model: panel.settings
            delegate: Loader {
                Layout.row: index
                Layout.column: 1
                Layout.fillWidth: true
                sourceComponent: ({number: numberControl, point: pointControl, color: colorControl,
                                   bool: boolControl, list: listControl})[modelData.kind]
                onLoaded: item.setting = modelData
            }
        }
    }
}
)QML";

}  // namespace

std::string scriptQuoted(const std::string& text) {
  std::string out = "'";
  for (char c : text) {
    if (c == '\'' || c == '\\') out += '\\';
    out += c;
  }
  return out + "'";
}

std::string shotcutMetadata(const std::vector<Setting>& settings) {
  std::ostringstream out;
  out << "import QtQuick 2.0\nimport org.shotcut.qml 1.0\n\nMetadata {\n"
      << "    type: Metadata.Filter\n    objectName: 'veltrane'\n    name: qsTr('" << kTitle
      << "')\n    keywords: qsTr('split screen cut region diagonal grid tracks')\n"
      << "    mlt_service: 'veltrane'\n    qml: 'ui.qml'\n    keyframes {\n"
      << "        allowAnimateIn: true\n        allowAnimateOut: true\n        parameters: [\n";
  std::string separator;
  for (const Setting& setting : settings) {
    if (!keyframed(setting)) continue;
    out << separator << "            Parameter {\n                name: qsTr("
        << scriptQuoted(setting.label()) << ")\n                property: '" << setting.property
        << "'\n";
    if (setting.kind == Kind::Point)
      out << "                isRectangle: true\n";
    else
      out << "                isCurve: true\n                minimum: " << number(setting.minimum)
          << "\n                maximum: " << number(setting.maximum) << "\n";
    out << "            }";
    separator = ",\n";
  }
  out << "\n        ]\n    }\n}\n";
  return out.str();
}

std::string shotcutPanel(const std::vector<Setting>& settings) {
  std::ostringstream out;
  out << "// Shotcut's panel for the split-screen filter, written from the settings the effect "
         "declares.\n"
      << "import QtQuick 2.12\nimport QtQuick.Controls 2.12\nimport QtQuick.Layouts 1.12\n"
      << "import Shotcut.Controls 1.0 as Shotcut\n\nItem {\n"
      << "    // Every setting: its property, label, kind, range and the value set when the "
         "filter is new.\n    readonly property var settings: [\n";
  std::string separator;
  for (const Setting& setting : settings) {
    out << separator << "        " << settingObject(setting);
    separator = ",\n";
  }
  out << "\n    ]\n" << kPanelBody;
  return out.str();
}

}  // namespace veltrane_describe
