[profile]
description=no modem answers

[telephony]
available=false
default-network=-1
preferred-voice=-1
default-data=-1


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
font-size=1
mobile-data=true

[runtime]
flight-mode=false
packet-data=true
data-roaming=false
wifi-status=1

[network]
cellular=0
wifi=1
bluetooth=0
wifi-device=1
wifi-connection=0

[storage]
block-size=4096
blocks-available=1048576

[packages]
org.example.agent=1.2.0
org.example.mail=3.0.17
