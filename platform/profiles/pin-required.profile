[profile]
description=one slot, its SIM needs its PIN

[telephony]
available=true
default-network=0
preferred-voice=0
default-data=0

[sim0]
cp-name=modem0
card-status=pin-required
imei=356938035643809
service-state=emergency-only
roaming=false
service-type=emergency-only
sms-status=not-ready

[device]
tizen-id=h7q3kz0r5fT9wPq
platform-name=Tizen
platform-version=2.3.1
model-name=KM-200
sales-code=KIV
serial=KIV0123456789

[settings]
device-name=Workbench
language=en_US
font-size=normal
mobile-data=true

[runtime]
flight-mode=false
packet-data=true
data-roaming=false
wifi-status=disconnected

[network]
cellular=out-of-service
wifi=disconnected
bluetooth=off
wifi-device=on
wifi-connection=disconnected

[storage]
block-size=4096
blocks-available=1048576

[packages]
org.example.agent=1.2.0
org.example.mail=3.0.17
