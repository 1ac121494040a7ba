"""Trains the model that tells instruments by their sound."""
