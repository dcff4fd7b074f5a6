#!/usr/bin/python3
"""Compares the library's tables with published data. A reviewed list contains every difference with its reason. The check fails
for a difference that is not in the list, and for an entry of the list that is no longer a difference.

usage: world.py iso-codes|libphonenumber|mobile-broadband-provider-info DATA_DIR

DATA_DIR contains the list, and the rows of the tables, which the test of the lookups compares with the library's answers."""
import csv
import importlib.util
import json
import os
import sys
import xml.etree.ElementTree as xml

SOURCE, DATA = sys.argv[1:]
ISO = '/usr/share/iso-codes/json/'
PROVIDERS = '/usr/share/mobile-broadband-provider-info/serviceproviders.xml'


def rows(file):
    with open(os.path.join(DATA, file), encoding='utf-8') as lines:
        return list(csv.reader(lines, delimiter='\t', quoting=csv.QUOTE_NONE))


COUNTRY, CODES, SERVICE, LANGUAGE = (rows(table + '.tsv') for table in ('country', 'codes', 'service', 'language'))
ALPHA2 = {mcc: {alpha2 for other, alpha2, _ in COUNTRY if other == mcc} for mcc, _, _ in COUNTRY}


def iso(part, name):
    with open(f'{ISO}iso_{part}.json', encoding='utf-8') as file:
        return [entry for entry in json.load(file)[part] if name in entry]


def text(words):
    return ' '.join(sorted(words)) or '-'


def iso_codes():
    countries = {entry['alpha_2'].lower(): entry for entry in iso('3166-1', 'alpha_2')}
    languages = {entry['alpha_2']: {entry['alpha_3'], entry.get('bibliographic', entry['alpha_3'])}
                 for entry in iso('639-2', 'alpha_2')}
    ours = {alpha2: name for _, alpha2, name in COUNTRY}
    for alpha2 in countries.keys() | ours.keys():
        there = countries.get(alpha2, {})
        if alpha2 not in ours or not there:
            yield 'alpha2', alpha2, ours.get(alpha2, '-'), there.get('name', '-')
        elif ours[alpha2] not in (there['name'], there.get('common_name'), there.get('official_name')):
            yield 'name', alpha2, ours[alpha2], there.get('common_name', there['name'])
    for mcc, alpha3, _ in CODES:
        theirs = {countries[alpha2]['alpha_3'] for alpha2 in ALPHA2.get(mcc, ()) if alpha2 in countries}
        if alpha3 not in theirs:
            yield 'alpha3', mcc, alpha3, text(theirs)
    for mcc, code in SERVICE:
        language, alpha2 = code.split('_', 1)
        if language not in languages or alpha2.lower() not in ALPHA2.get(mcc, ()):
            yield 'service', mcc, code, text(ALPHA2.get(mcc, ()))
    listed = {short.lower(): {code for code, other in LANGUAGE if other == short} for _, short in LANGUAGE}
    for short in languages.keys() | listed.keys():
        if not listed.get(short, set()) or not listed[short] <= languages.get(short, set()):
            yield 'language', short, text(listed.get(short, ())), text(languages.get(short, ()))


def libphonenumber():
    import phonenumbers
    alpha2 = {entry['alpha_3']: entry['alpha_2'] for entry in iso('3166-1', 'alpha_2')}
    for mcc, alpha3, code in CODES:
        theirs = str(phonenumbers.country_code_for_region(alpha2.get(alpha3, '')) or '-')
        if code != theirs:
            yield 'calling', mcc, code, theirs


def providers():
    theirs = {}
    for country in xml.parse(PROVIDERS).iter('country'):
        for network in country.iter('network-id'):
            theirs.setdefault(network.get('mcc'), set()).add(country.get('code'))
    known = set().union(*theirs.values())
    for mcc in theirs.keys() | ALPHA2.keys():
        ours = {alpha2 for alpha2 in ALPHA2.get(mcc, ()) if alpha2 in known}
        if ours != theirs.get(mcc, set()):
            yield 'mcc', mcc, text(ours), text(theirs.get(mcc, ()))


COMPARE, TABLES, NEEDED = {
    'iso-codes': (iso_codes, ('alpha2', 'name', 'alpha3', 'service', 'language'), ('iso-codes',)),
    'libphonenumber': (libphonenumber, ('calling',), ('iso-codes', 'python3-phonenumbers')),
    'mobile-broadband-provider-info': (providers, ('mcc',), ('mobile-broadband-provider-info',)),
}[SOURCE]
INSTALLED = {
    'iso-codes': os.path.exists(ISO),
    'python3-phonenumbers': importlib.util.find_spec('phonenumbers') is not None,
    'mobile-broadband-provider-info': os.path.exists(PROVIDERS),
}
for package in NEEDED:
    if not INSTALLED[package]:
        print(f'skipped: {package} is not installed')
        sys.exit(77)

found = set(COMPARE())
reviewed = {tuple(row[:4]): row[4:] for row in rows('country-differences.tsv')[1:] if row[0] in TABLES}
bad = ([('new, and not in the list', entry) for entry in found - reviewed.keys()]
       + [('in the list, and no more', entry) for entry in reviewed.keys() - found]
       + [('without a reason', entry) for entry, reason in reviewed.items() if not ''.join(reason).strip()])
for problem, entry in sorted(bad):
    print(f'{problem}:', '\t'.join(entry))
print(f'{SOURCE}: {len(found)} differences, {len(reviewed)} of them in the list')
sys.exit(1 if bad else 0)
