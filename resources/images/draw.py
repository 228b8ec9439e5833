#!/usr/bin/env python3
"""Draws the generated images and the wait animation with ImageMagick.

Run from this folder: python3 draw.py . && mv wait.gif ../animations/
The other images here are drawn by hand."""
import math, os, subprocess, sys, tempfile

out = sys.argv[1] if len(sys.argv) > 1 else '.'
work = tempfile.mkdtemp()

def run(*args):
    subprocess.run(['convert', *map(str, args)], check=True)

def folder(s):
    u = s / 16
    return ['-fill', '#e8b84a', '-stroke', '#9a7420', '-strokewidth', max(1, s // 16),
            '-draw', f'rectangle {u:.1f},{3*u:.1f} {7*u:.1f},{5*u:.1f}',
            '-draw', f'roundrectangle {u:.1f},{4*u:.1f} {15*u:.1f},{14*u:.1f} {u:.1f},{u:.1f}']

def badge(s, colour, minus=True, plus=False):
    u = s / 16
    cmd = ['-fill', colour, '-stroke', 'white', '-strokewidth', max(1, s // 16),
           '-draw', f'circle {11*u:.1f},{11*u:.1f} {11*u:.1f},{6.5*u:.1f}',
           '-stroke', 'white', '-strokewidth', max(1, s // 8)]
    if minus:
        cmd += ['-draw', f'line {8.5*u:.1f},{11*u:.1f} {13.5*u:.1f},{11*u:.1f}']
    if plus:
        cmd += ['-draw', f'line {11*u:.1f},{8.5*u:.1f} {11*u:.1f},{13.5*u:.1f}']
    return cmd

for dpi, s in ((96, 16), (144, 24), (192, 32)):
    u = s / 16
    blank = ['-size', f'{s}x{s}', 'xc:none']
    run(*blank, *folder(s), *badge(s, '#d83b2b'), f'{out}/excludedfolder_{dpi}.png')
    tb = []
    run(*blank, *folder(s), *badge(s, '#2f9e44', plus=True), f'{work}/tb0.png')
    run(*blank, *folder(s), *badge(s, '#d83b2b'), f'{work}/tb1.png')
    run(*blank, '-stroke', '#c92a2a', '-strokewidth', max(2, 3 * s // 16),
        '-draw', f'line {3*u:.1f},{3*u:.1f} {13*u:.1f},{13*u:.1f}',
        '-draw', f'line {13*u:.1f},{3*u:.1f} {3*u:.1f},{13*u:.1f}', f'{work}/tb2.png')
    arrow = f'polygon {8*u:.1f},{2*u:.1f} {14*u:.1f},{8*u:.1f} {10*u:.1f},{8*u:.1f} {10*u:.1f},{14*u:.1f} {6*u:.1f},{14*u:.1f} {6*u:.1f},{8*u:.1f} {2*u:.1f},{8*u:.1f}'
    run(*blank, '-fill', '#1c64c8', '-stroke', '#0b3d91', '-strokewidth', max(1, s // 16), '-draw', arrow, f'{work}/tb3.png')
    run(f'{work}/tb3.png', '-flip', f'{work}/tb4.png')
    run(*[f'{work}/tb{i}.png' for i in range(5)], '+append', f'{out}/searchareastoolbar_{dpi}.png')
    e = 2 * s
    v = e / 32
    run('-size', f'{e}x{e}', 'xc:none', '-fill', '#d83b2b', '-stroke', '#a51d12', '-strokewidth', max(1, e // 32),
        '-draw', f'circle {16*v:.1f},{16*v:.1f} {16*v:.1f},{2*v:.1f}',
        '-stroke', 'white', '-strokewidth', max(2, e // 8),
        '-draw', f'line {11*v:.1f},{11*v:.1f} {21*v:.1f},{21*v:.1f}',
        '-draw', f'line {21*v:.1f},{11*v:.1f} {11*v:.1f},{21*v:.1f}', f'{out}/error_{dpi}.png')

# The wait window's animation: twelve dots going round, the leading one darkest.
frames = []
size, n = 48, 12
for f in range(n):
    cmd = ['-size', f'{size}x{size}', 'xc:none']
    for i in range(n):
        age = (f - i) % n
        shade = int(60 + 180 * age / (n - 1))
        angle = 2 * math.pi * i / n
        x = size / 2 + 17 * math.sin(angle)
        y = size / 2 - 17 * math.cos(angle)
        r = 4.2 - 1.8 * age / (n - 1)
        cmd += ['-fill', f'rgb({shade // 3},{shade // 2 + 40},{min(255, shade + 40)})', '-stroke', 'none',
                '-draw', f'circle {x:.1f},{y:.1f} {x + r:.1f},{y:.1f}']
    name = f'{work}/frame{f:02d}.png'
    run(*cmd, name)
    frames.append(name)
run('-dispose', 'previous', '-delay', '8', '-loop', '0', *frames, f'{out}/wait.gif')
