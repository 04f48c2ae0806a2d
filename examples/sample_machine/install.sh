#!/bin/sh
# install.sh [SSID]: lays the sample machine out in the machine folder that VXCOMN_ROOT names: its three endpoints in the registry, as
# endpoints.json has them, and its package in the system folder. SSID is the machine model, SUBSYS_5A170001 unless given. VX and VXREG
# name the two programs where they are not on the path. What stands there already is overwritten.
set -eu
: "${VXCOMN_ROOT:?names the machine folder}"
vx=${VX:-vx} vxreg=${VXREG:-vxreg} ssid=${1:-SUBSYS_5A170001}
here=$(cd "$(dirname "$0")" && pwd)
audio='HKLM\SOFTWARE\Microsoft\Windows\CurrentVersion\MMDevices\Audio'

# endpoint FLOW NUMBER NAME FORM-FACTOR: the key, and what all three have in common.
endpoint() {
    key="$audio\\$1\\{5D9A1C70-3B52-4E0F-9C41-0A6E27D1B00$2}"
    "$vxreg" add "$key" /v DeviceState /t REG_DWORD /d 1 /f
    property '{A45C254E-DF1C-4EFD-8020-67D146A850E0},2' REG_SZ "$3"
    property '{83DA6326-97A6-4088-9453-A1923F573B29},3' REG_SZ 'oem7.inf:5a17:kvusbaudio.sysfx:2.1.0.0'
    property '{1DA5D803-D492-4EDD-8C23-E0C0FFEE7F0E},0' REG_DWORD "$4"
    property '{B3F8FA53-0004-438E-9003-51A46E139BFC},2' REG_SZ \
        "{1}.HDAUDIO\\FUNC_01&VEN_5A17&DEV_0001&$ssid&REV_1000\\4&1A2B3C&0&0001"
}

property() {
    "$vxreg" add "$key\\Properties" /v "$1" /t "$2" /d "$3" /f
}

endpoint Render 1 Speakers 1
property '{1DA5D803-D492-4EDD-8C23-E0C0FFEE7F0E},8' REG_SZ '{DFF21CE1-F70F-11D0-B917-00A0C9223196}'
endpoint Render 2 Headphones 3
property '{6A6414E7-39E4-491F-8B8C-C9028AC7D659},0' REG_DWORD 1
endpoint Capture 3 Microphone 4
property '{6A6414E7-39E4-491F-8B8C-C9028AC7D659},0' REG_DWORD 3

system=$VXCOMN_ROOT/drive_c/Windows/System32
mkdir -p "$system"
cd "$system"
"$vx" preset pack "$here/package.json" --force
